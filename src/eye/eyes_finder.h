#pragma once

#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"

/// Handle on an engine that finds the eyes of a face.
///
///     bool foundFirst, foundSecond;
///     FacialFeatureLocation first, second;
///     finder.find(face, image, foundFirst, first, foundSecond, second);
///
/// `first` is the eye at the smaller x of an upright face, the left one as the observer of the image sees it;
/// `second` is the right one. A location is written only if its eye was found.
class EyesFinder {
public:
    class Body {
    public:
        virtual ~Body() = default;
        /// Looks for the eyes of a face that was found.
        virtual void find(const FaceFinder::Location& face, const FNImageReference& image, bool& foundFirst,
                          FacialFeatureLocation& first, bool& foundSecond,
                          FacialFeatureLocation& second) const = 0;
        /// Looks again around eyes that are known: their positions give the direction, their sizes the scale.
        /// @param eye1,eye2 distinct, in the order of the results
        virtual void find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
                          const FNImageReference& image, bool& foundFirst, FacialFeatureLocation& first,
                          bool& foundSecond, FacialFeatureLocation& second) const = 0;
        virtual std::string processingId() const = 0;
    };

    explicit EyesFinder(const FNCountedPtr<Body>& body) : body_(body) {}

    void find(const FaceFinder::Location& face, const FNImageReference& image, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const {
        body_->find(face, image, foundFirst, first, foundSecond, second);
    }
    void find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
              const FNImageReference& image, bool& foundFirst, FacialFeatureLocation& first,
              bool& foundSecond, FacialFeatureLocation& second) const {
        body_->find(eye1, eye2, image, foundFirst, first, foundSecond, second);
    }
    std::string processingId() const { return body_->processingId(); }

private:
    FNCountedPtr<Body> body_;
};

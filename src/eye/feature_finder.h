#pragma once

#include "eye/facial_feature_location.h"
#include "fn/cptr.h"

#include <string>

class FNImageReference;

/// Handle on an engine that finds one feature of a face whose eyes are known.
///
///     FacialFeatureLocation mouth;
///     if (finder.find(leftEye, rightEye, image, mouth)) ...
///
/// @tparam Feature makes the handles of different features different types
template <class Feature> class FeatureFinder {
public:
    class Body {
    public:
        virtual ~Body() = default;
        /// @param eye1,eye2 in the order in which EyesFinder gives them; only their positions count
        /// @param result written only if the feature was found
        /// @return whether it was found
        virtual bool find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
                          const FNImageReference& image, FacialFeatureLocation& result) const = 0;
        virtual std::string processingId() const = 0;
    };

    explicit FeatureFinder(const FNCountedPtr<Body>& body) : body_(body) {}

    bool find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
              const FNImageReference& image, FacialFeatureLocation& result) const {
        return body_->find(eye1, eye2, image, result);
    }
    std::string processingId() const { return body_->processingId(); }

private:
    FNCountedPtr<Body> body_;
};

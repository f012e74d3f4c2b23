#pragma once

#include "fn/cptr.h"
#include "fn/geometry.h"
#include "fn/serialize.h"

#include <list>
#include <string>

class FNImageReference;

/// Handle on an engine that finds faces.
///
///     std::list<FaceFinder::Location> faces;
///     finder.find(image, faces, 0.05, 0.4, FaceFinder::everywhere);
class FaceFinder {
public:
    /// A face. Lists of them are in descending order of confidence.
    struct Location {
        FNPos pos;               ///< midpoint between the eyes, image pixels
        float width = 0;         ///< distance of the eyes, image pixels
        float confidence = 0;    ///< larger is better
        float rotationAngle = 0; ///< in the image plane, radians, positive from x toward y
    };

    /// A search box that leaves nothing out.
    static constexpr FNBox everywhere{-(1 << 30), -(1 << 30), (1 << 30) - 2, (1 << 30) - 2};

    class Body {
    public:
        virtual ~Body() = default;
        /// @param locations replaced by the faces that were found
        /// @param minRelEyeDist,maxRelEyeDist eye distances to look for, in widths of the image
        /// @param searchBox where to look, image pixels
        /// @return whether there is a face
        virtual bool find(const FNImageReference& image, std::list<Location>& locations, double minRelEyeDist,
                          double maxRelEyeDist, const FNBox& searchBox) const = 0;
        /// For the frames of one video, in their order: may look at a part of each frame, and keeps what it
        /// needs to know of the frames before. One stream at a time.
        virtual bool findInStream(const FNImageReference& image, std::list<Location>& locations,
                                  double minRelEyeDist, double maxRelEyeDist, int frameNumber,
                                  const FNBox& searchBox) {
            (void)frameNumber;
            return find(image, locations, minRelEyeDist, maxRelEyeDist, searchBox);
        }
        virtual std::string processingId() const = 0;
    };

    explicit FaceFinder(const FNCountedPtr<Body>& body) : body_(body) {}

    bool find(const FNImageReference& image, std::list<Location>& locations, double minRelEyeDist,
              double maxRelEyeDist, const FNBox& searchBox) const {
        return body_->find(image, locations, minRelEyeDist, maxRelEyeDist, searchBox);
    }
    bool findInStream(const FNImageReference& image, std::list<Location>& locations, double minRelEyeDist,
                      double maxRelEyeDist, int frameNumber, const FNBox& searchBox) const {
        return body_->findInStream(image, locations, minRelEyeDist, maxRelEyeDist, frameNumber, searchBox);
    }
    std::string processingId() const { return body_->processingId(); }

private:
    FNCountedPtr<Body> body_;
};

/// A list of the position, itself a list of x and y, the width, the confidence and the rotation angle.
template <> struct Fn::Serializer<FaceFinder::Location> {
    static Package pack(const FaceFinder::Location& location);
    /// @throws FNEBadArg
    static FaceFinder::Location unpack(const Package& package);
};

#pragma once

#include "fn/deployment/component.h"
#include "fn/geometry.h"

namespace Kx {

/// Estimates the outline of a head from its eyes, by proportions that hold for most people.
class FaceGeometry {
public:
    /// Places in an image, pixels. (0, 0) stands for a place that is not set.
    struct Points {
        FNPos leftEye, rightEye, chin, crown, leftEar, rightEar;
    };

    /// The configuration type.
    static std::string typeId() { return "Cmp::FaceGeometry"; }
    static Fn::Deployment::Type define();

    explicit FaceGeometry(const Fn::Deployment::Component& component);

    /// The same with the outline, as far as it is not set, by the eyes. @throws FNEBadArg if that needs eyes
    /// with different x
    Points completed(const Points& points) const;

private:
    Points fromEyes(FNPos left, FNPos right) const;

    float widthOfHead_, topOfHead_, bottomOfHead_; ///< in eye distances
};

} // namespace Kx

#pragma once

#include "cmp/face/face.h"
#include "cmp/record_builder.h"
#include "cmp/sample.h"
#include "fn/optional.h"

namespace Kx {

/// One picture of a person, with what is known of it: what operations take. Copies share what is in it.
struct SensorSample {
    explicit SensorSample(const FNImageReference& picture) : image(picture) {}
    SensorSample(const FNImageReference& picture, const FacialFeatureLocation& left,
                 const FacialFeatureLocation& right)
        : image(picture), leftEye(left), rightEye(right) {}

    bool hasEyes() const { return leftEye.isSet() && rightEye.isSet(); }

    /// What goes into a record builder: of two kinds of 3D data the point set, and the eyes in space if both
    /// are there. @throws FNEBadFunCall without both eyes; so does face()
    Cmp::Sample cmpSample() const;
    /// The image with both eyes.
    Cmp::Face face() const;

    FNImageReference image;
    Fn::Optional<FacialFeatureLocation> leftEye;
    Fn::Optional<FacialFeatureLocation> rightEye;
    FNCountedPtr<Fn::VertexImage> vertexImage;           ///< may be null
    FNCountedPtr<ShapeImage::TexturedPointSet> pointSet; ///< may be null
    Fn::Optional<FN3Vector<double>> firstEye3D; ///< in the coordinates of the 3D data; so is the next one
    Fn::Optional<FN3Vector<double>> secondEye3D;
};

namespace Implementation {

/// Hands a sample to a record builder, unless its picture does not show the face that its eyes are said to be
/// of: an eye and the middle between both have to lie in it. Far outside all faces look alike, so that
/// records of them would match one another.
/// @return the builder's handle, or -1 if the sample is not taken
int pushSample(const Cmp::RecordBuilder& builder, const Cmp::Sample& sample);

} // namespace Implementation

} // namespace Kx

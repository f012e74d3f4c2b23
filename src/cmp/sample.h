#pragma once

#include "cmp/face_stream.h"
#include "fn/callback/unique_id.h"
#include "fn/geometry.h"
#include "fn/image_reference.h"
#include "fn/vector3.h"
#include "fn/vertex_image.h"
#include "shapeimg/textured_point_set.h"

namespace Cmp {

/// What goes into a record builder: an image with the eyes' positions, a stream of images, 3D data, or
/// several of them. Copies share what is in it.
struct Sample {
    /// What a comparison algorithm cannot do without.
    struct Requirements {
        bool intensityImage = false;
        bool intensityEyePositions = false;
        bool faceStream = false;
        bool shapeData = false;
        bool shapeEyePositions = false;
        bool operator==(const Requirements&) const = default;
    };

    Sample() = default;
    explicit Sample(const FaceStream& stream) : faceStream(new FaceStream(stream)) {}
    Sample(const FNImageReference& image, FNPos left, FNPos right)
        : intensityImage(new FNImageReference(image)), leftEye(new FNPos(left)), rightEye(new FNPos(right)) {}
    /// @param left,right positions in the texture
    Sample(const ShapeImage::TexturedPointSet& shape, FNPos left, FNPos right)
        : leftEye(new FNPos(left)), rightEye(new FNPos(right)),
          pointSet(new ShapeImage::TexturedPointSet(shape)) {}
    Sample(const Fn::VertexImage& shape, FNPos left, FNPos right)
        : leftEye(new FNPos(left)), rightEye(new FNPos(right)), vertexImage(new Fn::VertexImage(shape)) {}

    /// @throws FNEBadArg that names the first item which is required and missing
    void check(const Requirements& requirements) const;

    Fn::UniqueId id;

    // Null where the sample does not have it.
    FNCountedPtr<FNImageReference> intensityImage;
    FNCountedPtr<FNPos> leftEye; ///< of the observer's left, image pixels
    FNCountedPtr<FNPos> rightEye;
    FNCountedPtr<FaceStream> faceStream;
    FNCountedPtr<FN3Vector<double>> shapeLeftEye; ///< in the coordinates of the 3D data
    FNCountedPtr<FN3Vector<double>> shapeRightEye;
    FNCountedPtr<Fn::VertexImage> vertexImage;
    FNCountedPtr<ShapeImage::TexturedPointSet> pointSet;
};

} // namespace Cmp

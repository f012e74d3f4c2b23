#pragma once

#include "cmp/face/face.h"
#include "img/affine/mapping.h"
#include "kx/cut_box.h"
#include "kx/facegeo.h"

#include <array>
#include <optional>

namespace Kx::FullFrontal {

/// Cuts portraits such that head and eyes stand in the picture as ISO/IEC 19794-5 asks of a full frontal
/// image: upright, the middle of the eyes at half the width, at a height and of a size by two ratios.
///
/// The outline of the head comes from the caller, or from the eyes: each place that is (0, 0) does. Any
/// number of threads may use one creator.
class Creator {
public:
    using TransformDimensions = CutBox;

    /// The configuration type.
    static std::string typeId() { return "CropToFullFrontal"; }
    static Fn::Deployment::Type define();

    /// @throws FNEBadArg for settings that no picture can have
    explicit Creator(const Fn::Deployment::Component& component);

    /// The picture with all annotations of the face at their new places.
    /// @param lengthRatio of the head to the picture's height
    /// @param position of the eyes, in heights of the picture above its lower edge
    /// @throws FNEBadArg for ratios beyond the standard's, coinciding eyes, eyes of equal x if the outline
    /// depends on them, a head that leans too far, and too much padding; FNEBadFunCall for a face without
    /// eyes
    Cmp::Face extract(const Cmp::Face& face) const;
    Cmp::Face extract(const Cmp::Face& face, float lengthRatio, float position) const;
    Cmp::Face extract(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar, FNPos rightEar) const;
    Cmp::Face extract(const Cmp::Face& face, float lengthRatio, float position, FNPos chin, FNPos crown,
                      FNPos leftEar, FNPos rightEar) const;

    /// Corners of what extract() cuts out: upper left, upper right, lower right, lower left, as the head is
    /// upright. @throws as extract() but for padding
    using Corners = std::array<FNPos, 4>;
    Corners getCropRect(const Cmp::Face& face) const;
    Corners getCropRect(const Cmp::Face& face, float lengthRatio, float position) const;
    Corners getCropRect(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar, FNPos rightEar) const;
    Corners getCropRect(const Cmp::Face& face, float lengthRatio, float position, FNPos chin, FNPos crown,
                        FNPos leftEar, FNPos rightEar) const;

    /// @throws FNEBadArg for ratios beyond the standard's, if that test is configured
    void testSettings(float lengthRatio, float position) const;

    void cuttingBox(FNPos left, FNPos right, float lengthRatio, float position, FNPos chin, FNPos crown,
                    FNPos leftEar, FNPos rightEar, TransformDimensions& box) const;

    /// For images of `unsigned char`, `unsigned short`, `float` and Fn::Bgra32, with an outline that is set.
    /// @param left,right eyes, in the image before and in the picture afterwards
    /// @param toPicture becomes the mapping from the image to the picture
    template <class T>
    FNImage<T> crop(const FNImage<T>& image, FNPos& left, FNPos& right, float lengthRatio, float position,
                    FNPos chin, FNPos crown, FNPos leftEar, FNPos rightEar,
                    Img::Affine::Mapping& toPicture) const;

private:
    /// What the width of the picture follows.
    enum class Width { AspectRatio, HeadWidth };

    FaceGeometry::Points pointsOf(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar,
                                  FNPos rightEar) const;
    template <class T>
    Cmp::Face extracted(const Cmp::Face& face, float lengthRatio, float position,
                        const FaceGeometry::Points& points) const;

    std::optional<int> targetWidth_; ///< pixels
    float lengthRatio_, position_;
    Width width_;
    float widthRatio_; ///< height to width of the picture, or width of the head to that of the picture
    bool testSettings_, allowRotation_;
    Padding padding_;
    FaceGeometry geometry_;
};

} // namespace Kx::FullFrontal

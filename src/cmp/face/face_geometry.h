#pragma once

#include "fn/geometry.h"

/// The proportions of a face: where its features lie with respect to the eyes or to a location of the face
/// finder.
///
/// A location is a position in the middle of the eyes, an angle from x toward y in radians, and a width,
/// which is the distance of the eyes. All lengths are image pixels. "Left" is the eye at the smaller x.
namespace Cmp {

FNPos eyesToMouthPos(FNPos left, FNPos right);

FNPos faceToMouthPos(FNPos pos, float angle, float width);
FNPos faceToLeftEyePos(FNPos pos, float angle, float width);
FNPos faceToRightEyePos(FNPos pos, float angle, float width);
void faceToEyesPos(FNPos pos, float angle, float width, FNPos& left, FNPos& right);

/// @throws std::invalid_argument if the eyes coincide.
void eyesToFacePos(FNPos left, FNPos right, FNPos& pos, float& angle, float& distance);

/// @throws std::invalid_argument if the eyes coincide.
void checkEyesApart(FNPos left, FNPos right);

/// A parallelogram in an image with corner `origin` and sides `u` and `v`, as Img::Affine::transform takes
/// it.
struct SourceRegion {
    FNPos origin;
    FNPos u; ///< along the rows of the result
    FNPos v; ///< along its columns
};

/// What has to be cut out such that, in a result of `width` by `height` pixels, the first eye lies at
/// `target` and the second at (width - target.x, target.y).
/// @param scale stretches the region across the line of the eyes
/// @throws FNEBadArg if the first eye does not have the smaller x.
SourceRegion regionToReshape(FNPos first, FNPos second, unsigned int width, unsigned int height, FNPos target,
                             float const& scale);
/// The same for the eyes of a location.
SourceRegion regionToReshape(FNPos const& pos, float faceWidth, float angle, unsigned int width,
                             unsigned int height, FNPos target, float const& scale);

} // namespace Cmp

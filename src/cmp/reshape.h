#pragma once

#include "cmp/face/face_geometry.h"
#include "fn/image.h"
#include "fn/serialize.h"

namespace Cmp {

/// Cuts a face out of an image such that the eyes come to stand at given places.
///
/// @param first,second the eyes, the one with the smaller x first
/// @param width,height of the result
/// @param targetFirst where the first eye goes; the second one goes to (width - targetFirst.x, targetFirst.y)
/// @param interpolate whether the face may reach beyond the image, where the result is 0
/// @param scale stretches the face upright
/// @return the image, and where the eyes are in it. An image in which they are there already is returned as
/// it is.
/// @throws FNEBadArg for an image without pixels or eyes in the wrong order. For float and unsigned short.
template <class T>
FNTriple<FNImage<T>, FNPos, FNPos> reshape(FNImage<T> const& image, FNPos first, FNPos second,
                                           unsigned int width, unsigned int height, FNPos targetFirst,
                                           bool const& interpolate, float const& scale);

} // namespace Cmp

#pragma once

#include "fn/complex.h"
#include "fn/image.h"

namespace Img {

/// The image divided by its Euclidean norm (the root of the sum of all squared pixels), which becomes 1. An
/// image of norm 0 stays as it is. For `float`.
template <class T> FNImage<T> normalizeContrast(const FNImage<T>& image);

/// The real parts of the pixels. For `float`.
template <class T> FNImage<T> realPart(const FNImage<FNComplex<T>>& image);

} // namespace Img

#pragma once

#include "fn/image.h"

/// Quarter turns and mirror images.
namespace Img::Affine {

/// The image turned clockwise: its left column becomes the top row.
/// Defined for `unsigned char`, `int`, Fn::Bgra32 and Fn::Rgb48.
template <class T> FNImage<T> rightRotation(const FNImage<T>& image);

/// The image turned counter-clockwise: its right column becomes the top row. For the pixels of rightRotation.
template <class T> FNImage<T> leftRotation(const FNImage<T>& image);

/// What lies in box and image, top and bottom exchanged; a 1 by 1 image (of a zero) if that is nothing.
/// Defined for `float`, `unsigned short`, `unsigned char`, Fn::Bgra32 and Fn::Rgb48.
template <class T> FNImage<T> horReflection(const FNImage<T>& image, const FNBox& box);

/// What lies in box and image, left and right exchanged; a 1 by 1 image (of a zero) if that is nothing.
/// Defined for the pixels of horReflection, `bool`, FN3Vector<double> and FN3Matrix<double>.
template <class T> FNImage<T> vertReflection(const FNImage<T>& image, const FNBox& box);

} // namespace Img::Affine

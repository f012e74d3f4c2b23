#pragma once

#include "fn/image.h"
#include "fn/vector3.h"

/// Projective maps between quadrilaterals (P. Heckbert, "Fundamentals of Texture Mapping and Image Warping",
/// 1989).
///
/// A map is a matrix T that is applied to row vectors: (x', y', w') = (x, y, 1) * T stands for the point
/// (x'/w', y'/w'). The corners of a quadrilateral go round it, beginning with what becomes the upper left
/// one.

enum MapMode { MapAffine = 0, MapProjective = 1 };

/// From the unit square (0,0), (1,0), (1,1), (0,1) to four points.
/// @throws FNEBadArg if three of the points lie on a line such that there is no map.
MapMode MapSquareQuad(FNPos p0, FNPos p1, FNPos p2, FNPos p3, FN3Matrix<float>& T);

/// From the rectangle with the corners `r0` and `r1` to four points.
/// @throws FNEBadArg for a rectangle without width or height, and as MapSquareQuad.
MapMode MapRectQuad(FNPos r0, FNPos r1, FNPos p0, FNPos p1, FNPos p2, FNPos p3, FN3Matrix<float>& T);

/// From the four points `p` to the four points `q`.
/// @throws FNEBadArg if one of the quadrilaterals has no map.
MapMode MapQuadQuad(const FNPos (&p)[4], const FNPos (&q)[4], FN3Matrix<float>& T);

/// Fills `dst` by bilinear interpolation in `src`, whose points T gives for the points of `dst`. A pixel
/// whose point has a neighbour outside of `src` becomes 0. For `float` and `unsigned char`, which drops the
/// fraction.
template <class T>
void imgMapWithTransform(const FNImage<T>& src, FNImage<T>& dst, const FN3Matrix<float>& transform);

/// Maps the four points `p` of `src` onto the four points `q` of `dst`, and what lies around them along.
template <class T>
MapMode imgMapQuadToQuad(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&p)[4], const FNPos (&q)[4]);

/// Maps the whole of `src` onto four points of `dst`.
template <class T>
MapMode imgMapRectToQuad(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&corners)[4]);

/// Fills the whole of `dst` from four points of `src`.
template <class T>
MapMode imgMapQuadToRect(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&corners)[4]);
/// Only the matrix of that, for a result of `width` by `height` pixels: from its points to those of the
/// source.
MapMode imgMapQuadToRect(std::uint32_t width, std::uint32_t height, const FNPos (&corners)[4],
                         FN3Matrix<float>& T);

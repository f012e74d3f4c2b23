#pragma once

#include "img/affine/primitives.h"
#include "img/pyramid.h"

namespace Eye::Cara::T8 {

using Pyramid =
    Img::FixedScaleFactorPyramid<unsigned short, Img::Affine::Primitives::FourToThreeFractionalAveraging>;

/// The part of a level in which windows can have their centre in the search box, with a border of 8 zero
/// pixels around the level so that faces at the edge of the image can be found. Empty if there is nothing to
/// search.
/// @param searchBox pixels of the source image
Img::ScaledImage<unsigned short> addBorder(const Img::ScaledImage<unsigned short>& level,
                                           const FNBox& searchBox);

} // namespace Eye::Cara::T8

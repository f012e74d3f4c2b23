#pragma once

#include "eye/cara/combined_cascade.h"
#include "eye/cara/sod_image.h"

#include <vector>

namespace Eye::Cara::T8 {

/// Which windows a discriminator accepts, row by row, 1 for an accepted one: the same as asking it for each
/// window. Bits are counted for whole columns of windows at once, as neighbouring windows read neighbouring
/// bytes; so the many windows that go at the first support vectors are never copied.
std::vector<unsigned char> acceptedWindows(const SodDotDiscriminator& discriminator,
                                           const Implementation::SodImage& sods);

namespace Plain {

/// The same, window by window.
std::vector<unsigned char> acceptedWindows(const SodDotDiscriminator& discriminator,
                                           const Implementation::SodImage& sods);

} // namespace Plain

} // namespace Eye::Cara::T8

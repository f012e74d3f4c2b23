#pragma once

#include "fn/image_reference.h"

/// Measures of a portrait that are taken on its pixels, without trained data.
///
/// `portrait` is the standard portrait, `eye0` and `eye1` are places in the source image, eye0 being the one
/// on its left.

namespace Cmp::Portrait {

/// Mean of the pixels, as a gray level from -0.5 to 255.5. @param window the exposure window
float exposure(const FNImage<float>& window);

/// Number of pixels of the face that are far brighter than most of it (by Tukey's fence), or nearly white.
float hotSpots(const FNImage<float>& portrait);

/// Number of different gray levels that occur in the face.
unsigned int grayScaleDensity(const FNImage<unsigned char>& image, FNPos eye0, FNPos eye1);

/// Share of pixels between eyes and mouth that have a colour of skin.
float naturalSkinColour(const FNImage<Fn::Bgra32>& image, FNPos eye0, FNPos eye1);

/// How red the pupil of `eye` is, which is one of the two; about 1 and more for red ones.
float redEye(const FNImage<Fn::Bgra32>& image, FNPos eye, FNPos eye0, FNPos eye1);

/// By how many levels the skin right below an eye is darker than the cheek: above 0 behind tinted glasses.
float glassTint(const FNImage<Fn::Bgra32>& image, FNPos eye, FNPos eye0, FNPos eye1);

} // namespace Cmp::Portrait

namespace Cmp::Implementation {

/// Whether the colour of a pixel occurs on skin, of any ethnicity.
bool hasNaturalSkinColour(const Fn::Bgra32& pixel);

} // namespace Cmp::Implementation

#pragma once

#include "fn/image.h"

#include <functional>

/// The integer resampling methods, written pixel by pixel from what they are to compute. Slow.
namespace Plain {

using Words = FNImage<unsigned short>;

Words destinationAligned(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h);
Words sourceAligned(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h);
Words integerAverage(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h);
Words fourToThree(const Words& src);

/// Mean of the area of each result pixel, in floating point.
template <class T>
FNImage<double> areaMean(const FNImage<T>& src, const FNBox& box, std::uint32_t w, std::uint32_t h);

Words bilinearBox(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h);
/// @param outside called for each sample without source; gives its value
Words bilinear(const Words& src, std::uint32_t w, std::uint32_t h, FNPos origin, FN2Vector<float> u,
               FN2Vector<float> v, const std::function<unsigned short()>& outside);

/// One channel of a colour image as it stands, and the other way round.
FNImage<unsigned char> channel(const FNImage<Fn::Bgra32>& image, int which);

} // namespace Plain

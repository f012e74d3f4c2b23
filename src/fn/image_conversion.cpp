#include "fn/image_conversion.h"

namespace Fn {

template <class To, class From> void convertPixels(const From* from, To* to, std::uint64_t n) {
    for (std::uint64_t i = 0; i < n; ++i) to[i] = convertPixel<To>(from[i]);
}

template void convertPixels(const unsigned char*, unsigned short*, std::uint64_t);
template void convertPixels(const unsigned char*, float*, std::uint64_t);
template void convertPixels(const unsigned char*, Bgra32*, std::uint64_t);
template void convertPixels(const unsigned char*, Rgb48*, std::uint64_t);
template void convertPixels(const unsigned short*, unsigned char*, std::uint64_t);
template void convertPixels(const unsigned short*, float*, std::uint64_t);
template void convertPixels(const unsigned short*, Bgra32*, std::uint64_t);
template void convertPixels(const unsigned short*, Rgb48*, std::uint64_t);
template void convertPixels(const float*, unsigned char*, std::uint64_t);
template void convertPixels(const float*, unsigned short*, std::uint64_t);
template void convertPixels(const float*, Bgra32*, std::uint64_t);
template void convertPixels(const float*, Rgb48*, std::uint64_t);
template void convertPixels(const Bgra32*, unsigned char*, std::uint64_t);
template void convertPixels(const Bgra32*, unsigned short*, std::uint64_t);
template void convertPixels(const Bgra32*, float*, std::uint64_t);
template void convertPixels(const Bgra32*, Rgb48*, std::uint64_t);
template void convertPixels(const Rgb48*, unsigned char*, std::uint64_t);
template void convertPixels(const Rgb48*, unsigned short*, std::uint64_t);
template void convertPixels(const Rgb48*, float*, std::uint64_t);
template void convertPixels(const Rgb48*, Bgra32*, std::uint64_t);

} // namespace Fn

#include "fn/image_package.h"

#include "fn/byte_order.h"
#include "fn/image_conversion.h"

#include <bit>

namespace Fn {

namespace {

constexpr std::size_t headSize = 8;

/// Copies samples between memory and stored order; the same both ways.
void swapSamples(const unsigned char* from, unsigned char* to, std::uint64_t bytes, std::size_t sampleSize) {
    static_assert(std::endian::native == std::endian::little);
    if (sampleSize == 1) {
        std::copy_n(from, bytes, to);
        return;
    }
    for (std::uint64_t i = 0; i < bytes; i += sampleSize)
        std::reverse_copy(from + i, from + i + sampleSize, to + i);
}

} // namespace

template <class T> Package Serializer<FNImage<T>>::pack(const FNImage<T>& image) {
    Package::Core head(headSize), pixels(image.size() * sizeof(T));
    storeUInt32(image.w(), head.getExclusive());
    storeUInt32(image.h(), head.getExclusive() + 4);
    swapSamples(reinterpret_cast<const unsigned char*>(image.data()), pixels.getExclusive(), pixels.size(),
                sizeof(typename SampleOf<T>::Type));
    return Package(std::list<Package::Core>{head, pixels});
}

template <class T> FNImage<T> Serializer<FNImage<T>>::unpack(const Package& package) {
    const auto refuse = [] { FN_THROW(FNEBadArg, "converting to FNImage<T> from an invalid package"); };
    if (package.cores().size() != 2) refuse();
    const Package::Core &head = package.cores().front(), &pixels = package.cores().back();
    if (head.size() != headSize) refuse();
    const std::uint32_t w = loadUInt32(head.data()), h = loadUInt32(head.data() + 4);
    if (pixels.size() % sizeof(T) != 0 || pixels.size() / sizeof(T) != std::uint64_t{w} * h) refuse();

    FNImage<T> image(w, h);
    swapSamples(pixels.data(), reinterpret_cast<unsigned char*>(image.getExclusive()), pixels.size(),
                sizeof(typename SampleOf<T>::Type));
    return image;
}

template struct Serializer<FNImage<unsigned char>>;
template struct Serializer<FNImage<unsigned short>>;
template struct Serializer<FNImage<float>>;
template struct Serializer<FNImage<Bgra32>>;
template struct Serializer<FNImage<Rgb48>>;

} // namespace Fn

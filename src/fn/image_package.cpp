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

template <class T> void store(const T* pixels, unsigned char* stored, std::uint64_t n) {
    swapSamples(reinterpret_cast<const unsigned char*>(pixels), stored, n * sizeof(T),
                sizeof(typename SampleOf<T>::Type));
}
template <class T> void load(const unsigned char* stored, T* pixels, std::uint64_t n) {
    swapSamples(stored, reinterpret_cast<unsigned char*>(pixels), n * sizeof(T),
                sizeof(typename SampleOf<T>::Type));
}

/// Any byte but 0 is true: a stored byte must not become a `bool` that is neither.
void load(const unsigned char* stored, bool* pixels, std::uint64_t n) {
    std::transform(stored, stored + n, pixels, [](unsigned char byte) { return byte != 0; });
}

void store(const FN3Vector<double>* pixels, unsigned char* stored, std::uint64_t n) {
    htond(reinterpret_cast<const double*>(pixels), stored, 3 * n);
}
void load(const unsigned char* stored, FN3Vector<double>* pixels, std::uint64_t n) {
    ntohd(stored, reinterpret_cast<double*>(pixels), 3 * n);
}

} // namespace

template <class T> Package Serializer<FNImage<T>>::pack(const FNImage<T>& image) {
    Package::Core head(headSize), pixels(image.size() * sizeof(T));
    storeUInt32(image.w(), head.getExclusive());
    storeUInt32(image.h(), head.getExclusive() + 4);
    store(image.data(), pixels.getExclusive(), image.size());
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
    load(pixels.data(), image.getExclusive(), image.size());
    return image;
}

template struct Serializer<FNImage<unsigned char>>;
template struct Serializer<FNImage<unsigned short>>;
template struct Serializer<FNImage<float>>;
template struct Serializer<FNImage<Bgra32>>;
template struct Serializer<FNImage<Rgb48>>;
template struct Serializer<FNImage<bool>>;
template struct Serializer<FNImage<FN3Vector<double>>>;

Package Serializer<FNImageAttributes>::pack(const FNImageAttributes& attributes) {
    std::list<Package> elements;
    for (const auto& [key, value] : attributes) {
        elements.push_back(serialize(key));
        elements.push_back(serialize(value));
    }
    return Package(elements);
}

FNImageAttributes Serializer<FNImageAttributes>::unpack(const Package& package) {
    FNImageAttributes attributes;
    for (PackageReader reader(package); !reader.atEnd();) {
        const auto key = reader.next<std::string>();
        attributes[key] = reader.next<std::string>();
    }
    return attributes;
}

} // namespace Fn

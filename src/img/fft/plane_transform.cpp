#include "img/fft/plane_transform.h"

#include <cmath>
#include <numeric>

namespace Img::Fft {

namespace {

template <class T> const T* valuesOf(const FNImage<FNComplex<T>>& image) {
    return reinterpret_cast<const T*>(image.data());
}
template <class T> const T* valuesOf(const FNImage<T>& image) {
    return image.data();
}

template <class T, class Pixel> RowSource<T> rowSource(const FNImage<Pixel>& image, bool inverse) {
    constexpr std::uint32_t values = sizeof(Pixel) / sizeof(T);
    RowSource<T> source{.source = valuesOf(image),
                        .complex = values == 2,
                        .lines = image.h(),
                        .stride = values * image.w(),
                        .segments = {},
                        .inverse = inverse};
    source.segments[0] = {0, image.w(), 0};
    return source;
}

template <class T, class Pixel> RowSource<T> rowSource(const SparseImage<Pixel>& image, bool inverse) {
    RowSource<T> source = rowSource<T>(image.data(), inverse);
    const PixelBlockRanges& blocks = image.pixels();
    const std::uint32_t first = blocks.end - blocks.begin, values = sizeof(Pixel) / sizeof(T);
    source.segments[0] = {blocks.begin, first, 0};
    source.segments[1] = {blocks.secondBegin, blocks.secondEnd - blocks.secondBegin, values * first};
    return source;
}

std::vector<std::uint32_t> countUp(std::uint32_t n) {
    std::vector<std::uint32_t> numbers(n);
    std::iota(numbers.begin(), numbers.end(), 0u);
    return numbers;
}

template <class Pixel> std::vector<std::uint32_t> linesOf(const SparseImage<Pixel>& image) {
    std::vector<std::uint32_t> lines(image.data().h());
    for (std::uint32_t j = 0; j < image.data().h(); ++j) lines[j] = image.lines()[j];
    return lines;
}

} // namespace

template <class T>
PlaneTransform<T>::PlaneTransform(std::uint32_t w, std::uint32_t h)
    : rows_(w), columns_(h), allLines_(countUp(h)), halfOfColumns_(countUp(w / 2 + 1)) {}

template <class T> double PlaneTransform<T>::constantFactor() const {
    return std::ldexp(double(w()) * h(), -2 * static_cast<int>(rows_.totalShift() + columns_.totalShift()));
}

template <class T>
auto PlaneTransform<T>::run(const RowSource<T>& source, std::span<const std::uint32_t> lines,
                            std::span<const std::uint32_t> columns, std::uint32_t outWidth,
                            Workspace<T>& workspace) const -> Complex {
    const auto count = columns.empty() ? w() : static_cast<std::uint32_t>(columns.size());
    const std::size_t size = 2 * std::size_t{count} * lines.size();
    if (workspace.rows.size() < size) workspace.rows.resize(size);
    transformRows<T>(rows_, source, columns, workspace.rows.data(), workspace);
    Complex result(outWidth, h());
    transformColumns<T>(columns_, workspace.rows.data(), lines, count, source.inverse,
                        reinterpret_cast<T*>(result.getExclusive()), outWidth, workspace);
    return result;
}

template <class T>
auto PlaneTransform<T>::runReal(const RowSource<T>& source, std::span<const std::uint32_t> lines,
                                Workspace<T>& workspace) const -> Complex {
    Complex result = run(source, lines, halfOfColumns_, w(), workspace);
    FNComplex<T>* const out = result.getExclusive();
    for (std::uint32_t y = 0; y < h(); ++y) {
        FNComplex<T>* const row = out + std::size_t{y} * w();
        const FNComplex<T>* const mirrored = out + std::size_t{(h() - y) % h()} * w();
        for (std::uint32_t x = w() / 2 + 1; x < w(); ++x) row[x] = conj(mirrored[w() - x]);
    }
    return result;
}

template <class T>
auto PlaneTransform<T>::transform(const FNImage<T>& image, Workspace<T>& workspace) const -> Complex {
    return runReal(rowSource<T>(image, false), allLines_, workspace);
}

template <class T>
auto PlaneTransform<T>::transform(const SparseImage<T>& image, Workspace<T>& workspace) const -> Complex {
    return runReal(rowSource<T>(image, false), linesOf(image), workspace);
}

template <class T>
auto PlaneTransform<T>::transform(const Complex& image, bool inverse, Workspace<T>& workspace) const
    -> Complex {
    return run(rowSource<T>(image, inverse), allLines_, {}, w(), workspace);
}

template <class T>
auto PlaneTransform<T>::transform(const SparseImage<FNComplex<T>>& image, bool inverse,
                                  std::span<const std::uint32_t> columns, Workspace<T>& workspace) const
    -> Complex {
    const auto width = columns.empty() ? w() : static_cast<std::uint32_t>(columns.size());
    return run(rowSource<T>(image, inverse), linesOf(image), columns, width, workspace);
}

template class PlaneTransform<float>;
template class PlaneTransform<std::int32_t>;

} // namespace Img::Fft

#pragma once

#include "fn/image.h"

/// Images that are zero outside of up to two blocks of columns and up to two blocks of rows, such as filters
/// in the frequency domain: there, low negative frequencies lie at the far end of a line.

/// One or two half open ranges of indexes. A second range whose end is 0 is absent.
struct PixelBlockRanges {
    std::uint32_t begin = 0;
    std::uint32_t end = 0;
    std::uint32_t secondBegin = 0;
    std::uint32_t secondEnd = 0;

    /// Number of indexes in both ranges.
    constexpr std::uint32_t count() const { return end - begin + (secondEnd - secondBegin); }
    /// Whether no begin lies above its end, and no end above `fullSize`.
    constexpr bool fits(std::uint32_t fullSize) const {
        return begin <= end && end <= fullSize && secondBegin <= secondEnd && secondEnd <= fullSize;
    }
    /// The `i`-th index, `i` below count().
    constexpr std::uint32_t operator[](std::uint32_t i) const {
        const std::uint32_t first = end - begin;
        return i < first ? begin + i : secondBegin + (i - first);
    }
    friend constexpr bool operator==(const PixelBlockRanges&, const PixelBlockRanges&) = default;
};

/// The non-zero data of an image: pixel (i, j) of data() is pixel (pixels()[i], lines()[j]) of the full
/// image.
template <class T> class SparseImage {
public:
    SparseImage() = default;

    /// @param data has pixels.count() by lines.count() pixels, or is empty if one of them is 0
    /// @param pixels ranges along a line, within `w`
    /// @param lines ranges of lines, within `h`
    /// @throws FNEBadArg if a range or the size of `data` does not fit.
    SparseImage(const FNImage<T>& data, const PixelBlockRanges& pixels, const PixelBlockRanges& lines,
                std::uint32_t w, std::uint32_t h)
        : data_(data), pixels_(pixels), lines_(lines), w_(w), h_(h) {
        if (!lines.fits(h)) FN_THROW(FNEBadArg, "Invalid line ranges for SparseImages");
        if (!pixels.fits(w)) FN_THROW(FNEBadArg, "Invalid pixel ranges for SparseImages");
        const bool none = pixels.count() == 0 || lines.count() == 0;
        if (data.w() != (none ? 0 : pixels.count()) || data.h() != (none ? 0 : lines.count()))
            FN_THROW(FNEBadArg, "The data of a SparseImage do not have the size of its ranges");
    }

    /// The blocks of a full image, copied out of it; the rest is taken as zero.
    SparseImage(const FNImage<T>& full, const PixelBlockRanges& pixels, const PixelBlockRanges& lines)
        : SparseImage(blocks(full, pixels, lines), pixels, lines, full.w(), full.h()) {}

    /// Size of the full image.
    std::uint32_t w() const noexcept { return w_; }
    std::uint32_t h() const noexcept { return h_; }
    const FNImage<T>& data() const noexcept { return data_; }
    FNImage<T>& data() noexcept { return data_; }
    const PixelBlockRanges& pixels() const noexcept { return pixels_; }
    const PixelBlockRanges& lines() const noexcept { return lines_; }

    /// The full image, with zeros outside of the blocks.
    explicit operator FNImage<T>() const {
        FNImage<T> full(w_, h_);
        full.fill(T{});
        T* const out = full.getExclusive();
        for (std::uint32_t j = 0; j < data_.h(); ++j)
            for (std::uint32_t i = 0; i < data_.w(); ++i)
                out[std::uint64_t{lines_[j]} * w_ + pixels_[i]] = data_(i, j);
        return full;
    }

private:
    static FNImage<T> blocks(const FNImage<T>& full, const PixelBlockRanges& pixels,
                             const PixelBlockRanges& lines) {
        if (!pixels.fits(full.w()) || !lines.fits(full.h())) return {}; // the constructor says which
        FNImage<T> data(pixels.count(), lines.count());
        T* out = data.getExclusive();
        for (std::uint32_t j = 0; j < data.h(); ++j)
            for (std::uint32_t i = 0; i < data.w(); ++i) *out++ = full(pixels[i], lines[j]);
        return data;
    }

    FNImage<T> data_;
    PixelBlockRanges pixels_;
    PixelBlockRanges lines_;
    std::uint32_t w_ = 0;
    std::uint32_t h_ = 0;
};

namespace Fn::ImageImpl {

/// Walks the blocks of a sparse image; `P` is `T` or `const T`.
template <class P> class BlockIterator {
public:
    bool atEnd() const noexcept { return pixel_ == end_; }
    P& operator*() const noexcept { return *pixel_; }
    BlockIterator& operator++() noexcept {
        ++pixel_;
        if (++i_ == width_) {
            i_ = 0;
            ++j_;
        }
        return *this;
    }
    /// Position in the full image.
    std::uint32_t x() const noexcept { return pixels_[i_]; }
    std::uint32_t y() const noexcept { return lines_[j_]; }

protected:
    template <class Sparse>
    BlockIterator(P* data, const Sparse& image) noexcept
        : pixel_(data), end_(data + image.data().size()), width_(image.data().w()), pixels_(image.pixels()),
          lines_(image.lines()) {}

private:
    P* pixel_;
    P* end_;
    std::uint32_t i_ = 0;
    std::uint32_t j_ = 0;
    std::uint32_t width_;
    PixelBlockRanges pixels_;
    PixelBlockRanges lines_;
};

} // namespace Fn::ImageImpl

/// Walks the pixels inside the blocks, row by row. The image must outlive the iterator and not be copied
/// meanwhile.
template <class T> class SparseImageIterator : public Fn::ImageImpl::BlockIterator<T> {
public:
    explicit SparseImageIterator(SparseImage<T>& image)
        : Fn::ImageImpl::BlockIterator<T>(image.data().getExclusive(), image) {}
};

/// SparseImageIterator for reading.
template <class T> class ConstSparseImageIterator : public Fn::ImageImpl::BlockIterator<const T> {
public:
    explicit ConstSparseImageIterator(const SparseImage<T>& image)
        : Fn::ImageImpl::BlockIterator<const T>(image.data().data(), image) {}
};

#pragma once

#include "fn/geometry.h"
#include "fn/rmem.h"

#include <span>

/// Rasters: FNImage<T>, its pixel types, and iterators over a rectangle of one.
///
///     FNImage<float> image(640, 480);                       // pixels are not initialised
///     for (FNImIter<float> it(image, image.box()); !it.atEnd(); ++it) *it = 0.5f;

namespace Fn {

/// Memory layout of a pixel: blue, green, red, alpha.
template <class T> struct BgraRepresentation {
    T b, g, r, a;
    static constexpr bool hasAlpha = true;
};

/// Memory layout of a pixel: red, green, blue.
template <class T> struct RgbRepresentation {
    T r, g, b;
    static constexpr bool hasAlpha = false;
};

/// A colour pixel with samples of type `T`. A default-constructed one is not initialised.
template <class T, class Representation> struct Rgb : Representation {
    Rgb() = default;
    /// Opaque where there is an alpha.
    constexpr Rgb(T red, T green, T blue) {
        this->r = red;
        this->g = green;
        this->b = blue;
        if constexpr (Representation::hasAlpha) this->a = std::numeric_limits<T>::max();
    }
    constexpr Rgb(T red, T green, T blue, T alpha) requires Representation::hasAlpha : Rgb(red, green, blue) {
        this->a = alpha;
    }

    friend constexpr bool operator==(const Rgb& p, const Rgb& q) {
        if constexpr (Representation::hasAlpha)
            if (p.a != q.a) return false;
        return p.r == q.r && p.g == q.g && p.b == q.b;
    }
};

/// The two colour pixels of the system: 4 bytes and 6 bytes.
using Bgra32 = Rgb<unsigned char, BgraRepresentation<unsigned char>>;
using Rgb48 = Rgb<unsigned short, RgbRepresentation<unsigned short>>;

} // namespace Fn

/// A raster of `w()` by `h()` pixels on a counted copy-on-write block. Rows lie top to bottom without
/// padding: pixel (x, y) is element x + y * w(). An image without pixels has both sizes 0. Copies share the
/// pixels.
///
/// Gray pixels are `unsigned char` (0..255), `unsigned short` (0..65535) or `float` (0..1), colour pixels
/// Fn::Bgra32 or Fn::Rgb48; other types hold spectra, masks and normals.
template <class T> class FNImage {
public:
    using Pixel = T;

    FNImage() = default;

    /// A fresh image, pixels not initialised. @throws std::bad_alloc
    FNImage(std::uint32_t w, std::uint32_t h) : mem_(std::uint64_t{w} * h), w_(h ? w : 0), h_(w ? h : 0) {}

    /// On the first w * h elements of `mem`, shared. @throws FNEBadArg if there are fewer.
    FNImage(const FNRMem<T>& mem, std::uint32_t w, std::uint32_t h)
        : mem_(mem.size() == std::uint64_t{w} * h ? mem : FNRMem<T>(mem, 0, std::uint64_t{w} * h)),
          w_(h ? w : 0), h_(w ? h : 0) {}

    std::uint32_t w() const noexcept { return w_; }
    std::uint32_t h() const noexcept { return h_; }
    /// Number of pixels.
    std::uint64_t size() const noexcept { return std::uint64_t{w_} * h_; }
    bool empty() const noexcept { return w_ == 0; }
    /// The whole image (the first 2^31 - 1 columns and rows of a larger one).
    FNBox box() const noexcept {
        constexpr std::uint32_t most = std::numeric_limits<std::int32_t>::max();
        return {0, 0, static_cast<std::int32_t>(std::min(w_, most)),
                static_cast<std::int32_t>(std::min(h_, most))};
    }
    const FNRMem<T>& mem() const noexcept { return mem_; }

    /// First pixel, for reading.
    const T* data() const noexcept { return mem_.data(); }
    const T* row(std::uint32_t y) const noexcept { return data() + std::uint64_t{y} * w_; }
    std::span<const T> span() const noexcept { return mem_.span(); }
    /// Pixel (x, y), which must lie inside.
    const T& operator()(std::uint32_t x, std::uint32_t y) const noexcept { return row(y)[x]; }
    /// @throws FNEOutOfRange for a position outside.
    const T& get(FNGridPos pos) const { return data()[index(pos)]; }

    /// First pixel, for writing: copies the pixels if somebody shares them. The pointer holds until the image
    /// is copied.
    T* getExclusive() { return mem_.getExclusive(); }
    /// Makes the pixels this image's own, as getExclusive().
    void demandExclusiveUse() { mem_.getExclusive(); }
    /// Writes one pixel. @throws FNEOutOfRange for a position outside.
    void set(FNGridPos pos, const T& value) {
        const std::uint64_t i = index(pos);
        getExclusive()[i] = value;
    }
    /// Writes all pixels.
    void fill(const T& value) { std::fill_n(getExclusive(), size(), value); }

private:
    std::uint64_t index(FNGridPos pos) const {
        if (!box().contains(pos)) FN_THROW(FNEOutOfRange, "position outside of the image");
        return static_cast<std::uint64_t>(pos.x) + static_cast<std::uint64_t>(pos.y) * w_;
    }

    FNRMem<T> mem_;
    std::uint32_t w_ = 0;
    std::uint32_t h_ = 0;
};

/// Same size and same pixels.
template <class T> bool operator==(const FNImage<T>& a, const FNImage<T>& b) {
    if (a.w() != b.w() || a.h() != b.h()) return false;
    return a.data() == b.data() || std::equal(a.data(), a.data() + a.size(), b.data());
}

namespace Fn::ImageImpl {

/// Walks a rectangle of rows; `P` is `T` or `const T`.
template <class P> class RectangleIterator {
public:
    bool atEnd() const noexcept { return rowsDone_ == rows_; }
    P& operator*() const noexcept { return *pixel_; }
    P* operator->() const noexcept { return pixel_; }

    RectangleIterator& operator++() noexcept {
        if (++pixel_ == rowEnd_) nextRow();
        return *this;
    }
    /// To the first pixel of the next row.
    void nextRow() noexcept {
        if (++rowsDone_ == rows_) return;
        pixel_ = row_ += stride_;
        rowEnd_ = row_ + width_;
    }
    /// Pixels from here to the end of the row.
    std::span<P> restOfRow() const noexcept { return {pixel_, rowEnd_}; }

    /// Size of the rectangle.
    std::uint32_t width() const noexcept { return width_; }
    std::uint32_t rows() const noexcept { return rows_; }
    /// Position within the rectangle.
    std::uint32_t x() const noexcept { return static_cast<std::uint32_t>(pixel_ - row_); }
    std::uint32_t y() const noexcept { return rowsDone_; }

protected:
    RectangleIterator(P* firstPixel, std::uint32_t stride, const FNBox& box) noexcept
        : width_(box.width()), rows_(box.height()), stride_(stride) {
        if (rows_ == 0) return;
        pixel_ = row_ = firstPixel + static_cast<std::uint64_t>(box.y0) * stride + box.x0;
        rowEnd_ = row_ + width_;
    }

private:
    P* pixel_ = nullptr;
    P* row_ = nullptr;
    P* rowEnd_ = nullptr;
    std::uint32_t rowsDone_ = 0;
    std::uint32_t width_;
    std::uint32_t rows_;
    std::uint32_t stride_;
};

} // namespace Fn::ImageImpl

/// Walks, row by row, the part of a rectangle that lies inside the image; at its end from the start if there
/// is none. The image must outlive the iterator and not be copied meanwhile.
template <class T> class FNImIter : public Fn::ImageImpl::RectangleIterator<T> {
public:
    FNImIter(FNImage<T>& image, const FNBox& box)
        : Fn::ImageImpl::RectangleIterator<T>(image.getExclusive(), image.w(), box & image.box()) {}
};

/// FNImIter for reading.
template <class T> class FNConstImIter : public Fn::ImageImpl::RectangleIterator<const T> {
public:
    FNConstImIter(const FNImage<T>& image, const FNBox& box)
        : Fn::ImageImpl::RectangleIterator<const T>(image.data(), image.w(), box & image.box()) {}
};

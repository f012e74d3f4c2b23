#pragma once

#include "img/fft/plane_transform.h"

namespace ImgFFTImplementations {

/// What an engine says to an image of the wrong size.
struct SizeMessages {
    const char* transformReal;
    const char* transformComplex;
    const char* inverse;
};

/// Transforms images of one size. ImgFFT tells what its operations do.
template <class T> class Engine {
public:
    using Complex = FNImage<FNComplex<T>>;
    using SparseComplex = SparseImage<FNComplex<T>>;
    using Workspace = Img::Fft::Workspace<T>;

    Complex transformReal(const FNImage<T>& image, Workspace& workspace) const;
    Complex transformReal(const SparseImage<T>& image, Workspace& workspace) const;
    Complex transformComplex(const Complex& image, Workspace& workspace) const;
    Complex transformComplex(const SparseComplex& image, Workspace& workspace) const;
    Complex inverse(const Complex& image, Workspace& workspace) const;
    Complex inverse(const SparseComplex& image, Workspace& workspace) const;
    Complex processColumnsSparse(const SparseComplex& image, std::span<const std::uint32_t> columns,
                                 Workspace& workspace) const;
    double constantFactor() const;

protected:
    Engine(unsigned width, unsigned height, const SizeMessages& messages);

private:
    template <class Image> void demandSize(const Image& image, const char* message) const;

    FNCountedPtr<Img::Fft::PlaneTransform<T>> plane_;
    SizeMessages messages_;
};

/// Floats, powers of two. @throws FNEBadArg for any other size.
template <class T> class IPPRadix2 : public Engine<T> {
public:
    IPPRadix2(unsigned width, unsigned height);
};
/// Floats, any size from 2 by 2 on. @throws FNEBadArg for a smaller one.
template <class T> class MKLMixedRadix : public Engine<T> {
public:
    MKLMixedRadix(unsigned width, unsigned height);
};
/// Fixed point, powers of two.
template <class T> class Radix2 : public Engine<T> {
public:
    Radix2(unsigned width, unsigned height);
};
/// Fixed point, sizes above 7 without a prime factor above 31. @throws FNEBadArg for any other size.
template <class T> class MixedRadix : public Engine<T> {
public:
    MixedRadix(unsigned width, unsigned height);
};

/// The engines for floats and for fixed point.
template <class T> struct IPP {
    using ForPowersOfTwo = IPPRadix2<T>;
    using ForOtherSizes = MKLMixedRadix<T>;
};
template <class T> struct Reference {
    using ForPowersOfTwo = Radix2<T>;
    using ForOtherSizes = MixedRadix<T>;
};

} // namespace ImgFFTImplementations

/// Discrete Fourier transform of images of one size, any from 2 by 2 on:
///
///     F(u, v) = sum over x, y of f(x, y) * exp(-2 pi i (u x / w + v y / h))
///
/// with the zero frequency at (0, 0). The inverse has the opposite sign in the exponent, and neither is
/// scaled. An object may be shared by threads; each makes a Temporary of its own.
///
///     const ImgFFTFloat fft(160, 160);
///     const auto temporary = fft.create();
///     const auto spectrum = fft.transformReal(image, temporary);
///
/// In fixed point (T is int, values use the whole range), the transform and its inverse scale down by a power
/// of two that is at least w * h, by which nothing overflows, and round at every stage; components of complex
/// images are clamped to +-1518453915, about 2^31 / sqrt(2).
///
/// All throw FNEBadArg for an image of another size.
template <class T, class Impl> class ImgFFT {
public:
    using Complex = FNImage<FNComplex<T>>;
    using SparseComplex = SparseImage<FNComplex<T>>;
    /// Work space of one running transform; copies share it.
    using Temporary = FNCountedPtr<Img::Fft::Workspace<T>>;

    /// @throws FNEBadArg for a size that the engine cannot transform.
    ImgFFT(unsigned width, unsigned height);

    unsigned width() const { return width_; }
    unsigned height() const { return height_; }
    Temporary create() const;

    /// The full spectrum of a real image, whose halves are conjugates of each other.
    Complex transformReal(const FNImage<T>& image, Temporary temporary) const;
    Complex transformComplex(const Complex& image, Temporary temporary) const;
    Complex inverse(const Complex& image, Temporary temporary) const;

    // Of sparse images, only rows that are not zero take time.
    Complex transformReal(const SparseImage<T>& image, Temporary temporary) const;
    Complex transformComplex(const SparseComplex& image, Temporary temporary) const;
    Complex inverse(const SparseComplex& image, Temporary temporary) const;

    /// The inverse for some columns only, which is all that takes time then.
    /// @param columns ascending
    /// @return an image of columns.size() by height pixels. @throws FNEOutOfRange for a column outside.
    Complex processColumnsSparse(const SparseComplex& image, std::span<const std::uint32_t> columns,
                                 Temporary temporary) const;

    /// What a transform followed by `inverse` multiplies an image with; for floats that is width * height.
    double constantFactor() const;

    /// Also true of 0.
    static constexpr bool isPowerOfTwo(unsigned n) { return (n & (n - 1)) == 0; }

private:
    const ImgFFTImplementations::Engine<T>& engine() const;

    unsigned width_, height_;
    bool powersOfTwo_;
    FNCountedPtr<typename Impl::ForPowersOfTwo> radix2_;    ///< set if both sizes are powers of two
    FNCountedPtr<typename Impl::ForOtherSizes> mixedRadix_; ///< set otherwise
};

using ImgFFTFloat = ImgFFT<float, ImgFFTImplementations::IPP<float>>;
using ImgFFTInt = ImgFFT<int, ImgFFTImplementations::Reference<int>>;

#include "img/fft/img_fft.h"

namespace ImgFFTImplementations {

namespace {

constexpr const char* anyTransform = "imgFFT::transform: invalid image sizes";
constexpr const char* anyInverse = "imgFFT::inverse: invalid image sizes";

constexpr SizeMessages fixedPointMessages{anyTransform, anyTransform, anyInverse};
constexpr SizeMessages radix2Messages{"imgFFT<float,IPP>::transformReal: invalid image sizes", anyTransform,
                                      anyInverse};
constexpr SizeMessages mixedRadixMessages{"ImgFFT<float,MKL>::transformReal: invalid image sizes",
                                          "ImgFFT<float,MKL>::transformComplex: invalid image sizes",
                                          "ImgFFT<float,MKL>::inverse: invalid image sizes"};

unsigned demandPowersOfTwo(unsigned width, unsigned height) {
    if (!ImgFFTFloat::isPowerOfTwo(width) || !ImgFFTFloat::isPowerOfTwo(height))
        FN_THROW(FNEBadArg,
                 "ImgFFT<float, IPPRadix2>::ImgFFT(unsigned int,unsigned int): Image dimensions have to "
                 "be exact powers of two !");
    return width;
}

unsigned demandMoreThanSeven(unsigned width, unsigned height) {
    if (width <= 7 || height <= 7) FN_THROW(FNEBadArg, "imgFFT::constructor: invalid image sizes");
    return width;
}

} // namespace

template <class T>
Engine<T>::Engine(unsigned width, unsigned height, const SizeMessages& messages)
    : plane_(new Img::Fft::PlaneTransform<T>(width, height)), messages_(messages) {}

template <class T>
template <class Image>
void Engine<T>::demandSize(const Image& image, const char* message) const {
    if (image.w() != plane_->w() || image.h() != plane_->h()) FN_THROW(FNEBadArg, message);
}

template <class T>
auto Engine<T>::transformReal(const FNImage<T>& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.transformReal);
    return plane_->transform(image, workspace);
}
template <class T>
auto Engine<T>::transformReal(const SparseImage<T>& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.transformReal);
    return plane_->transform(image, workspace);
}
template <class T>
auto Engine<T>::transformComplex(const Complex& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.transformComplex);
    return plane_->transform(image, false, workspace);
}
template <class T>
auto Engine<T>::transformComplex(const SparseComplex& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.transformComplex);
    return plane_->transform(image, false, {}, workspace);
}
template <class T> auto Engine<T>::inverse(const Complex& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.inverse);
    return plane_->transform(image, true, workspace);
}
template <class T>
auto Engine<T>::inverse(const SparseComplex& image, Workspace& workspace) const -> Complex {
    demandSize(image, messages_.inverse);
    return plane_->transform(image, true, {}, workspace);
}
template <class T>
auto Engine<T>::processColumnsSparse(const SparseComplex& image, std::span<const std::uint32_t> columns,
                                     Workspace& workspace) const -> Complex {
    demandSize(image, messages_.inverse);
    for (const std::uint32_t column : columns)
        if (column >= plane_->w())
            FN_THROW(FNEOutOfRange, "imgFFT::inverse: a column lies outside of the image");
    if (columns.empty()) return {};
    return plane_->transform(image, true, columns, workspace);
}
template <class T> double Engine<T>::constantFactor() const {
    return plane_->constantFactor();
}

template class Engine<float>;
template class Engine<int>;

template <>
IPPRadix2<float>::IPPRadix2(unsigned width, unsigned height)
    : Engine(demandPowersOfTwo(width, height), height, radix2Messages) {}
template <>
MKLMixedRadix<float>::MKLMixedRadix(unsigned width, unsigned height)
    : Engine(width, height, mixedRadixMessages) {}
template <>
Radix2<int>::Radix2(unsigned width, unsigned height)
    : Engine(demandPowersOfTwo(width, height), height, fixedPointMessages) {}
template <>
MixedRadix<int>::MixedRadix(unsigned width, unsigned height)
    : Engine(demandMoreThanSeven(width, height), height, fixedPointMessages) {}

} // namespace ImgFFTImplementations

template <class T, class Impl>
ImgFFT<T, Impl>::ImgFFT(unsigned width, unsigned height)
    : width_(width), height_(height), powersOfTwo_(isPowerOfTwo(width) && isPowerOfTwo(height)) {
    if (powersOfTwo_)
        radix2_ = FNCountedPtr(new typename Impl::ForPowersOfTwo(width, height));
    else
        mixedRadix_ = FNCountedPtr(new typename Impl::ForOtherSizes(width, height));
}

template <class T, class Impl> const ImgFFTImplementations::Engine<T>& ImgFFT<T, Impl>::engine() const {
    if (powersOfTwo_) return *radix2_;
    return *mixedRadix_;
}

template <class T, class Impl> auto ImgFFT<T, Impl>::create() const -> Temporary {
    return Temporary(new Img::Fft::Workspace<T>);
}

template <class T, class Impl>
auto ImgFFT<T, Impl>::transformReal(const FNImage<T>& image, Temporary temporary) const -> Complex {
    return engine().transformReal(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::transformReal(const SparseImage<T>& image, Temporary temporary) const -> Complex {
    return engine().transformReal(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::transformComplex(const Complex& image, Temporary temporary) const -> Complex {
    return engine().transformComplex(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::transformComplex(const SparseComplex& image, Temporary temporary) const -> Complex {
    return engine().transformComplex(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::inverse(const Complex& image, Temporary temporary) const -> Complex {
    return engine().inverse(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::inverse(const SparseComplex& image, Temporary temporary) const -> Complex {
    return engine().inverse(image, *temporary);
}
template <class T, class Impl>
auto ImgFFT<T, Impl>::processColumnsSparse(const SparseComplex& image, std::span<const std::uint32_t> columns,
                                           Temporary temporary) const -> Complex {
    return engine().processColumnsSparse(image, columns, *temporary);
}
template <class T, class Impl> double ImgFFT<T, Impl>::constantFactor() const {
    return engine().constantFactor();
}

template class ImgFFT<float, ImgFFTImplementations::IPP<float>>;
template class ImgFFT<int, ImgFFTImplementations::Reference<int>>;

#include "orbek/implementation/image_adapter.h"

#include "fn/image_conversion.h"

namespace Orbek {
namespace {

/// Keeps an application's image as long as its pixels are used.
class Keeper final : public FNRMemCoreBody::Dtor {
public:
    explicit Keeper(const Image& image) : image_(image) {}
    void del(void*) const override {} // the pixels go with the image

private:
    Image image_;
};

/// An image on pixels of `owner`.
template <class T> FNImage<T> wrap(const T* pixels, const Image& owner) {
    const std::uint32_t w = owner->width(), h = owner->height();
    if (w == 0 || h == 0) return {};
    if (!pixels) FN_THROW(FNEBadArg, "The image gives no pixels");
    constexpr bool noCopy = false; // whoever writes gets a copy
    const FNCountedPtr<FNRMemCoreBody::Dtor> keeper(new Keeper(owner));
    return FNImage<T>(FNRMem<T>(pixels, std::uint64_t{w} * h, keeper, noCopy), w, h);
}

} // namespace

ImageAdapter::ImageAdapter(const Image& image)
    : AttributedImageRepresentation({}, FNImageReference::UNCOMPRESSED_RAW), image_(image) {
    if (!image) FN_THROW(FNEBadArg, "There is no image behind the handle");
}

FNImage<unsigned char> ImageAdapter::wrappedGray() const {
    return wrap(image_->grayScaleRepresentation(), image_);
}

FNImage<Fn::Bgra32> ImageAdapter::wrappedColor() const {
    return wrap(reinterpret_cast<const Fn::Bgra32*>(image_->colorRepresentation()), image_);
}

template <class T> FNImage<T> ImageAdapter::converted() const {
    return isColor() ? Fn::convertImage<T>(wrappedColor()) : Fn::convertImage<T>(wrappedGray());
}

FNImage<unsigned char> ImageAdapter::toMono8() const {
    return isColor() ? FNImageReferenceFactory::create(toBgra32()).toMono8() : wrappedGray();
}

FNImage<Fn::Bgra32> ImageAdapter::toBgra32() const {
    return isColor() ? wrappedColor() : FNImageReferenceFactory::create(toMono8()).toBgra32();
}

FNImage<Fn::Rgb48> ImageAdapter::toRgb48() const {
    return Fn::convertImage<Fn::Rgb48>(toBgra32());
}

} // namespace Orbek

#pragma once

#include "fn/image_representation.h"
#include "orbek/image.h"

namespace Orbek {

/// An application's image as the engines see it. The pixels in the image's own kind, mono8 or bgra32, are not
/// copied but read where they lie: what toMono8() and toBgra32() return keeps the application's image.
class ImageAdapter final : public AttributedImageRepresentation {
public:
    /// @throws FNEBadArg for a null handle
    explicit ImageAdapter(const Image& image);

    std::uint32_t w() const override { return image_->width(); }
    std::uint32_t h() const override { return image_->height(); }
    bool isColor() const override { return image_->isColor(); }
    FNImageReference::PixelType native() const override {
        return isColor() ? FNImageReference::BGRA32 : FNImageReference::MONO8;
    }
    FNImage<unsigned char> toMono8() const override;
    FNImage<unsigned short> toMono16() const override { return converted<unsigned short>(); }
    FNImage<float> toMonoFloat() const override { return converted<float>(); }
    FNImage<Fn::Bgra32> toBgra32() const override;
    FNImage<Fn::Rgb48> toRgb48() const override;
    /// Does nothing: an application's image is not sent anywhere.
    void serialize(std::list<Fn::Package>&) const override {}

private:
    FNImage<unsigned char> wrappedGray() const;
    FNImage<Fn::Bgra32> wrappedColor() const;
    template <class T> FNImage<T> converted() const;

    Image image_;
};

} // namespace Orbek

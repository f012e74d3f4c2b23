#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"

#include <mutex>

/// The representations behind FNImageReference. They are made by FNImageReferenceFactory.

/// Base of representations that keep attributes and a strategy of their own.
class AttributedImageRepresentation : public FNImageReference::Representation {
public:
    AttributedImageRepresentation(const FNImageAttributes& attributes,
                                  FNImageReference::SerializationStrategy strategy)
        : attributes_(attributes), strategy_(strategy) {}

    /// Appends the base's elements, the attributes (a list of keys and values alternating, in key order) and
    /// the strategy's name. @throws FNEBadArg if the strategy is unknown.
    void serialize(std::list<Fn::Package>& elements) const override;
    void setSerializationStrategy(FNImageReference::SerializationStrategy strategy) const override {
        strategy_ = strategy;
    }
    FNImageReference::SerializationStrategy getSerializationStrategy() const override { return strategy_; }
    const FNImageAttributes& attributes() const override { return attributes_; }
    FNImageAttributes& attributes() override { return attributes_; }

protected:
    explicit AttributedImageRepresentation(Fn::PackageReader& elements);

private:
    FNImageAttributes attributes_;
    mutable FNImageReference::SerializationStrategy strategy_;
};

/// Pixels of one type.
template <class T> class ImageRepresentation final : public AttributedImageRepresentation {
public:
    ImageRepresentation(const FNImage<T>& image, const FNImageAttributes& attributes,
                        FNImageReference::SerializationStrategy strategy)
        : AttributedImageRepresentation(attributes, strategy), image_(image) {}
    /// Reads the elements behind the type's name.
    explicit ImageRepresentation(Fn::PackageReader& elements);

    std::uint32_t w() const override { return image_.w(); }
    std::uint32_t h() const override { return image_.h(); }
    void serialize(std::list<Fn::Package>& elements) const override;
    FNImage<unsigned char> toMono8() const override;
    FNImage<unsigned short> toMono16() const override;
    FNImage<float> toMonoFloat() const override;
    FNImage<Fn::Bgra32> toBgra32() const override;
    FNImage<Fn::Rgb48> toRgb48() const override;
    bool isColor() const override;
    FNImageReference::PixelType native() const override;

private:
    FNImage<T> image_;
};

/// The bytes of an image file, decoded at the first need of pixels.
class CompressedImgRepresentation final : public AttributedImageRepresentation {
public:
    CompressedImgRepresentation(const FNRMem<unsigned char>& file, const FNImageAttributes& attributes,
                                const Fn::ImageLimits& limits)
        : AttributedImageRepresentation(attributes, FNImageReference::UNCOMPRESSED_RAW), file_(file),
          limits_(limits) {}
    /// Reads the elements behind the type's name. @throws FNEGeneric if the last is not exactly one block.
    explicit CompressedImgRepresentation(Fn::PackageReader& elements);

    std::uint32_t w() const override { return decoded().w(); }
    std::uint32_t h() const override { return decoded().h(); }
    /// Writes the file's bytes as they are, whatever the strategy.
    void serialize(std::list<Fn::Package>& elements) const override;
    FNImage<unsigned char> toMono8() const override { return decoded().toMono8(); }
    FNImage<unsigned short> toMono16() const override { return decoded().toMono16(); }
    FNImage<float> toMonoFloat() const override { return decoded().toMonoFloat(); }
    FNImage<Fn::Bgra32> toBgra32() const override { return decoded().toBgra32(); }
    FNImage<Fn::Rgb48> toRgb48() const override { return decoded().toRgb48(); }
    bool isColor() const override { return decoded().isColor(); }
    FNImageReference::PixelType native() const override { return decoded().native(); }

private:
    const FNImageReference& decoded() const;

    FNRMem<unsigned char> file_;
    Fn::ImageLimits limits_;
    mutable std::mutex mutex_; ///< guards the next one's change from unset to set
    mutable Fn::Optional<FNImageReference> decoded_;
};

/// The representation that a package holds. @throws as the constructor of FNImageReference.
FNCountedPtr<FNImageReference::Representation> readRepresentation(const Fn::Package& package);

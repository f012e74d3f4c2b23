#pragma once

#include "fn/image.h"
#include "fn/image_attributes.h"

namespace Fn {
struct ImageLimits;
}

/// A counted handle of an image of any pixel type. Finders and analysers take one and ask it for the pixel
/// type that they work on:
///
///     FNImageReference image = Fn::readImage("portrait.jpg");
///     FNImage<unsigned short> gray = image.toMono16();
///
/// Copies share the image, its attributes and its strategy. Any number of threads may convert at the same
/// time; changing the attributes or the strategy is not synchronised.
class FNImageReference {
public:
    /// How serialize() writes the pixels.
    enum SerializationStrategy : int { UNCOMPRESSED_RAW = 0, COMPRESSED_PNG = 1, COMPRESSED_JPEGLS = 2 };

    /// The stored pixel type.
    enum PixelType : int { MONO8 = 0, MONO16 = 1, MONO_FLOAT = 2, BGRA32 = 3, RGB48 = 4 };

    /// What a handle refers to. To derive another one, see AttributedImageRepresentation.
    class Representation {
    public:
        Representation() = default;
        Representation(const Representation&) = delete;
        Representation& operator=(const Representation&) = delete;
        virtual ~Representation() = default;

        virtual std::uint32_t w() const = 0;
        virtual std::uint32_t h() const = 0;
        /// Appends the elements of the packed form. This one writes the two reserved elements, which the
        /// library itself never fills.
        virtual void serialize(std::list<Fn::Package>& elements) const;
        /// For the next serialize().
        virtual void setSerializationStrategy(SerializationStrategy strategy) const = 0;
        virtual SerializationStrategy getSerializationStrategy() const = 0;
        virtual FNImage<unsigned char> toMono8() const = 0;
        virtual FNImage<unsigned short> toMono16() const = 0;
        virtual FNImage<float> toMonoFloat() const = 0;
        virtual FNImage<Fn::Bgra32> toBgra32() const = 0;
        virtual FNImage<Fn::Rgb48> toRgb48() const = 0;
        virtual const FNImageAttributes& attributes() const = 0;
        virtual FNImageAttributes& attributes() = 0;
        /// Whether native() is a colour type.
        virtual bool isColor() const = 0;
        virtual PixelType native() const = 0;

    protected:
        /// Reads what serialize() has appended.
        explicit Representation(Fn::PackageReader& elements);

    private:
        Fn::Optional<unsigned int> reservedNumber_;
        Fn::Optional<Fn::TimeStamp> reservedTime_;
    };

    /// A gray image of one black pixel.
    FNImageReference();
    explicit FNImageReference(const FNCountedPtr<Representation>& representation)
        : representation_(representation) {}
    /// Reads what serialize() has written, or an older form of it.
    /// @throws FNEBadFormat for an unknown pixel type or strategy; FNEBadArg or FNEGeneric for a package of
    /// another shape; what the reader of the compressed form throws.
    explicit FNImageReference(const Fn::Package& package);

    /// A list of the type's name, two reserved elements, the attributes, the strategy's name and the pixels.
    /// @throws FNEBadArg if the strategy is unknown.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    std::uint32_t w() const { return representation_->w(); }
    std::uint32_t h() const { return representation_->h(); }
    FNBox box() const;
    void setSerializationStrategy(SerializationStrategy strategy) const {
        representation_->setSerializationStrategy(strategy);
    }
    SerializationStrategy getSerializationStrategy() const {
        return representation_->getSerializationStrategy();
    }

    /// The image in one pixel type; shares the pixels if it is the stored one. See image_conversion.h.
    FNImage<unsigned char> toMono8() const { return representation_->toMono8(); }
    FNImage<unsigned short> toMono16() const { return representation_->toMono16(); }
    FNImage<float> toMonoFloat() const { return representation_->toMonoFloat(); }
    FNImage<Fn::Bgra32> toBgra32() const { return representation_->toBgra32(); }
    FNImage<Fn::Rgb48> toRgb48() const { return representation_->toRgb48(); }
    /// The same by pixel type.
    template <class T> FNImage<T> to() const;

    const FNImageAttributes& attributes() const { return representation().attributes(); }
    FNImageAttributes& attributes() { return representation_->attributes(); }
    bool isColor() const { return representation_->isColor(); }
    PixelType native() const { return representation_->native(); }

    const Representation& representation() const { return *representation_; }

private:
    FNCountedPtr<Representation> representation_;
};

template <> inline FNImage<unsigned char> FNImageReference::to() const {
    return toMono8();
}
template <> inline FNImage<unsigned short> FNImageReference::to() const {
    return toMono16();
}
template <> inline FNImage<float> FNImageReference::to() const {
    return toMonoFloat();
}
template <> inline FNImage<Fn::Bgra32> FNImageReference::to() const {
    return toBgra32();
}
template <> inline FNImage<Fn::Rgb48> FNImageReference::to() const {
    return toRgb48();
}

/// Makes references.
class FNImageReferenceFactory {
public:
    using Strategy = FNImageReference::SerializationStrategy;

    /// Wraps an image of one of the five pixel types, sharing its pixels.
    template <class T>
    static FNImageReference create(const FNImage<T>& image, const FNImageAttributes& attributes = {},
                                   Strategy strategy = FNImageReference::UNCOMPRESSED_RAW);

    /// Wraps the bytes of an image file, which are decoded when pixels are first asked for; the decoded image
    /// is then kept beside them. Conversions throw what Fn::readImage() throws.
    static FNImageReference createCompressed(const FNRMem<unsigned char>& file,
                                             const FNImageAttributes& attributes = {});
    static FNImageReference createCompressed(const FNRMem<unsigned char>& file,
                                             const FNImageAttributes& attributes,
                                             const Fn::ImageLimits& limits);

    static FNImageReference create(const Fn::Package& package) { return FNImageReference(package); }

    /// The same pixels, shared, with attributes and a strategy that can be changed on their own.
    static FNImageReference duplicate(const FNImageReference& image);
};

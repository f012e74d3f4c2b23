#include "fn/image_representation.h"

#include "fn/image_conversion.h"
#include "fn/image_package.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpegls.h"
#include "fn/imagefile/png.h"

#include <array>
#include <sstream>

namespace {

using Reference = FNImageReference;

constexpr int pngLevel = 6;
constexpr const char* compressedName = "compresssed"; // as it is written since the first version

template <class T> struct Traits;
template <> struct Traits<unsigned char> {
    static constexpr const char* name = "mono8";
    static constexpr auto type = Reference::MONO8;
};
template <> struct Traits<unsigned short> {
    static constexpr const char* name = "mono16";
    static constexpr auto type = Reference::MONO16;
};
template <> struct Traits<float> {
    static constexpr const char* name = "monoFloat";
    static constexpr auto type = Reference::MONO_FLOAT;
};
template <> struct Traits<Fn::Bgra32> {
    static constexpr const char* name = "bgra32";
    static constexpr auto type = Reference::BGRA32;
};
template <> struct Traits<Fn::Rgb48> {
    static constexpr const char* name = "rgb48";
    static constexpr auto type = Reference::RGB48;
};

struct Marker {
    const char* name;
    Reference::SerializationStrategy strategy;
};
/// The first three are written, the others only read.
constexpr std::array markers{Marker{"UNCOMPRESSED_RAW", Reference::UNCOMPRESSED_RAW},
                             Marker{"COMPRESSED_PNG", Reference::COMPRESSED_PNG},
                             Marker{"COMPRESSED_JPEGLS", Reference::COMPRESSED_JPEGLS},
                             Marker{"NATIVE", Reference::UNCOMPRESSED_RAW},
                             Marker{"LOSSLESS_COMPRESSED", Reference::COMPRESSED_PNG}};

std::string markerOf(Reference::SerializationStrategy strategy) {
    for (const Marker& marker : markers)
        if (marker.strategy == strategy) return marker.name;
    FN_THROW(FNEBadArg, "FNImageReference: Cannot serialize -- unknown image serialization format (" +
                            std::to_string(strategy) + ")");
}

Reference::SerializationStrategy strategyOf(const std::string& name) {
    for (const Marker& marker : markers)
        if (marker.name == name) return marker.strategy;
    FN_THROW(FNEBadFormat, "FNImageReference: de-serialized invalid image serialization format marker");
}

Fn::Package packedBlock(const FNRMem<unsigned char>& block) {
    return Fn::Package(std::list{block});
}

template <class T> FNRMem<unsigned char> pngFile(const FNImage<T>& image) {
    std::ostringstream stream;
    Fn::writePng(image, stream, pngLevel);
    const std::string bytes = std::move(stream).str();
    FNRMem<unsigned char> block(bytes.size());
    std::copy(bytes.begin(), bytes.end(), block.getExclusive());
    return block;
}

/// The image in a compressed payload.
FNImageReference decodedPayload(const Fn::Package& payload, Reference::SerializationStrategy strategy) {
    if (payload.cores().size() != 1)
        FN_THROW(FNEBadArg, "FNImageReference: error de-serializing " + markerOf(strategy));
    const FNRMem<unsigned char>& block = payload.cores().front();
    const char* const bytes = reinterpret_cast<const char*>(block.data());
    return strategy == Reference::COMPRESSED_PNG ? Fn::readPng(bytes, block.size())
                                                 : Fn::readJpegLS(bytes, block.size());
}

template <class T>
FNImage<T> unpackedPixels(const Fn::Package& payload, Reference::SerializationStrategy strategy) {
    switch (strategy) {
    case Reference::UNCOMPRESSED_RAW:
        return Fn::deSerialize<FNImage<T>>(payload);
    case Reference::COMPRESSED_PNG:
    case Reference::COMPRESSED_JPEGLS:
        return decodedPayload(payload, strategy).to<T>();
    }
    FN_THROW(FNEBadFormat,
             "FNImageReference: de-serialization error -- unknown image serialization format (" +
                 std::to_string(strategy) + ")");
}

template <class Representation> FNCountedPtr<Reference::Representation> readAs(Fn::PackageReader& elements) {
    return FNCountedPtr<Reference::Representation>(new Representation(elements));
}

struct Reader {
    const char* name;
    FNCountedPtr<Reference::Representation> (*read)(Fn::PackageReader& elements);
};
template <class T> constexpr Reader readerOf{Traits<T>::name, readAs<ImageRepresentation<T>>};
constexpr std::array readers{
    readerOf<unsigned char>, readerOf<unsigned short>,
    readerOf<float>,         readerOf<Fn::Bgra32>,
    readerOf<Fn::Rgb48>,     Reader{compressedName, readAs<CompressedImgRepresentation>}};

} // namespace

// ---- attributes and strategy

AttributedImageRepresentation::AttributedImageRepresentation(Fn::PackageReader& elements)
    : Representation(elements), attributes_(elements.next<FNImageAttributes>()),
      strategy_(strategyOf(elements.next<std::string>())) {}

void AttributedImageRepresentation::serialize(std::list<Fn::Package>& elements) const {
    Representation::serialize(elements);
    elements.push_back(Fn::serialize(attributes_));
    elements.push_back(Fn::serialize(markerOf(strategy_)));
}

// ---- pixels

template <class T>
ImageRepresentation<T>::ImageRepresentation(Fn::PackageReader& elements)
    : AttributedImageRepresentation(elements),
      image_(unpackedPixels<T>(elements.next<Fn::Package>(), getSerializationStrategy())) {}

template <class T> void ImageRepresentation<T>::serialize(std::list<Fn::Package>& elements) const {
    elements.push_back(Fn::serialize<std::string>(Traits<T>::name));
    AttributedImageRepresentation::serialize(elements);
    switch (getSerializationStrategy()) {
    case Reference::UNCOMPRESSED_RAW:
        return elements.push_back(Fn::serialize(image_));
    case Reference::COMPRESSED_PNG:
        return elements.push_back(packedBlock(pngFile(image_)));
    case Reference::COMPRESSED_JPEGLS:
        return elements.push_back(packedBlock(Fn::writeJpegLS(FNImageReferenceFactory::create(image_))));
    }
}

template <class T> FNImage<unsigned char> ImageRepresentation<T>::toMono8() const {
    return Fn::convertImage<unsigned char>(image_);
}

template <class T> FNImage<unsigned short> ImageRepresentation<T>::toMono16() const {
    return Fn::convertImage<unsigned short>(image_);
}

template <class T> FNImage<float> ImageRepresentation<T>::toMonoFloat() const {
    return Fn::convertImage<float>(image_);
}

template <class T> FNImage<Fn::Bgra32> ImageRepresentation<T>::toBgra32() const {
    return Fn::convertImage<Fn::Bgra32>(image_);
}

template <class T> FNImage<Fn::Rgb48> ImageRepresentation<T>::toRgb48() const {
    return Fn::convertImage<Fn::Rgb48>(image_);
}

template <class T> bool ImageRepresentation<T>::isColor() const {
    return Fn::isColorPixel<T>;
}

template <class T> FNImageReference::PixelType ImageRepresentation<T>::native() const {
    return Traits<T>::type;
}

// ---- files

CompressedImgRepresentation::CompressedImgRepresentation(Fn::PackageReader& elements)
    : AttributedImageRepresentation(elements) {
    const auto payload = elements.next<Fn::Package>();
    if (payload.cores().size() != 1)
        FN_THROW(FNEGeneric, "CompressedImgRepresentation: Illegal package format");
    file_ = payload.cores().front();
}

void CompressedImgRepresentation::serialize(std::list<Fn::Package>& elements) const {
    elements.push_back(Fn::serialize<std::string>(compressedName));
    AttributedImageRepresentation::serialize(elements);
    elements.push_back(packedBlock(file_));
}

const FNImageReference& CompressedImgRepresentation::decoded() const {
    const std::lock_guard lock(mutex_);
    if (!decoded_.isSet())
        decoded_ = Fn::readImage(reinterpret_cast<const char*>(file_.data()), file_.size(), {}, limits_);
    return *decoded_; // stays where it is from now on
}

// ---- making them

template <class T>
FNImageReference FNImageReferenceFactory::create(const FNImage<T>& image, const FNImageAttributes& attributes,
                                                 Strategy strategy) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(
        new ImageRepresentation<T>(image, attributes, strategy)));
}

template FNImageReference FNImageReferenceFactory::create(const FNImage<unsigned char>&,
                                                          const FNImageAttributes&, Strategy);
template FNImageReference FNImageReferenceFactory::create(const FNImage<unsigned short>&,
                                                          const FNImageAttributes&, Strategy);
template FNImageReference FNImageReferenceFactory::create(const FNImage<float>&, const FNImageAttributes&,
                                                          Strategy);
template FNImageReference FNImageReferenceFactory::create(const FNImage<Fn::Bgra32>&,
                                                          const FNImageAttributes&, Strategy);
template FNImageReference FNImageReferenceFactory::create(const FNImage<Fn::Rgb48>&, const FNImageAttributes&,
                                                          Strategy);

FNImageReference FNImageReferenceFactory::duplicate(const FNImageReference& image) {
    const auto of = [&](const auto& pixels) {
        return create(pixels, image.attributes(), image.getSerializationStrategy());
    };
    switch (image.native()) {
    case FNImageReference::MONO8:
        return of(image.toMono8());
    case FNImageReference::MONO16:
        return of(image.toMono16());
    case FNImageReference::MONO_FLOAT:
        return of(image.toMonoFloat());
    case FNImageReference::RGB48:
        return of(image.toRgb48());
    case FNImageReference::BGRA32:
        break;
    }
    return of(image.toBgra32());
}

FNImageReference FNImageReferenceFactory::createCompressed(const FNRMem<unsigned char>& file,
                                                           const FNImageAttributes& attributes) {
    return createCompressed(file, attributes, Fn::ImageLimits());
}

FNImageReference FNImageReferenceFactory::createCompressed(const FNRMem<unsigned char>& file,
                                                           const FNImageAttributes& attributes,
                                                           const Fn::ImageLimits& limits) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(
        new CompressedImgRepresentation(file, attributes, limits)));
}

FNCountedPtr<FNImageReference::Representation> readRepresentation(const Fn::Package& package) {
    Fn::PackageReader elements(package);
    const auto name = elements.next<std::string>();
    for (const Reader& reader : readers)
        if (name == reader.name) return reader.read(elements);
    FN_THROW(FNEBadFormat, "Unknown image type!");
}

#include "kx/cbeff.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpeg.h"

#include <array>
#include <cmath>
#include <vector>

namespace Kx::CBEFF {

namespace {

constexpr unsigned int formatOwner = 0x0101, formatType = 0x0501;
constexpr std::array<unsigned char, 8> identifierAndVersion{'F', 'A', 'C', 0, '0', '1', '0', 0};

constexpr std::size_t cbeffHeaderSize = 4, recordHeaderSize = 16, facialInformationSize = 20,
                      featurePointSize = 8, imageInformationSize = 12;

/// Types of face images. All but token images tell where the eyes are.
constexpr unsigned char tokenFrontal = 3, lastType = 4;

constexpr unsigned char pointType = 1;
/// Codes of feature points: 12.1 and 12.2, four bits for each number.
constexpr unsigned char leftEyeCode = 0xC1, rightEyeCode = 0xC2;

constexpr int quality = 100;

/// The bytes of one header.
class Fields {
public:
    explicit Fields(std::size_t size) { bytes_.reserve(size); }

    Fields& add(std::uint64_t value, int width) {
        for (int shift = 8 * (width - 1); shift >= 0; shift -= 8)
            bytes_.push_back(static_cast<unsigned char>(value >> shift));
        return *this;
    }
    Fields& addZeros(std::size_t n) {
        bytes_.insert(bytes_.end(), n, 0);
        return *this;
    }
    Fields& add(std::span<const unsigned char> bytes) {
        bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
        return *this;
    }
    void write(std::ostream& stream, const char* failure) const { Fn::writeBytes(stream, bytes_, failure); }

private:
    std::vector<unsigned char> bytes_;
};

template <std::size_t size> class StoredFields {
public:
    /// @param name begins the text of a failure
    StoredFields(std::istream& stream, const char* name) {
        stream.read(reinterpret_cast<char*>(bytes_.data()), size);
        if (stream.gcount() != static_cast<std::streamsize>(size))
            FN_THROW(FNEOutOfRange, std::string(name) + " with wrong size.");
    }

    unsigned char byte(std::size_t offset) const { return bytes_[offset]; }
    std::uint32_t uint16(std::size_t offset) const {
        return std::uint32_t{bytes_[offset]} << 8 | bytes_[offset + 1];
    }
    std::uint32_t uint32(std::size_t offset) const { return uint16(offset) << 16 | uint16(offset + 2); }

private:
    std::array<unsigned char, size> bytes_;
};

struct EyePair {
    FNPos left, right;
};

/// Where the eyes lie in a token image of that width.
EyePair tokenEyes(std::uint32_t width) {
    const double w = width;
    const auto y = static_cast<float>(std::trunc(0.6 * w) + 0.5);
    const auto x = [&](double share) { return static_cast<float>(std::trunc(share * w - 1) + 0.5); };
    return {{x(0.375), y}, {x(0.625), y}};
}

/// Skips all feature points but those of the eyes; an eye without one lies in the corner.
EyePair readFeaturePoints(std::istream& stream, std::uint32_t count) {
    EyePair eyes;
    for (; count > 0; --count) {
        const StoredFields<featurePointSize> point(stream, "CBEFF FeaturePoint");
        if (point.byte(0) != pointType) continue;
        const FNPos middle(static_cast<float>(point.uint16(2)) + 0.5f,
                           static_cast<float>(point.uint16(4)) + 0.5f);
        if (point.byte(1) == leftEyeCode) eyes.left = middle;
        if (point.byte(1) == rightEyeCode) eyes.right = middle;
    }
    if (eyes.right.x < eyes.left.x) std::swap(eyes.left, eyes.right);
    return eyes;
}

/// What the images of a record may have in pixels all together. It grows with the bytes that they are read
/// from, so that memory stays in proportion to the record however many images it announces.
class PixelBudget {
public:
    explicit PixelBudget(std::uint64_t first) : left_(first) {}
    /// Many more than a photo has for a byte of its file.
    void addFile(std::uint64_t bytes) { left_ += 32 * bytes; }
    std::uint64_t left() const { return left_; }
    void take(std::uint64_t pixels) { left_ -= pixels; }

private:
    std::uint64_t left_;
};

/// @param size bytes that the block's length leaves for the image; 0 if the length cannot be right
FNImageReference readImageData(std::istream& stream, std::uint32_t size, Fn::ImageLimits limits,
                               PixelBudget& budget) {
    const auto read = [&](std::istream& file) {
        limits.maxPixels = std::min(limits.maxPixels, budget.left());
        const FNImageReference image = Fn::readImage(file, {}, limits);
        budget.take(std::uint64_t{image.w()} * image.h());
        return image;
    };
    if (size == 0) return read(stream);
    // A reader of one image may look beyond its end, where the next block begins.
    const FNRMem<unsigned char> bytes = Fn::readUpTo(stream, size, "Kx::CBEFF::read");
    budget.addFile(bytes.size());
    Fn::MemoryStream file(bytes);
    return read(file);
}

Cmp::Face readFace(std::istream& stream, const Fn::ImageLimits& limits, PixelBudget& budget) {
    const StoredFields<facialInformationSize> information(stream, "CBEFF FacialInformation");
    const std::uint32_t blockLength = information.uint32(0), points = information.uint16(4);
    EyePair eyes = readFeaturePoints(stream, points);
    const StoredFields<imageInformationSize> image(stream, "CBEFF ImageInformation");
    const unsigned char type = image.byte(0);
    if (type > lastType) FN_THROW(FNEBadArg, "CBEFF read image with unknown type.");
    if (type == tokenFrontal) eyes = tokenEyes(image.uint16(2));
    FaceFinder::Location location;
    Cmp::eyesToFacePos(eyes.left, eyes.right, location.pos, location.rotationAngle, location.width);

    const std::uint32_t headers = static_cast<std::uint32_t>(facialInformationSize + imageInformationSize) +
                                  static_cast<std::uint32_t>(featurePointSize) * points;
    const bool credible = blockLength > headers && blockLength - headers <= limits.maxBytes;
    return Cmp::Face(readImageData(stream, credible ? blockLength - headers : 0, limits, budget), location);
}

} // namespace

namespace TokenFace {

void write(std::ostream& stream, std::list<Cmp::Face> const& faces) {
    constexpr std::uint64_t blockHeaders = facialInformationSize + imageInformationSize;
    constexpr std::size_t maxImages = 0xFFFF;
    constexpr std::uint64_t maxLength = 0xFFFFFFFF;
    if (faces.size() > maxImages) FN_THROW(FNEBadArg, "CBEFF: too many images for one record");
    std::list<FNRMem<unsigned char>> files;
    std::uint64_t length = recordHeaderSize;
    for (const Cmp::Face& face : faces) {
        files.push_back(Fn::writeJpeg(face.image(), quality));
        length += blockHeaders + files.back().size();
    }
    if (length > maxLength) FN_THROW(FNEBadArg, "CBEFF: too many bytes for one record");

    Fields(cbeffHeaderSize)
        .add(formatOwner, 2)
        .add(formatType, 2)
        .write(stream, "CBEFF: error writing CBEFF Header");
    Fields(recordHeaderSize)
        .add(identifierAndVersion)
        .add(length, 4)
        .add(faces.size(), 2)
        .addZeros(2)
        .write(stream, "CBEFF: error writing Facial Header");
    auto file = files.begin();
    for (const Cmp::Face& face : faces) {
        Fields(facialInformationSize)
            .add(blockHeaders + file->size(), 4)
            .addZeros(facialInformationSize - 4)
            .write(stream, "CBEFF: error writing Facial Information");
        Fields(imageInformationSize)
            .add(tokenFrontal, 1)
            .addZeros(1)
            .add(face.image().w(), 2)
            .add(face.image().h(), 2)
            .addZeros(6)
            .write(stream, "CBEFF: error writing ImageInformation");
        Fn::writeBytes(stream, file++->span(), "CBEFF: error writing ImageData");
    }
}

} // namespace TokenFace

std::list<Cmp::Face> read(std::istream& stream, const Fn::ImageLimits& limits) {
    const StoredFields<cbeffHeaderSize> header(stream, "CBEFFHeader");
    const StoredFields<recordHeaderSize> record(stream, "CBEFF FacialRecordHeader");
    PixelBudget budget(limits.maxPixels);
    std::list<Cmp::Face> faces;
    for (std::uint32_t count = record.uint16(12); count > 0; --count)
        faces.push_back(readFace(stream, limits, budget));
    return faces;
}

} // namespace Kx::CBEFF

#include "fn/imagefile/j2k.h"

#include "fn/byte_order.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/j2k_stream.h"
#include "fn/imagefile/sample_scale.h"

#include <array>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

constexpr std::size_t checkedBytes = 16;
constexpr std::array<unsigned char, 12> jp2Signature{0, 0, 0, 12, 'j', 'P', ' ', ' ', 0x0D, 0x0A, 0x87, 0x0A};
constexpr std::array<unsigned char, 4> codeStreamStart{0xFF, 0x4F, 0xFF, 0x51};

template <class Signature>
bool startsWith(const unsigned char* bytes, std::uint64_t size, const Signature& signature) {
    return size >= signature.size() && std::equal(signature.begin(), signature.end(), bytes);
}

enum class Container { None, Jp2, CodeStream };

Container containerOf(const unsigned char* bytes, std::uint64_t size) {
    if (startsWith(bytes, size, jp2Signature)) return Container::Jp2;
    return startsWith(bytes, size, codeStreamStart) ? Container::CodeStream : Container::None;
}

[[noreturn]] void refuseUndecodable(const std::string& why) {
    FN_THROW(FNEBadFormat, "Fn::readJ2k: Failed to decode JPEG2000 image from given stream." + why);
}

/// Offset of the code stream in a JP2 file, the file's size if there is none.
std::uint64_t findCodeStream(const FNRMem<unsigned char>& file) {
    constexpr std::uint32_t codeStreamBox = 0x6A703263; // "jp2c"
    for (std::uint64_t at = 0; file.size() - at >= 8;) {
        std::uint64_t length = loadUInt32(file.data() + at), head = 8;
        if (length == 1) {
            if (file.size() - at < 16) break;
            length =
                std::uint64_t{loadUInt32(file.data() + at + 8)} << 32 | loadUInt32(file.data() + at + 12);
            head = 16;
        }
        if (loadUInt32(file.data() + at + 4) == codeStreamBox) return at + head;
        if (length < head || length > file.size() - at) break;
        at += length;
    }
    return file.size();
}

/// Refuses sizes above the limits before the library sees them: it allocates for every tile and component
/// already while it reads the header.
void checkSizes(const FNRMem<unsigned char>& file, Container container, const ImageLimits& limits) {
    constexpr std::uint64_t needed = 4 + 2 + 2 + 8 * 4 + 2; // of the segment SIZ, to the number of components
    constexpr std::uint64_t maxTilesTimesComponents = 1u << 16;
    const std::uint64_t start = container == Container::Jp2 ? findCodeStream(file) : 0;
    if (file.size() - start < needed || !startsWith(file.data() + start, needed, codeStreamStart))
        refuseUndecodable("");
    const auto word = [&](int i) { return std::uint64_t{loadUInt32(file.data() + start + 8 + 4 * i)}; };
    const std::uint64_t right = word(0), bottom = word(1), left = word(2), top = word(3);
    const std::uint64_t tileWidth = word(4), tileHeight = word(5), tileLeft = word(6), tileTop = word(7);
    const std::uint64_t components = loadUInt32(file.data() + start + needed - 4) & 0xFFFF;
    if (left >= right || top >= bottom || tileWidth == 0 || tileHeight == 0 || tileLeft > left ||
        tileTop > top)
        refuseUndecodable("");

    // For each sample an integer in the tile and one in the image.
    limits.check(right - left, bottom - top, 2 * sizeof(OPJ_INT32) * components, "Fn::readJ2k");
    const auto tiles = [](std::uint64_t from, std::uint64_t to, std::uint64_t size) {
        return (to - from + size - 1) / size;
    };
    const std::uint64_t across = tiles(tileLeft, right, tileWidth), down = tiles(tileTop, bottom, tileHeight);
    if (across * down > maxTilesTimesComponents / std::max<std::uint64_t>(components, 1))
        refuseUndecodable(" Too many tiles.");
}

/// Decodes one file. The library knows the colour space only behind the pixels.
class Decoder {
public:
    Decoder(const FNRMem<unsigned char>& file, Container container)
        : codec_(opj_create_decompress(container == Container::Jp2 ? OPJ_CODEC_JP2 : OPJ_CODEC_J2K)),
          input_(file) {
        if (!codec_) FN_THROW(FNESysError, "Fn::readJ2k: failed to open jasper stream from std::iostream.");
        report_.listenTo(codec_.get());
        opj_dparameters_t parameters;
        opj_set_default_decoder_parameters(&parameters);
        opj_image_t* image = nullptr;
        bool good = opj_setup_decoder(codec_.get(), &parameters) &&
                    opj_read_header(input_.stream(), codec_.get(), &image);
        image_.reset(image);
        good = good && opj_decode(codec_.get(), input_.stream(), image) &&
               opj_end_decompress(codec_.get(), input_.stream());
        if (!good) refuseUndecodable(report_.text);
        for (OPJ_UINT32 i = 0; i < image_->numcomps; ++i)
            if (!image_->comps[i].data) refuseUndecodable(" A component has no data.");
    }

    const opj_image_t& image() const { return *image_; }

private:
    J2k::Report report_;
    J2k::Codec codec_;
    J2k::Input input_;
    J2k::Image image_;
};

/// The colour space's family by its mode; Unknown if it cannot be read.
Mode familyOf(const opj_image_t& image) {
    switch (image.color_space) {
    case OPJ_CLRSPC_SRGB:
        return Mode::Rgb;
    case OPJ_CLRSPC_GRAY:
        return Mode::Intensity;
    case OPJ_CLRSPC_SYCC:
        return Mode::YCbCr;
    case OPJ_CLRSPC_UNSPECIFIED:
        return image.numcomps >= 3 ? Mode::Rgb : Mode::Intensity; // a bare code stream
    case OPJ_CLRSPC_UNKNOWN:
        break;
    default:
        return Mode::Unknown;
    }
    // An ICC profile names the colour space of its data at offset 16.
    if (image.icc_profile_buf && image.icc_profile_len >= 20) {
        const std::string space(reinterpret_cast<const char*>(image.icc_profile_buf) + 16, 4);
        if (space == "RGB ") return Mode::Rgb;
        if (space == "GRAY") return Mode::Intensity;
    }
    return Mode::Unknown;
}

/// One component, with samples brought to 0..255 or 0..65535.
class Channel {
public:
    Channel(const opj_image_comp_t& component, std::uint32_t greatest)
        : component_(component), stored_(greatestSample(std::clamp(component.prec, 1u, 31u))),
          greatest_(greatest) {}

    std::uint32_t at(std::uint32_t x, std::uint32_t y) const {
        std::int64_t v = component_.data[std::uint64_t{y} * component_.w + x];
        if (component_.sgnd) v += std::int64_t{stored_} / 2 + 1;
        return scaleSample(static_cast<std::uint32_t>(std::clamp<std::int64_t>(v, 0, stored_)), stored_,
                           greatest_);
    }
    /// At a position of the full image, for a component that may be subsampled.
    std::uint32_t atFull(std::uint32_t x, std::uint32_t y) const {
        return at(std::min(x / component_.dx, component_.w - 1),
                  std::min(y / component_.dy, component_.h - 1));
    }
    std::uint32_t w() const { return component_.w; }
    std::uint32_t h() const { return component_.h; }
    bool sameGeometry(const Channel& other) const {
        const opj_image_comp_t &a = component_, &b = other.component_;
        return a.w == b.w && a.h == b.h && a.dx == b.dx && a.dy == b.dy && a.x0 == b.x0 && a.y0 == b.y0;
    }

private:
    const opj_image_comp_t& component_;
    std::uint32_t stored_;
    std::uint32_t greatest_;
};

/// The components that are no alpha.
std::vector<const opj_image_comp_t*> colorComponents(const opj_image_t& image) {
    std::vector<const opj_image_comp_t*> components;
    for (OPJ_UINT32 i = 0; i < image.numcomps; ++i)
        if (!image.comps[i].alpha) components.push_back(&image.comps[i]);
    return components;
}

template <class T> FNImage<T> grayImage(const opj_image_comp_t& component) {
    const Channel channel(component, std::numeric_limits<T>::max());
    FNImage<T> image(channel.w(), channel.h());
    T* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x) *out++ = static_cast<T>(channel.at(x, y));
    return image;
}

/// From full-range YCbCr (IEC 61966-2-1, sYCC), `greatest` standing for 1.
template <class Color, class Sample>
Color fromYCbCr(std::uint32_t luma, std::uint32_t cb, std::uint32_t cr, std::uint32_t greatest) {
    const double y = luma, b = cb - (greatest + 1) / 2.0, r = cr - (greatest + 1) / 2.0;
    const auto sample = [greatest](double v) {
        return static_cast<Sample>(std::clamp(v + 0.5, 0.0, static_cast<double>(greatest)));
    };
    return Color(sample(y + 1.402 * r), sample(y - 0.344136 * b - 0.714136 * r), sample(y + 1.772 * b));
}

template <class Color, class Sample>
FNImage<Color> colorImage(const std::vector<const opj_image_comp_t*>& components, bool yCbCr) {
    constexpr std::uint32_t greatest = std::numeric_limits<Sample>::max();
    const Channel first(*components[0], greatest), second(*components[1], greatest),
        third(*components[2], greatest);
    if (!yCbCr && (!first.sameGeometry(second) || !first.sameGeometry(third)))
        FN_THROW(FNEBadFormat, "Fn::readJ2k: irregular channel geometry not supported");
    FNImage<Color> image(first.w(), first.h());
    Color* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x)
            *out++ = yCbCr ? fromYCbCr<Color, Sample>(first.at(x, y), second.atFull(x, y), third.atFull(x, y),
                                                      greatest)
                           : Color(static_cast<Sample>(first.at(x, y)), static_cast<Sample>(second.at(x, y)),
                                   static_cast<Sample>(third.at(x, y)));
    return image;
}

FNImageReference toReference(const opj_image_t& image, Mode family) {
    const auto components = colorComponents(image);
    const auto deep = [&](std::size_t count) {
        return std::any_of(components.begin(), components.begin() + static_cast<std::ptrdiff_t>(count),
                           [](const opj_image_comp_t* component) { return component->prec > 8; });
    };
    switch (family) {
    case Mode::Intensity:
        if (components.empty())
            FN_THROW(FNEBadFormat, "Fn::readJ2k: Missing intensity component for gray scaled image.");
        return deep(1) ? FNImageReferenceFactory::create(grayImage<unsigned short>(*components[0]))
                       : FNImageReferenceFactory::create(grayImage<unsigned char>(*components[0]));
    case Mode::Rgb:
    case Mode::YCbCr:
        if (components.size() < 3) FN_THROW(FNEBadFormat, "Fn::readJ2k: Missing image channel");
        return deep(3) ? FNImageReferenceFactory::create(
                             colorImage<Rgb48, unsigned short>(components, family == Mode::YCbCr))
                       : FNImageReferenceFactory::create(
                             colorImage<Bgra32, unsigned char>(components, family == Mode::YCbCr));
    default:
        FN_THROW(FNEBadFormat, "Fn::readJ2k: colorspace model is not supported");
    }
}

} // namespace

bool checkIfIsJ2k(const char* data, unsigned long size) {
    return containerOf(reinterpret_cast<const unsigned char*>(data), size) != Container::None;
}

bool checkIfIsJ2k(std::istream& stream) {
    const std::string bytes = peekBytes(stream, checkedBytes, "Fn::checkIfIsJ2k");
    return checkIfIsJ2k(bytes.data(), bytes.size());
}

bool checkIfIsJ2k(const std::string& fileName) {
    std::ifstream file = openForReading(fileName);
    return checkIfIsJ2k(file);
}

FNImageReference readJ2k(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    const FNRMem<unsigned char> file = readRest(stream, limits.maxBytes, "Fn::readJ2k");
    const Container container = containerOf(file.data(), file.size());
    if (container == Container::None)
        FN_THROW(FNEBadFormat, "Fn::readJ2k: stream does not refer to a known JPEG2000 image format.");
    checkSizes(file, container, limits.beside(file.size()));
    const Decoder decoder(file, container);
    const opj_image_t& image = decoder.image();
    const Mode family = familyOf(image);
    unsigned int depth = 0;
    for (OPJ_UINT32 i = 0; i < image.numcomps; ++i) depth += image.comps[i].prec;
    feedback.compressionMode(family);
    feedback.pixelDepth(depth);
    return toReference(image, family);
}

FNImageReference loadJ2k(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName);
    return readJ2k(file, feedback, limits);
}

FNImageReference loadJ2k(const char* data, unsigned long size, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    MemoryStream stream(data, size);
    return readJ2k(stream, feedback, limits);
}

} // namespace Fn

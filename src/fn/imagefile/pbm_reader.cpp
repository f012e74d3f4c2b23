#include "fn/imagefile/pbm.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/attribute_text.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/sample_scale.h"

#include <charconv>
#include <vector>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

constexpr int noByte = std::char_traits<char>::eof();

bool isBlank(int c) {
    return c == '\n' || c == ' ' || c == '\t' || c == '\r';
}

struct Header {
    bool color = false;
    std::uint32_t width = 0, height = 0, greatest = 0;
    std::string attributes;
};

class HeaderReader {
public:
    explicit HeaderReader(std::istream& stream) : stream_(stream) {}

    Header read() {
        readMagic();
        header_.width = readNumber();
        header_.height = readNumber();
        header_.greatest = readNumber();
        if (!isBlank(behindToken_)) FN_THROW(FNEBadFormat, "Invalid PGM: no whitespace after maxval");
        if (header_.width == 0 || header_.height == 0 || header_.greatest == 0 || header_.greatest > 65535)
            FN_THROW(FNEBadFormat, "Invalid PGM: width, height or maxval out of range");
        return header_;
    }

private:
    void readMagic() {
        char magic[2];
        if (!stream_.read(magic, 2)) FN_THROW(FNEIOError, "Reading PBM: can't read magic numbers");
        if (magic[0] != 'P' || (magic[1] != '5' && magic[1] != '6'))
            FN_THROW(FNEBadFormat, "Invalid PBM: wrong magic number");
        header_.color = magic[1] == '6';
    }

    std::uint32_t readNumber() {
        constexpr std::size_t longestToken = 127;
        int c = stream_.get();
        for (; isBlank(c) || c == '#'; c = stream_.get())
            if (c == '#') readComment();
        std::string token;
        for (; c != noByte && !isBlank(c); c = stream_.get()) {
            if (token.size() == longestToken)
                FN_THROW(FNEIOError, "Reading PBM: Sorry, line too long (larger lines not implemented)");
            token += static_cast<char>(c);
        }
        behindToken_ = c;
        std::uint32_t number = 0;
        if (std::from_chars(token.data(), token.data() + token.size(), number).ec != std::errc())
            FN_THROW(FNEBadFormat, "Invalid PGM: '" + token + "' is not a number");
        return number;
    }

    void readComment() {
        constexpr std::size_t longestComment = 1024;
        const std::string mark = " cache:";
        std::string comment;
        for (int c = stream_.get(); c != noByte && c != '\n'; c = stream_.get()) {
            if (comment.size() == longestComment)
                FN_THROW(FNEBadFormat, "Invalid PGM: comment longer than FN_MAX_PATH");
            comment += static_cast<char>(c);
        }
        if (comment.compare(0, mark.size(), mark) != 0) return;
        // Comments can follow each other without end.
        constexpr std::size_t longestText = 1u << 20;
        if (header_.attributes.size() > longestText)
            FN_THROW(FNEBadFormat, "Invalid PGM: too many attributes");
        header_.attributes += comment.substr(mark.size());
    }

    std::istream& stream_;
    Header header_;
    int behindToken_ = noByte;
};

template <class Pixel> struct Body { static constexpr const char* failure = nullptr; };
template <> struct Body<unsigned char> {
    static constexpr const char* failure = "Reading PBM: error reading mono8 body";
};
template <> struct Body<unsigned short> {
    static constexpr const char* failure = "Reading PBM: error reading mono16 body";
};
template <> struct Body<Bgra32> {
    static constexpr const char* failure = "Reading PBM: error reading bgra32 body";
};
template <> struct Body<Rgb48> {
    static constexpr const char* failure = "Reading PBM: error reading rgb48 body";
};

template <class Pixel>
FNImageReference readBody(std::istream& stream, const Header& header, const FNImageAttributes& attributes,
                          const ImageLimits& limits) {
    using Sample = typename SampleOf<Pixel>::Type;
    constexpr std::uint32_t full = std::numeric_limits<Sample>::max();
    constexpr std::size_t channels = isColorPixel<Pixel> ? 3 : 1;
    limits.check(header.width, header.height, sizeof(Pixel), "Fn::readPbm");

    FNImage<Pixel> image(header.width, header.height);
    const auto read = [&](void* to, std::uint64_t size) {
        if (!stream.read(static_cast<char*>(to), static_cast<std::streamsize>(size)))
            FN_THROW(FNEIOError, Body<Pixel>::failure);
    };
    Pixel* out = image.getExclusive();
    if (std::is_same_v<Pixel, unsigned char> && header.greatest == full) {
        read(out, image.size());
        return FNImageReferenceFactory::create(image, attributes);
    }
    std::vector<unsigned char> row(std::size_t{header.width} * channels * sizeof(Sample));
    const unsigned char* in = nullptr;
    const auto next = [&] {
        std::uint32_t sample = *in++;
        if constexpr (sizeof(Sample) == 2) sample = sample << 8 | *in++;
        return static_cast<Sample>(scaleSample(sample, header.greatest, full));
    };
    for (std::uint32_t y = 0; y < header.height; ++y) {
        read(row.data(), row.size());
        in = row.data();
        for (std::uint32_t x = 0; x < header.width; ++x) {
            if constexpr (isColorPixel<Pixel>) {
                const Sample red = next(), green = next(), blue = next();
                *out++ = Pixel(red, green, blue);
            } else {
                *out++ = next();
            }
        }
    }
    return FNImageReferenceFactory::create(image, attributes);
}

FNImageReference readWithHeader(std::istream& stream, const Header& header,
                                const ReadImagePropertiesFeedback& feedback, const ImageLimits& limits) {
    const FNImageAttributes attributes =
        header.attributes.empty() ? FNImageAttributes() : parseAttributes(header.attributes);
    const bool wide = header.greatest > 255;
    feedback.compressionMode(header.color ? Mode::Rgb : Mode::Intensity);
    feedback.pixelDepth((header.color ? 3 : 1) * (wide ? 16 : 8));
    const auto read = header.color ? wide ? readBody<Rgb48> : readBody<Bgra32>
                      : wide ? readBody<unsigned short>
                                   : readBody<unsigned char>;
    return read(stream, header, attributes, limits);
}

FNImageReference readOneKind(std::istream& stream, bool color, const ReadImagePropertiesFeedback& feedback,
                             const ImageLimits& limits) {
    const Header header = HeaderReader(stream).read();
    if (header.color != color) FN_THROW(FNEBadFormat, "Invalid PBM: wrong magic number");
    return readWithHeader(stream, header, feedback, limits);
}

} // namespace

bool checkIfIsPbm(std::istream& stream) {
    const std::string bytes = peekBytes(stream, 2, "Fn::checkIfIsPbm");
    return bytes == "P5" || bytes == "P6";
}

FNImageReference readPbm(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    return readWithHeader(stream, HeaderReader(stream).read(), feedback, limits);
}

FNImageReference readPgm(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    return readOneKind(stream, false, feedback, limits);
}

FNImageReference readPpm(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    return readOneKind(stream, true, feedback, limits);
}

} // namespace Fn

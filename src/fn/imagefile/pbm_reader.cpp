#include "fn/imagefile/pbm.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/attribute_text.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/sample_scale.h"

#include <algorithm>
#include <charconv>
#include <vector>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

constexpr int noByte = std::char_traits<char>::eof();

bool isBlank(int c) {
    return c == '\n' || c == ' ' || c == '\t' || c == '\r';
}

bool isDigit(int c) {
    return c >= '0' && c <= '9';
}

struct Header {
    bool color = false;
    bool plain = false;  ///< numbers as text
    bool bitmap = false; ///< a bit for each pixel, 1 for black
    std::uint32_t width = 0, height = 0, greatest = 0;
    std::string attributes;
};

class HeaderReader {
public:
    HeaderReader(std::istream& stream, const ImageLimits& limits)
        : stream_(stream), rareVariants_(limits.rareVariants) {}

    Header read() {
        readMagic();
        header_.width = readNumber();
        header_.height = readNumber();
        header_.greatest = header_.bitmap ? 1 : readNumber();
        if (!isBlank(behindToken_)) FN_THROW(FNEBadFormat, "Invalid PGM: no whitespace after maxval");
        if (header_.width == 0 || header_.height == 0 || header_.greatest == 0 || header_.greatest > 65535)
            FN_THROW(FNEBadFormat, "Invalid PGM: width, height or maxval out of range");
        return header_;
    }

private:
    void readMagic() {
        char magic[2];
        if (!stream_.read(magic, 2)) FN_THROW(FNEIOError, "Reading PBM: can't read magic numbers");
        const char kind = magic[1];
        if (magic[0] != 'P' || kind > '6' || kind < (rareVariants_ ? '1' : '5'))
            FN_THROW(FNEBadFormat, "Invalid PBM: wrong magic number");
        header_.color = kind == '3' || kind == '6';
        header_.plain = kind <= '3';
        header_.bitmap = kind == '1' || kind == '4';
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
    const bool rareVariants_;
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

/// The samples behind the header, one by one; each kind of file stores them in its own way.
class SampleReader {
public:
    SampleReader(std::istream& stream, const Header& header, std::size_t sampleBytes, const char* failure)
        : stream_(stream), header_(header), failure_(failure),
          row_(header.plain    ? 0
               : header.bitmap ? (std::size_t{header.width} + 7) / 8
                               : std::size_t{header.width} * (header.color ? 3 : 1) * sampleBytes),
          wide_(sampleBytes == 2) {}

    void beginRow() {
        if (!header_.plain &&
            !stream_.read(reinterpret_cast<char*>(row_.data()), static_cast<std::streamsize>(row_.size())))
            FN_THROW(FNEIOError, failure_);
        at_ = 0;
    }
    /// The next sample of the row, white being the greatest.
    std::uint32_t next() {
        if (header_.plain) return header_.bitmap ? 1 - bit() : number();
        if (header_.bitmap) {
            const std::size_t at = at_++;
            return (row_[at / 8] >> (7 - at % 8) & 1u) ^ 1u;
        }
        std::uint32_t sample = row_[at_++];
        if (wide_) sample = sample << 8 | row_[at_++];
        return sample;
    }

private:
    /// Behind blanks and comments.
    int firstOfToken() {
        for (;;) {
            int c = stream_.get();
            if (c != '#' && !isBlank(c)) return c;
            if (c == '#')
                while (c != '\n' && c != noByte) c = stream_.get();
        }
    }
    std::uint32_t bit() {
        const int c = firstOfToken();
        if (c != '0' && c != '1') FN_THROW(FNEIOError, failure_);
        return c == '1';
    }
    /// One that is too large for a sample counts as the greatest one.
    std::uint32_t number() {
        std::uint32_t value = 0;
        const auto append = [&](int c) {
            if (!isDigit(c)) FN_THROW(FNEIOError, failure_);
            value = std::min(10 * value + static_cast<std::uint32_t>(c - '0'), 65536u);
        };
        append(firstOfToken());
        int behind = stream_.peek(); // what ends the last number stays in the stream
        for (; behind != noByte && !isBlank(behind); behind = stream_.peek()) append(stream_.get());
        return value;
    }

    std::istream& stream_;
    const Header& header_;
    const char* const failure_;
    std::vector<unsigned char> row_;
    const bool wide_;
    std::size_t at_ = 0; ///< in the row: of the next byte, or bit
};

template <class Pixel>
FNImageReference readBody(std::istream& stream, const Header& header, const FNImageAttributes& attributes,
                          const ImageLimits& limits) {
    using Sample = typename SampleOf<Pixel>::Type;
    constexpr std::uint32_t full = std::numeric_limits<Sample>::max();
    limits.check(header.width, header.height, sizeof(Pixel), "Fn::readPbm");

    FNImage<Pixel> image(header.width, header.height);
    Pixel* out = image.getExclusive();
    if constexpr (std::is_same_v<Pixel, unsigned char>)
        if (header.greatest == full && !header.plain) {
            if (!stream.read(reinterpret_cast<char*>(out), static_cast<std::streamsize>(image.size())))
                FN_THROW(FNEIOError, Body<Pixel>::failure);
            return FNImageReferenceFactory::create(image, attributes);
        }
    SampleReader reader(stream, header, sizeof(Sample), Body<Pixel>::failure);
    const auto next = [&] { return static_cast<Sample>(scaleSample(reader.next(), header.greatest, full)); };
    for (std::uint32_t y = 0; y < header.height; ++y) {
        reader.beginRow();
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
    feedback.pixelDepth(header.bitmap ? 1 : (header.color ? 3 : 1) * (wide ? 16 : 8));
    const auto read = header.color ? wide ? readBody<Rgb48> : readBody<Bgra32>
                      : wide ? readBody<unsigned short>
                                   : readBody<unsigned char>;
    return read(stream, header, attributes, limits);
}

FNImageReference readOneKind(std::istream& stream, bool color, const ReadImagePropertiesFeedback& feedback,
                             const ImageLimits& limits) {
    const Header header = HeaderReader(stream, limits).read();
    if (header.color != color) FN_THROW(FNEBadFormat, "Invalid PBM: wrong magic number");
    return readWithHeader(stream, header, feedback, limits);
}

} // namespace

bool checkIfIsPbm(std::istream& stream) {
    const std::string bytes = peekBytes(stream, 2, "Fn::checkIfIsPbm");
    return bytes == "P5" || bytes == "P6";
}

bool isRarePbm(const std::string& start) {
    return start.size() == 2 && start[0] == 'P' && start[1] >= '1' && start[1] <= '4';
}

FNImageReference readPbm(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    return readWithHeader(stream, HeaderReader(stream, limits).read(), feedback, limits);
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

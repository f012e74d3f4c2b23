#include "fn/imagefile/tiff.h"

#include "fn/imagefile/byte_stream.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <vector>

#include <tiffio.h>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

/// A file in memory as libtiff reads it.
struct Source {
    FNRMem<unsigned char> bytes;
    std::uint64_t position = 0;
    std::string error; ///< the library's last one

    static tmsize_t read(thandle_t self, void* to, tmsize_t n) {
        auto& source = *static_cast<Source*>(self);
        if (n <= 0 || source.position >= source.bytes.size()) return 0;
        const std::uint64_t step =
            std::min<std::uint64_t>(static_cast<std::uint64_t>(n), source.bytes.size() - source.position);
        std::copy_n(source.bytes.data() + source.position, step, static_cast<unsigned char*>(to));
        source.position += step;
        return static_cast<tmsize_t>(step);
    }
    static tmsize_t write(thandle_t, void*, tmsize_t) { return 0; }
    static toff_t seek(thandle_t self, toff_t offset, int whence) {
        if (whence != SEEK_SET) return static_cast<toff_t>(-1); // is not asked for
        return static_cast<Source*>(self)->position = offset;   // a position behind the end reads nothing
    }
    static toff_t size(thandle_t self) { return static_cast<Source*>(self)->bytes.size(); }
    static int close(thandle_t) { return 0; }
    /// The bytes where they lie: without this, libtiff copies them, and 4.5.0 with Debian's corrections then
    /// takes no uncompressed tiles.
    static int map(thandle_t self, void** base, toff_t* size) {
        auto& source = *static_cast<Source*>(self);
        *base = const_cast<unsigned char*>(source.bytes.data()); // only ever read
        *size = source.bytes.size();
        return 1;
    }
    static void unmap(thandle_t, void*, toff_t) {}

    static int onError(TIFF*, void* self, const char*, const char* format, std::va_list arguments) {
        char text[200];
        std::vsnprintf(text, sizeof text, format, arguments);
        static_cast<Source*>(self)->error = text;
        return 1; // the process-wide handler is not called
    }
    static int onWarning(TIFF*, void*, const char*, const char*, std::va_list) { return 1; }
};

struct Close {
    void operator()(TIFF* tiff) const { TIFFClose(tiff); }
    void operator()(TIFFOpenOptions* options) const { TIFFOpenOptionsFree(options); }
};
using Tiff = std::unique_ptr<TIFF, Close>;

Tiff open(Source& source, const std::string& name, const ImageLimits& limits) {
    const std::unique_ptr<TIFFOpenOptions, Close> options(TIFFOpenOptionsAlloc());
    if (!options) throw std::bad_alloc();
    TIFFOpenOptionsSetMaxSingleMemAlloc(options.get(), static_cast<tmsize_t>(limits.maxBytes / 2));
    TIFFOpenOptionsSetErrorHandlerExtR(options.get(), Source::onError, &source);
    TIFFOpenOptionsSetWarningHandlerExtR(options.get(), Source::onWarning, &source);
    Tiff tiff(TIFFClientOpenExt(name.c_str(), "r", &source, Source::read, Source::write, Source::seek,
                                Source::close, Source::size, Source::map, Source::unmap, options.get()));
    if (!tiff) FN_THROW(FNEBadFormat, "Fn::readTiff(): stream might be not in TIFF format (" + name + ")");
    return tiff;
}

/// @param defaulted whether a tag that is missing has the format's own default, where there is one
template <class T> T tag(TIFF* tiff, std::uint32_t id, const char* failure, bool defaulted = false) {
    T value{};
    if (!(defaulted ? TIFFGetFieldDefaulted(tiff, id, &value) : TIFFGetField(tiff, id, &value)))
        FN_THROW(FNEBadFormat, failure);
    return value;
}

Mode modeOf(std::uint16_t photometric) {
    switch (photometric) {
    case PHOTOMETRIC_MINISWHITE:
    case PHOTOMETRIC_MINISBLACK:
        return Mode::Intensity;
    case PHOTOMETRIC_RGB:
        return Mode::Rgb;
    case PHOTOMETRIC_PALETTE:
        return Mode::Palette;
    case PHOTOMETRIC_MASK:
        return Mode::Mask;
    case PHOTOMETRIC_SEPARATED:
        return Mode::Separated;
    case PHOTOMETRIC_YCBCR:
        return Mode::YCbCr;
    case PHOTOMETRIC_CIELAB:
        return Mode::CieLab;
    case PHOTOMETRIC_ICCLAB:
        return Mode::IccLab;
    case PHOTOMETRIC_ITULAB:
        return Mode::ItuLab;
    case PHOTOMETRIC_LOGL:
        return Mode::LogL;
    case PHOTOMETRIC_LOGLUV:
        return Mode::LogLuv;
    default:
        return Mode::Unknown;
    }
}

/// What the tags of one image say.
struct Layout {
    std::uint32_t width, height;
    std::uint16_t bits, samples, photometric;

    /// @throws FNEBadFormat for a kind of file that is not read, but for its photometric interpretation.
    Layout(TIFF* tiff, bool defaulted)
        : width(tag<std::uint32_t>(tiff, TIFFTAG_IMAGEWIDTH, "Fn::readTiff: unable to get IMAGEWIDTH")),
          height(tag<std::uint32_t>(tiff, TIFFTAG_IMAGELENGTH, "Fn::readTiff: unable to get IMAGELENGTH")),
          bits(tag<std::uint16_t>(tiff, TIFFTAG_BITSPERSAMPLE, "Fn::readTiff: unable to get BITSPERSAMPLE",
                                  defaulted)),
          samples(tag<std::uint16_t>(tiff, TIFFTAG_SAMPLESPERPIXEL,
                                     "Fn::readTiff: unable to get SAMPLESPERPIXEL", defaulted)),
          photometric(
              tag<std::uint16_t>(tiff, TIFFTAG_PHOTOMETRIC, "Fn::readTiff: error getting photometric")) {}

    void check(TIFF* tiff) const {
        const auto refuse = [](const char* text) { FN_THROW(FNEBadFormat, text); };
        if (bits != 8 && bits != 16) refuse("Fn::readTiff: can only handle 8 bit or 16 bit images");
        if (samples != 1 && samples != 3 && samples != 4)
            refuse("Fn::readTiff: can only handle 1-channel gray scale or 3 or 4-channel color");
        checkFormat(tiff);
        const auto planes =
            tag<std::uint16_t>(tiff, TIFFTAG_PLANARCONFIG, "Fn::readTiff: unable to get PLANARCONFIG");
        if (planes != PLANARCONFIG_CONTIG) refuse("Fn::readTiff: can only handle contiguous tiff files.");
        if (TIFFIsTiled(tiff)) refuse("Fn::readTiff: unable to read tiled images");
    }

    void checkFormat(TIFF* tiff) const {
        std::uint16_t format = SAMPLEFORMAT_UINT;
        if (TIFFGetField(tiff, TIFFTAG_SAMPLEFORMAT, &format) && format != SAMPLEFORMAT_UINT)
            FN_THROW(FNEBadFormat, "Fn::readTiff: can only read images having sampleformat UINT");
    }

    /// Whether neither check() nor checkPhotometric() refuses it.
    bool isPlain(TIFF* tiff) const {
        try {
            check(tiff);
            checkPhotometric();
            return true;
        } catch (const FNEBadFormat&) {
            return false;
        }
    }

    void checkPhotometric() const {
        constexpr std::uint16_t depthMap = 32768; // a private value that libtiff does not name
        const auto refuse = [](const std::string& text) { FN_THROW(FNEBadFormat, "Fn::readTiff: " + text); };
        if (photometric == PHOTOMETRIC_PALETTE) refuse("PHOTOMETRIC_PALETTE is not implemented.");
        if (photometric == PHOTOMETRIC_MASK) refuse("PHOTOMETRIC_MASK is not implemented.");
        if (photometric == depthMap) refuse("PHOTOMETRIC_DEPTH is not implemented.");
        if (photometric != PHOTOMETRIC_MINISWHITE && photometric != PHOTOMETRIC_MINISBLACK &&
            photometric != PHOTOMETRIC_RGB)
            refuse("unknown photometric: " + std::to_string(photometric));
        if ((photometric == PHOTOMETRIC_RGB) != (samples >= 3))
            refuse("can only handle 1-channel gray scale or 3 or 4-channel color");
    }
};

template <class Sample, class Pixel> Pixel toPixel(const Sample* samples, const Layout& layout) {
    const Sample invert =
        layout.photometric == PHOTOMETRIC_MINISWHITE ? std::numeric_limits<Sample>::max() : 0;
    if constexpr (std::is_same_v<Pixel, Sample>) {
        return samples[0] ^ invert;
    } else {
        Pixel pixel(samples[0], samples[1], samples[2]);
        if constexpr (std::is_same_v<Pixel, Bgra32>)
            if (layout.samples == 4) pixel.a = samples[3];
        return pixel;
    }
}

template <class Sample, class Pixel>
FNImageReference readRows(TIFF* tiff, const Layout& layout, const FNImageAttributes& attributes,
                          const ImageLimits& limits) {
    limits.check(layout.width, layout.height, sizeof(Pixel), "Fn::readTiff");
    const std::size_t rowSamples = std::size_t{layout.width} * layout.samples;
    std::vector<Sample> row(std::max<std::size_t>(rowSamples, TIFFScanlineSize64(tiff) / sizeof(Sample) + 1));
    FNImage<Pixel> image(layout.width, layout.height);
    Pixel* out = image.getExclusive();
    for (std::uint32_t y = 0; y < layout.height; ++y) {
        if (TIFFReadScanline(tiff, row.data(), y, 0) != 1)
            FN_THROW(FNEBadFormat, "TIFFReadScanline: bad data read on line " + std::to_string(y));
        for (std::size_t i = 0; i < rowSamples; i += layout.samples)
            *out++ = toPixel<Sample, Pixel>(&row[i], layout);
    }
    return FNImageReferenceFactory::create(image, attributes);
}

/// The conversions of libtiff: any layout, as colours of 8 bits. The rows stay in stored order.
class ConvertedRows {
public:
    ConvertedRows(TIFF* tiff, const Source& source) : source_(source) {
        char reason[1024] = "";
        constexpr int stopAtErrors = 1;
        if (!TIFFRGBAImageOK(tiff, reason) || !TIFFRGBAImageBegin(&image_, tiff, stopAtErrors, reason))
            FN_THROW(FNEBadFormat, std::string("Fn::readTiff: ") + reason);
        image_.req_orientation = image_.orientation;
    }
    ~ConvertedRows() { TIFFRGBAImageEnd(&image_); }
    ConvertedRows(const ConvertedRows&) = delete;
    ConvertedRows& operator=(const ConvertedRows&) = delete;

    FNImage<Bgra32> read() {
        FNImage<Bgra32> image(image_.width, image_.height);
        static_assert(sizeof(Bgra32) == sizeof(std::uint32_t));
        Bgra32* const pixels = image.getExclusive();
        auto* const raster = reinterpret_cast<std::uint32_t*>(pixels);
        if (!TIFFRGBAImageGet(&image_, raster, image_.width, image_.height))
            FN_THROW(FNEBadFormat, "Fn::readTiff: bad data: " + source_.error);
        for (std::uint64_t i = 0; i < image.size(); ++i) {
            const std::uint32_t p = raster[i];
            const auto sample = [p](unsigned shift) { return static_cast<unsigned char>(p >> shift); };
            pixels[i] = Bgra32(sample(0), sample(8), sample(16), sample(24));
        }
        return image;
    }

private:
    const Source& source_;
    TIFFRGBAImage image_{};
};

FNImageReference readConverted(TIFF* tiff, const Layout& layout, const Source& source,
                               const FNImageAttributes& attributes, const ImageLimits& limits) {
    layout.checkFormat(tiff);
    limits.check(layout.width, layout.height, 2 * sizeof(Bgra32), "Fn::readTiff");
    const FNImage<Bgra32> colors = ConvertedRows(tiff, source).read();
    const bool gray =
        layout.photometric == PHOTOMETRIC_MINISWHITE || layout.photometric == PHOTOMETRIC_MINISBLACK;
    if (!gray) return FNImageReferenceFactory::create(colors, attributes);
    FNImage<unsigned char> image(colors.w(), colors.h());
    std::ranges::transform(colors.span(), image.getExclusive(), [](const Bgra32& p) { return p.r; });
    return FNImageReferenceFactory::create(image, attributes);
}

} // namespace

bool checkIfIsTiff(std::istream& stream) {
    const std::string bytes = peekBytes(stream, 2, "Fn::checkIfIsTiff");
    return bytes == "MM" || bytes == "II";
}

FNImageReference readTiff(std::istream& stream, const std::string& name, unsigned int directory,
                          const ReadImagePropertiesFeedback& feedback, const ImageLimits& limits) {
    Source source{readRest(stream, limits.maxBytes, "Fn::readTiff"), 0, {}};
    const ImageLimits left = limits.beside(source.bytes.size());
    const Tiff tiff = open(source, name, left);
    if (directory != 0 && !TIFFSetDirectory(tiff.get(), static_cast<tdir_t>(directory)))
        FN_THROW(FNEBadFormat, "Fn::readTiff: Cannot set directory to '" + std::to_string(directory) + "'");

    const Layout layout(tiff.get(), limits.rareVariants);
    const bool converted = limits.rareVariants && !layout.isPlain(tiff.get());
    if (!converted) layout.check(tiff.get());
    feedback.compressionMode(modeOf(layout.photometric));
    feedback.pixelDepth(static_cast<unsigned int>(layout.samples * layout.bits));
    if (!converted) layout.checkPhotometric();

    FNImageAttributes attributes;
    const char* description = nullptr;
    if (TIFFGetField(tiff.get(), TIFFTAG_IMAGEDESCRIPTION, &description) && description)
        attributes[tiffDescriptionAttribute] = description;

    if (converted) return readConverted(tiff.get(), layout, source, attributes, left);
    const auto read = layout.samples == 1 ? layout.bits == 8 ? readRows<std::uint8_t, unsigned char>
                                                             : readRows<std::uint16_t, unsigned short>
                      : layout.bits == 8 ? readRows<std::uint8_t, Bgra32>
                                          : readRows<std::uint16_t, Rgb48>;
    return read(tiff.get(), layout, attributes, left);
}

FNImageReference loadTiff(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                          const ImageLimits& limits) {
    const auto refuse = [&](const char* why) { FN_THROW(FNEIOError, "TIFF File " + fileName + why); };
    std::error_code ignored;
    if (!std::filesystem::exists(fileName, ignored)) refuse(" does not exist ");
    std::ifstream file(fileName, std::ios::binary);
    if (!file || std::filesystem::is_directory(fileName, ignored)) refuse(" cannot be opened for reading");
    if (!checkIfIsTiff(file)) refuse(" might be not in TIFF format");
    return readTiff(file, fileName, 0, feedback, limits);
}

} // namespace Fn

#include "fn/imagefile/png.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/run_until_jump.h"
#include "fn/message/dialog.h"

#include <array>
#include <cstdio>
#include <ostream>
#include <vector>

#include <png.h>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

/// Keeps what libpng reports in memory of its own, and jumps back on an error.
struct Errors {
    std::jmp_buf jump;
    std::array<char, 256> error{};
    std::array<char, 256> warning{}; ///< the first one

    static void onError(png_structp png, png_const_charp text) {
        auto& self = *static_cast<Errors*>(png_get_error_ptr(png));
        std::snprintf(self.error.data(), self.error.size(), "%s", text);
        std::longjmp(self.jump, 1);
    }
    static void onWarning(png_structp png, png_const_charp text) {
        auto& self = *static_cast<Errors*>(png_get_error_ptr(png));
        if (self.warning[0] == 0) std::snprintf(self.warning.data(), self.warning.size(), "%s", text);
    }

    /// Runs calls of libpng. @throws FNESysError with what libpng says.
    template <class Step> void guarded(const Step& step) {
        if (!runUntilJump(jump, step)) FN_THROW(FNESysError, std::string("libpng error: ") + error.data());
    }
};

// ---- reading

/// Takes bytes from a stream without an exception, since none may pass through libpng.
/// @return null or what went wrong.
const char* readExactly(std::istream& stream, png_bytep bytes, std::size_t size) noexcept {
    try {
        stream.read(reinterpret_cast<char*>(bytes), static_cast<std::streamsize>(size));
    } catch (...) { // the state says what happened
    }
    if (static_cast<std::size_t>(stream.gcount()) == size) return nullptr;
    if (stream.eof()) return "io_read_fn: unexpected end of input.";
    if (stream.bad()) return "io_read_fn: input is corrupt.";
    if (stream.fail()) return "io_read_fn: next operation will fail.";
    return "io_read_fn: could not read requested number of bytes.";
}

class Reader {
public:
    explicit Reader(std::istream& stream) {
        errors_.guarded([this] {
            png_ =
                png_create_read_struct(PNG_LIBPNG_VER_STRING, &errors_, Errors::onError, Errors::onWarning);
            if (png_) info_ = png_create_info_struct(png_);
        });
        if (!info_) {
            png_destroy_read_struct(&png_, nullptr, nullptr);
            FN_THROW(FNESysError, "libpng error: no memory");
        }
        png_set_read_fn(png_, &stream, [](png_structp png, png_bytep bytes, std::size_t size) {
            const char* const error =
                readExactly(*static_cast<std::istream*>(png_get_io_ptr(png)), bytes, size);
            if (error) png_error(png, error);
        });
    }
    ~Reader() { png_destroy_read_struct(&png_, &info_, nullptr); }
    Reader(const Reader&) = delete;
    Reader& operator=(const Reader&) = delete;

    FNImageReference read(const ReadImagePropertiesFeedback& feedback, const ImageLimits& limits) {
        readInfo(limits);
        report(feedback);
        const bool gray = colorType_ == PNG_COLOR_TYPE_GRAY, wide = bitDepth_ == 16;
        const FNImageReference image =
            gray   ? wide ? readAs<unsigned short>(limits) : readAs<unsigned char>(limits)
              : wide ? readAs<Rgb48>(limits)
                   : readAs<Bgra32>(limits);
        if (errors_.warning[0] != 0) FNDialog::log(std::string("libpng warning: ") + errors_.warning.data());
        return image;
    }

private:
    void readInfo(const ImageLimits& limits) {
        // Of the chunks that tell of the image (texts, profiles, gamma and so on) none is of use here, and
        // libpng allocates what they announce: all are passed over, as those that it does not know.
        constexpr int allButPaletteAndTransparency = -1;
        errors_.guarded([&] {
            png_set_user_limits(png_, limits.maxWidth, limits.maxHeight);
            png_set_keep_unknown_chunks(png_, PNG_HANDLE_CHUNK_NEVER, nullptr, allButPaletteAndTransparency);
            png_read_info(png_, info_);
            png_get_IHDR(png_, info_, &width_, &height_, &bitDepth_, &colorType_, nullptr, nullptr, nullptr);
        });
    }

    void report(const ReadImagePropertiesFeedback& feedback) const {
        struct {
            Mode mode;
            int channels;
        } stored{Mode::Unknown, 0};
        switch (colorType_) {
        case PNG_COLOR_TYPE_GRAY:
            stored = {Mode::Intensity, 1};
            break;
        case PNG_COLOR_TYPE_RGB:
            stored = {Mode::Rgb, 3};
            break;
        case PNG_COLOR_TYPE_PALETTE:
            stored = {Mode::Palette, 1};
            break;
        case PNG_COLOR_TYPE_GRAY_ALPHA:
            stored = {Mode::Alpha, 2};
            break;
        case PNG_COLOR_TYPE_RGB_ALPHA:
            stored = {Mode::Rgba, 4};
            break;
        default:
            break;
        }
        feedback.compressionMode(stored.mode);
        feedback.pixelDepth(static_cast<unsigned int>(stored.channels * bitDepth_));
    }

    /// Makes libpng deliver pixels of `T`.
    template <class T> void setTransformations() {
        if constexpr (sizeof(typename SampleOf<T>::Type) == 2) png_set_swap(png_);
        if constexpr (!isColorPixel<T>) {
            png_set_expand_gray_1_2_4_to_8(png_);
            png_set_packing(png_);
            return;
        }
        if (colorType_ == PNG_COLOR_TYPE_GRAY_ALPHA) png_set_gray_to_rgb(png_);
        if constexpr (std::is_same_v<T, Rgb48>) {
            png_set_strip_alpha(png_);
        } else {
            if (colorType_ == PNG_COLOR_TYPE_PALETTE) png_set_expand(png_);
            png_set_bgr(png_);
            png_set_filler(png_, 255, PNG_FILLER_AFTER); // where no alpha is stored
        }
    }

    template <class T> FNImageReference readAs(const ImageLimits& limits) {
        limits.check(width_, height_, sizeof(T), "Fn::readPng");
        std::size_t rowSize = 0;
        errors_.guarded([&] {
            setTransformations<T>();
            png_set_interlace_handling(png_);
            png_read_update_info(png_, info_);
            rowSize = png_get_rowbytes(png_, info_);
        });
        if (rowSize != std::size_t{width_} * sizeof(T))
            FN_THROW(FNESysError, "libpng error: rows of unexpected size");

        FNImage<T> image(width_, height_);
        T* const pixels = image.getExclusive();
        std::vector<png_bytep> rows(height_);
        for (std::size_t y = 0; y < rows.size(); ++y)
            rows[y] = reinterpret_cast<png_bytep>(pixels + y * width_);
        errors_.guarded([&] {
            png_read_image(png_, rows.data());
            png_read_end(png_, nullptr);
        });
        return FNImageReferenceFactory::create(image);
    }

    Errors errors_;
    png_structp png_ = nullptr;
    png_infop info_ = nullptr;
    png_uint_32 width_ = 0;
    png_uint_32 height_ = 0;
    int bitDepth_ = 0;
    int colorType_ = 0;
};

// ---- writing

class Writer {
public:
    explicit Writer(std::ostream& stream) {
        errors_.guarded([this] {
            png_ =
                png_create_write_struct(PNG_LIBPNG_VER_STRING, &errors_, Errors::onError, Errors::onWarning);
            if (png_) info_ = png_create_info_struct(png_);
        });
        if (!info_) {
            png_destroy_write_struct(&png_, nullptr);
            FN_THROW(FNESysError, "libpng error: no memory");
        }
        png_set_write_fn(
            png_, &stream,
            [](png_structp png, png_bytep bytes, std::size_t size) {
                if (!writeExactly(*static_cast<std::ostream*>(png_get_io_ptr(png)), bytes, size))
                    png_error(png, "io_write_fn: could not write to output.");
            },
            [](png_structp) {});
    }
    ~Writer() { png_destroy_write_struct(&png_, &info_); }
    Writer(const Writer&) = delete;
    Writer& operator=(const Writer&) = delete;

    template <class T> void write(const FNImage<T>& image, int level) {
        constexpr int bits = 8 * sizeof(typename SampleOf<T>::Type);
        constexpr int type = !isColorPixel<T>            ? PNG_COLOR_TYPE_GRAY
                             : std::is_same_v<T, Bgra32> ? PNG_COLOR_TYPE_RGB_ALPHA
                                                         : PNG_COLOR_TYPE_RGB;
        errors_.guarded([&] {
            png_set_user_limits(png_, PNG_UINT_31_MAX, PNG_UINT_31_MAX);
            png_set_IHDR(png_, info_, image.w(), image.h(), bits, type, PNG_INTERLACE_NONE,
                         PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
            if (level >= 0) png_set_compression_level(png_, std::min(level, 9));
            png_write_info(png_, info_);
            if constexpr (bits == 16) png_set_swap(png_);
            if constexpr (std::is_same_v<T, Bgra32>) png_set_bgr(png_);
            for (std::uint32_t y = 0; y < image.h(); ++y)
                png_write_row(png_, reinterpret_cast<png_const_bytep>(image.row(y)));
            png_write_end(png_, nullptr);
        });
    }

private:
    static bool writeExactly(std::ostream& stream, png_const_bytep bytes, std::size_t size) noexcept {
        try {
            stream.write(reinterpret_cast<const char*>(bytes), static_cast<std::streamsize>(size));
            return !stream.fail();
        } catch (...) {
            return false; // nothing may pass through libpng
        }
    }

    Errors errors_;
    png_structp png_ = nullptr;
    png_infop info_ = nullptr;
};

} // namespace

bool checkIfIsPng(std::istream& stream) {
    constexpr std::size_t checked = 4;
    const std::string bytes = peekBytes(stream, checked, "Fn::checkIfIsPng");
    return bytes.size() == checked &&
           png_sig_cmp(reinterpret_cast<png_const_bytep>(bytes.data()), 0, checked) == 0;
}

FNImageReference readPng(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    return Reader(stream).read(feedback, limits);
}

FNImageReference readPng(const char* data, unsigned long size, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    MemoryStream stream(data, size);
    return readPng(stream, feedback, limits);
}

FNImageReference readPng(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName);
    return readPng(file, feedback, limits);
}

void writePng(const FNImageReference& image, std::ostream& stream, int level) {
    switch (image.native()) {
    case FNImageReference::MONO8:
        return writePng(image.toMono8(), stream, level);
    case FNImageReference::MONO16:
    case FNImageReference::MONO_FLOAT:
        return writePng(image.toMono16(), stream, level);
    case FNImageReference::BGRA32:
        return writePng(image.toBgra32(), stream, level);
    case FNImageReference::RGB48:
        return writePng(image.toRgb48(), stream, level);
    }
}

void writePng(const FNImage<unsigned char>& image, std::ostream& stream, int level) {
    Writer(stream).write(image, level);
}

void writePng(const FNImage<unsigned short>& image, std::ostream& stream, int level) {
    Writer(stream).write(image, level);
}

void writePng(const FNImage<float>& image, std::ostream& stream, int level) {
    writePng(convertImage<unsigned short>(image), stream, level);
}

void writePng(const FNImage<Bgra32>& image, std::ostream& stream, int level) {
    Writer(stream).write(image, level);
}

void writePng(const FNImage<Rgb48>& image, std::ostream& stream, int level) {
    Writer(stream).write(image, level);
}

} // namespace Fn

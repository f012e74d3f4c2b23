#include "fn/imagefile/image_compressor.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/run_until_jump.h"
#include "fn/message/dialog.h"

#include <array>
#include <bit>
#include <cstdio>
#include <vector>

#include <jpeglib.h>

#include <jerror.h>

namespace {

using Mode = Fn::FNImageDataCompressionMode;

/// More scans than any encoder writes; each one costs a pass over the whole image, also when it is nearly
/// empty.
constexpr int maxScans = 500;

/// Keeps what libjpeg reports, in memory of its own, and jumps back on an error.
struct ErrorManager : jpeg_error_mgr {
    std::jmp_buf jump;
    std::array<char, JMSG_LENGTH_MAX> error;
    std::array<char, 512> warnings; ///< as many as fit
    std::size_t warningsSize = 0;
    const char* failure = nullptr; ///< of our own callbacks, in place of libjpeg's message

    ErrorManager() {
        jpeg_std_error(this);
        error[0] = warnings[0] = 0;
        error_exit = [](j_common_ptr info) {
            auto& self = *static_cast<ErrorManager*>(info->err);
            self.format_message(info, self.error.data());
            std::longjmp(self.jump, 1);
        };
        emit_message = [](j_common_ptr info, int level) {
            if (level < 0) static_cast<ErrorManager*>(info->err)->addWarning(info);
        };
        output_message = [](j_common_ptr) {};
    }

    void fail(const char* text) {
        failure = text;
        std::longjmp(jump, 1);
    }

    void addWarning(j_common_ptr info) {
        ++num_warnings;
        char text[JMSG_LENGTH_MAX];
        format_message(info, text);
        const std::size_t room = warnings.size() - warningsSize;
        const int length = std::snprintf(warnings.data() + warningsSize, room, " %s", text);
        if (length > 0 && static_cast<std::size_t>(length) < room)
            warningsSize += static_cast<std::size_t>(length);
        else
            warnings[warningsSize] = 0; // a cut one helps nobody
    }

    std::string collectedWarnings() const {
        return warningsSize == 0 ? std::string() : std::string("jpeg lib warning(s):") + warnings.data();
    }

    [[noreturn]] void raise() const {
        const std::string text = std::string("jpeg lib error:") + (failure ? failure : error.data());
        FN_THROW(FNEBadArg, warningsSize == 0 ? text : text + " " + collectedWarnings());
    }
};

/// Feeds the decoder from a stream in blocks.
struct Source : jpeg_source_mgr {
    std::istream& stream;
    std::array<JOCTET, 1 << 16> block;

    explicit Source(std::istream& s) : stream(s) {
        next_input_byte = nullptr;
        bytes_in_buffer = 0;
        init_source = term_source = [](j_decompress_ptr) {};
        resync_to_restart = jpeg_resync_to_restart;
        fill_input_buffer = [](j_decompress_ptr info) -> boolean {
            static_cast<Source*>(info->src)->fill(info);
            return TRUE;
        };
        skip_input_data = [](j_decompress_ptr info, long n) {
            auto& self = *static_cast<Source*>(info->src);
            for (auto left = static_cast<std::size_t>(std::max(n, 0L)); left > 0;) {
                if (self.bytes_in_buffer == 0) self.fill(info);
                if (self.atEnd) return; // the end mark that stands for the missing bytes is not skipped
                const std::size_t step = std::min(left, self.bytes_in_buffer);
                self.next_input_byte += step;
                self.bytes_in_buffer -= step;
                left -= step;
            }
        };
    }

    void fill(j_decompress_ptr info) {
        std::size_t n = 0;
        try {
            stream.read(reinterpret_cast<char*>(block.data()), static_cast<std::streamsize>(block.size()));
            n = static_cast<std::size_t>(stream.gcount());
        } catch (
            ...) { // a stream that throws: the same as its end, since nothing may pass through the library
        }
        if (n == 0) {
            WARNMS(info, JWRN_JPEG_EOF);
            atEnd = true;
            block[0] = 0xFF;
            block[1] = JPEG_EOI;
            n = 2;
        }
        next_input_byte = block.data();
        bytes_in_buffer = n;
    }

    /// Leaves the stream behind the last byte that the decoder took.
    void putBack() {
        if (atEnd || (!stream && !stream.eof())) return;
        stream.clear();
        stream.seekg(-static_cast<std::streamoff>(bytes_in_buffer), std::ios::cur);
        stream.clear();
    }

    bool atEnd = false;
};

class Decoder {
public:
    explicit Decoder(std::istream& stream) : source_(stream) {
        info_.err = &errors_;
        guarded([this] { jpeg_create_decompress(&info_); });
        info_.src = &source_;
        progress_.progress_monitor = [](j_common_ptr info) {
            if (reinterpret_cast<j_decompress_ptr>(info)->input_scan_number > maxScans)
                static_cast<ErrorManager*>(info->err)->fail("Too many scans");
        };
        info_.progress = &progress_;
    }
    ~Decoder() { jpeg_destroy_decompress(&info_); }
    Decoder(const Decoder&) = delete;
    Decoder& operator=(const Decoder&) = delete;

    /// @param name of the stream in warnings, empty for none
    FNImageReference decode(const Fn::ReadImagePropertiesFeedback& feedback, const Fn::ImageLimits& limits,
                            const std::string& name) {
        readHeader();
        feedback.compressionMode(storedMode());
        feedback.pixelDepth(static_cast<unsigned int>(info_.data_precision * info_.num_components));
        const FNImageReference image =
            info_.out_color_space == JCS_GRAYSCALE ? decodeGray(limits) : decodeColor(limits);
        source_.putBack();
        if (errors_.warningsSize != 0)
            FNDialog::warn(errors_.collectedWarnings() + (name.empty() ? "" : " in " + name));
        return image;
    }

private:
    template <class Step> void guarded(const Step& step) {
        if (!Fn::runUntilJump(errors_.jump, step)) errors_.raise();
    }

    void readHeader() {
        int result = 0;
        guarded([&] { result = jpeg_read_header(&info_, TRUE); });
        if (result != JPEG_HEADER_OK) FN_THROW(FNEBadArg, "Error reading jpeg header");
    }

    Mode storedMode() const {
        switch (info_.jpeg_color_space) {
        case JCS_GRAYSCALE:
            return Mode::Intensity;
        case JCS_RGB:
            return Mode::Rgb;
        case JCS_YCbCr:
            return Mode::YCbCr;
        case JCS_CMYK:
            return Mode::Cmyk;
        case JCS_YCCK:
            return Mode::YCbCrK;
        default:
            return Mode::Unknown;
        }
    }

    FNImageReference decodeGray(const Fn::ImageLimits& limits) {
        return FNImageReferenceFactory::create(decodeAs<unsigned char>(
            limits, 1, "JpegGrayScaleDecompressImage(): number of output components not supported"));
    }

    FNImageReference decodeColor(const Fn::ImageLimits& limits) {
        const char* const refusal = "JpegRgbDecompressImage(): number of output components not supported";
        const bool inks = info_.out_color_space == JCS_CMYK && limits.rareVariants;
        if (info_.out_color_space != JCS_RGB && !inks) FN_THROW(FNEBadArg, refusal);
        if (!inks) info_.out_color_space = JCS_EXT_BGRA; // alpha 255
        FNImage<Fn::Bgra32> image = decodeAs<Fn::Bgra32>(limits, 4, refusal);
        if (inks) mixInks(image, info_.saw_Adobe_marker);
        return FNImageReferenceFactory::create(image);
    }

    /// Turns cyan, magenta, yellow and black, which lie in the place of colours, into these.
    /// @param inverted a sample tells how much of the ink is missing: so do all files with Adobe's marker
    static void mixInks(FNImage<Fn::Bgra32>& image, bool inverted) {
        const unsigned char flip = inverted ? 0 : 255;
        for (FNImIter<Fn::Bgra32> pixel(image, image.box()); !pixel.atEnd(); ++pixel) {
            const auto inks = std::bit_cast<std::array<unsigned char, 4>>(*pixel);
            const auto light = [&](int ink) {
                const unsigned product = (inks[static_cast<std::size_t>(ink)] ^ flip) * (inks[3] ^ flip);
                return static_cast<unsigned char>((product + 127) / 255);
            };
            *pixel = Fn::Bgra32(light(0), light(1), light(2));
        }
    }

    template <class T>
    FNImage<T> decodeAs(const Fn::ImageLimits& limits, int components, const char* refusal) {
        limits.check(info_.image_width, info_.image_height, sizeof(T), "Fn::readJpeg");
        // What remains is for the coefficients, which a file of several scans makes libjpeg keep.
        const Fn::ImageLimits left =
            limits.beside(std::uint64_t{info_.image_width} * info_.image_height * sizeof(T));
        info_.mem->max_memory_to_use =
            static_cast<long>(std::clamp<std::uint64_t>(left.maxBytes, 1, std::numeric_limits<long>::max()));
        guarded([this] { jpeg_start_decompress(&info_); });
        if (info_.output_components != components) FN_THROW(FNEBadArg, refusal);

        FNImage<T> image(info_.output_width, info_.output_height);
        T* const pixels = image.getExclusive();
        guarded([this, pixels] {
            std::array<JSAMPROW, 16> rows;
            while (info_.output_scanline < info_.output_height) {
                const std::size_t n =
                    std::min<std::size_t>(rows.size(), info_.output_height - info_.output_scanline);
                for (std::size_t i = 0; i < n; ++i)
                    rows[i] = reinterpret_cast<JSAMPROW>(pixels + std::uint64_t{info_.output_scanline + i} *
                                                                      info_.output_width);
                jpeg_read_scanlines(&info_, rows.data(), static_cast<JDIMENSION>(n));
            }
            jpeg_finish_decompress(&info_);
        });
        return image;
    }

    ErrorManager errors_;
    Source source_;
    jpeg_progress_mgr progress_{};
    jpeg_decompress_struct info_{};
};

/// Collects the encoder's output in a block that grows.
struct Destination : jpeg_destination_mgr {
    std::vector<JOCTET> bytes;

    Destination() {
        init_destination = [](j_compress_ptr info) { static_cast<Destination*>(info->dest)->grow(info); };
        empty_output_buffer = [](j_compress_ptr info) -> boolean {
            auto& self = *static_cast<Destination*>(info->dest);
            self.free_in_buffer = 0; // the block is full, whatever this says
            self.grow(info);
            return TRUE;
        };
        term_destination = [](j_compress_ptr info) {
            auto& self = *static_cast<Destination*>(info->dest);
            self.bytes.resize(self.bytes.size() - self.free_in_buffer);
        };
    }

    void grow(j_compress_ptr info) {
        const std::size_t before = bytes.size();
        bool grown = true;
        try {
            bytes.resize(std::max<std::size_t>(2 * before, 1 << 16));
        } catch (...) {
            grown = false; // no exception passes through the library
        }
        if (!grown) static_cast<ErrorManager*>(info->err)->fail("no memory for the compressed image");
        next_output_byte = bytes.data() + before;
        free_in_buffer = bytes.size() - before;
    }
};

class Encoder {
public:
    Encoder() {
        info_.err = &errors_;
        guarded([this] { jpeg_create_compress(&info_); });
        info_.dest = &destination_;
    }
    ~Encoder() { jpeg_destroy_compress(&info_); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    template <class T>
    FNRMem<unsigned char> encode(const FNImage<T>& image, J_COLOR_SPACE space, int quality) {
        guarded([&, pixels = image.data()] {
            info_.image_width = image.w();
            info_.image_height = image.h();
            info_.input_components = sizeof(T);
            info_.in_color_space = space;
            jpeg_set_defaults(&info_);
            jpeg_set_quality(&info_, quality, TRUE);
            jpeg_start_compress(&info_, TRUE);
            while (info_.next_scanline < info_.image_height) {
                // libjpeg's interface is not const-correct.
                auto* row = reinterpret_cast<JSAMPROW>(
                    const_cast<T*>(pixels + std::uint64_t{info_.next_scanline} * info_.image_width));
                jpeg_write_scanlines(&info_, &row, 1);
            }
            jpeg_finish_compress(&info_);
        });
        FNRMem<unsigned char> result(destination_.bytes.size());
        std::copy(destination_.bytes.begin(), destination_.bytes.end(), result.getExclusive());
        return result;
    }

private:
    template <class Step> void guarded(const Step& step) {
        if (!Fn::runUntilJump(errors_.jump, step)) errors_.raise();
    }

    ErrorManager errors_;
    Destination destination_;
    jpeg_compress_struct info_{};
};

template <class T>
FNImageCompressor::Bytes compressJpegAs(const FNImage<T>& image, J_COLOR_SPACE space, int quality) {
    if (quality < 1 || quality > 100)
        FN_THROW(FNEBadArg, "FNImageCompressor::compressJpeg: quality factor must be between 1 and 100");
    return Encoder().encode(image, space, quality);
}

template <class T>
FNImageCompressor::Bytes compressAs(const FNImage<T>& image, FNImageCompressor::Mode mode,
                                    FNImageCompressor::Format format, const char* gzipRefusal) {
    switch (format) {
    case FNImageCompressor::JPEG:
        if (mode == FNImageCompressor::LOSSLESS)
            FN_THROW(FNEBadArg, "FNImageCompressor::compress: JPEG lossless not yet supported");
        return FNImageCompressor::compressJpeg(image, FNImageCompressor::jpegQuality(mode));
    case FNImageCompressor::GZIP:
        FN_THROW(FNEBadArg, gzipRefusal);
    }
    FN_THROW(FNEBadArg, "FNImageCompressor::compress: format not supported");
}

} // namespace

int FNImageCompressor::jpegQuality(Mode mode) {
    switch (mode) {
    case BEST_QUALITY:
        return 100;
    case MEDIUM_QUALITY:
        return 80;
    case LOW_QUALITY:
        return 50;
    default:
        return 0;
    }
}

FNImageCompressor::Bytes FNImageCompressor::compress(const FNImage<Fn::Bgra32>& image, Mode mode,
                                                     Format format) {
    return compressAs(image, mode, format, "FNImageCompressor::compress: format not yet supported");
}

FNImageCompressor::Bytes FNImageCompressor::compress(const FNImage<unsigned char>& image, Mode mode,
                                                     Format format) {
    return compressAs(image, mode, format,
                      "FNImageCompressor::compress: the Gzip format is not yet supported");
}

FNImageCompressor::Bytes FNImageCompressor::compressJpeg(const FNImage<Fn::Bgra32>& image, int quality) {
    return compressJpegAs(image, JCS_EXT_BGRX, quality);
}

FNImageCompressor::Bytes FNImageCompressor::compressJpeg(const FNImage<unsigned char>& image, int quality) {
    return compressJpegAs(image, JCS_GRAYSCALE, quality);
}

FNImageReference FNImageCompressor::decompress(Format format, const Bytes& bytes) {
    if (format != JPEG) FN_THROW(FNEBadArg, "FNImageCompressor::decompress: format not supported");
    return Fn::readJpeg(reinterpret_cast<const char*>(bytes.data()), bytes.size());
}

FNImageReference FNImageCompressor::decompressJpeg(std::istream& stream,
                                                   const Fn::ReadImagePropertiesFeedback& feedback,
                                                   const Fn::ImageLimits& limits, const std::string& name) {
    return Decoder(stream).decode(feedback, limits, name);
}

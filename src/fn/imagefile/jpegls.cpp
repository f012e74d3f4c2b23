#include "fn/imagefile/jpegls.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/sample_scale.h"

#include <vector>

#include <charls/charls.h>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

/// A header lies within this many bytes.
constexpr std::size_t headerBytes = 1u << 16;

const char* textOf(const charls::jpegls_error& error) {
    using charls::jpegls_errc;
    if (error.code().category() != charls::jpegls_category()) return "Unknown error code";
    const int code = error.code().value();
    switch (static_cast<jpegls_errc>(code)) {
    case jpegls_errc::parameter_value_not_supported:
        return "Parameter value not supported";
    case jpegls_errc::color_transform_not_supported:
        return "Unsupported color transform";
    case jpegls_errc::bit_depth_for_transform_not_supported:
        return "Unsupported bit depth for transform";
    case jpegls_errc::encoding_not_supported:
        return "Image type not supported";
    case jpegls_errc::source_buffer_too_small:
        return "Compressed buffer too small";
    case jpegls_errc::destination_buffer_too_small:
        return "Uncompressed buffer too small";
    case jpegls_errc::too_much_encoded_data:
        return "Too much compressed data";
    case jpegls_errc::not_enough_memory:
    case jpegls_errc::unexpected_failure:
        return "Unknown error code";
    default:
        break;
    }
    const bool ofArguments = code == static_cast<int>(jpegls_errc::invalid_argument) ||
                             code == static_cast<int>(jpegls_errc::invalid_operation) ||
                             code >= static_cast<int>(jpegls_errc::invalid_argument_width);
    return ofArguments ? "Invalid JlsParameters" : "Invalid compressed data";
}

/// Decoded samples as CharLS gives them: `bits` of 8 or 16 each, pixel by pixel or plane by plane.
struct Samples {
    charls::frame_info frame;
    bool planes;
    std::vector<unsigned char> bytes;

    template <class Stored> std::uint32_t at(std::uint64_t pixel, unsigned component) const {
        const auto components = static_cast<unsigned>(frame.component_count);
        const std::uint64_t i = planes ? component * std::uint64_t{frame.width} * frame.height + pixel
                                       : pixel * components + component;
        Stored v;
        std::memcpy(&v, bytes.data() + i * sizeof(Stored), sizeof(Stored));
        return v;
    }
};

template <class Gray, class Color> FNImageReference toReference(const Samples& samples) {
    using Stored = Gray;
    const charls::frame_info& frame = samples.frame;
    const std::uint32_t greatest = greatestSample(static_cast<unsigned>(frame.bits_per_sample));
    const auto sample = [&](std::uint64_t pixel, unsigned component) {
        return static_cast<Stored>(
            scaleSample(samples.at<Stored>(pixel, component), greatest, std::numeric_limits<Stored>::max()));
    };
    if (frame.component_count == 1) {
        FNImage<Gray> image(frame.width, frame.height);
        Gray* const out = image.getExclusive();
        for (std::uint64_t i = 0; i < image.size(); ++i) out[i] = sample(i, 0);
        return FNImageReferenceFactory::create(image);
    }
    FNImage<Color> image(frame.width, frame.height);
    Color* const out = image.getExclusive();
    for (std::uint64_t i = 0; i < image.size(); ++i) {
        out[i] = Color(sample(i, 0), sample(i, 1), sample(i, 2));
        if constexpr (std::is_same_v<Color, Bgra32>)
            if (frame.component_count == 4) out[i].a = sample(i, 3);
    }
    return FNImageReferenceFactory::create(image);
}

constexpr unsigned char startMarker = 0xD8, scanMarker = 0xDA, firstRestartMarker = 0xD0,
                        restartIntervalMarker = 0xDD, endMarker = 0xD9;

/// A stretch of coded data, without the marker that ends it. Each begins anew, as if it were an image of its
/// own.
struct Interval {
    std::size_t begin, end;
};

/// What the segments of a file tell.
struct Segments {
    std::size_t frame = 0;                    ///< where the content of the frame's header begins
    std::vector<Interval> restarts;           ///< contents of the segments of restart intervals
    std::vector<std::vector<Interval>> scans; ///< each with its restart intervals

    explicit Segments(const FNRMem<unsigned char>& file) {
        constexpr std::size_t mostScans = 4;
        const unsigned char* const bytes = file.data();
        for (std::size_t at = 0; at + 4 <= file.size() && bytes[at] == 0xFF && scans.size() < mostScans;) {
            const unsigned char marker = bytes[++at];
            if (marker == 0xFF) continue; // any number of these may stand before a marker
            ++at;
            if (marker == startMarker) continue; // has no segment
            const std::size_t content = at + 2;
            at += std::size_t{bytes[at]} << 8 | bytes[at + 1];
            if (marker == frameMarker) frame = content;
            if (marker == restartIntervalMarker) restarts.push_back({content, std::min(at, file.size())});
            if (marker == scanMarker) at = addScan(file, at);
        }
    }

private:
    static constexpr unsigned char frameMarker = 0xF7;

    /// @return where the scan that begins at `at` ends: at the next marker but those of restarts, or with the
    /// file
    std::size_t addScan(const FNRMem<unsigned char>& file, std::size_t at) {
        const unsigned char* const bytes = file.data();
        std::vector<Interval>& intervals = scans.emplace_back(1, Interval{at, file.size()});
        for (; at < file.size(); ++at) {
            if (bytes[at] != 0xFF || (at + 1 < file.size() && bytes[at + 1] < 0x80)) continue;
            intervals.back().end = at;
            if (at + 1 == file.size() || (bytes[at + 1] & 0xF8) != firstRestartMarker) return at;
            intervals.push_back({at + 2, file.size()});
            ++at;
        }
        return file.size();
    }
};

/// CharLS 2.4 counts zero bits behind the end of a scan for seconds if a code is cut off there. With zeros
/// before the end it stops at them, so that a scan is tried in this way first. A whole one then seems to be
/// too long.
/// @throws charls::jpegls_error for a cut one
void refuseIfCut(std::vector<unsigned char> file, std::size_t end, std::vector<unsigned char>& samples) {
    constexpr std::size_t zeros = 32;
    file.insert(file.begin() + static_cast<std::ptrdiff_t>(end), zeros, 0);
    try {
        charls::jpegls_decoder(file, true).decode(samples);
    } catch (const charls::jpegls_error& error) {
        if (error.code() != charls::jpegls_errc::too_much_encoded_data) throw;
    }
}

/// An interval of a file of one scan as a file of its own.
std::vector<unsigned char> fileOfInterval(const FNRMem<unsigned char>& file, const Segments& segments,
                                          std::size_t index, std::uint32_t rows) {
    const std::vector<Interval>& intervals = segments.scans.front();
    std::vector<unsigned char> alone(file.begin(), file.begin() + intervals.front().begin);
    for (const Interval& restart : segments.restarts)
        std::fill(alone.begin() + static_cast<std::ptrdiff_t>(restart.begin),
                  alone.begin() + static_cast<std::ptrdiff_t>(restart.end), 0); // none
    alone[segments.frame + 1] = static_cast<unsigned char>(rows >> 8);
    alone[segments.frame + 2] = static_cast<unsigned char>(rows);
    alone.insert(alone.end(), file.begin() + intervals[index].begin, file.begin() + intervals[index].end);
    alone.insert(alone.end(), {0xFF, endMarker});
    return alone;
}

/// @throws charls::jpegls_error if a scan is cut off; FNEBadFormat for restart intervals that are not read
void refuseCutScans(const FNRMem<unsigned char>& file, std::uint32_t height,
                    std::vector<unsigned char>& samples) {
    const Segments segments(file);
    bool restarts = false;
    for (const auto& intervals : segments.scans) restarts = restarts || intervals.size() > 1;
    if (!restarts) {
        for (const auto& intervals : segments.scans)
            refuseIfCut({file.begin(), file.end()}, intervals.front().end, samples);
        return;
    }
    if (segments.scans.size() != 1 || segments.restarts.size() != 1 || segments.frame == 0)
        FN_THROW(FNEBadFormat,
                 "readJpegLS(): restart markers are read in files of one scan and one interval only");
    std::uint32_t rowsEach = 0;
    const Interval& stored = segments.restarts.front();
    for (std::size_t i = stored.begin; i < stored.end; ++i) rowsEach = rowsEach << 8 | file.data()[i];
    std::uint32_t left = height;
    for (std::size_t i = 0; i < segments.scans.front().size(); ++i) {
        const std::uint32_t rows = std::min(rowsEach, left);
        if (rows == 0) FN_THROW(FNEBadFormat, "readJpegLS(): Invalid compressed data");
        const std::vector<unsigned char> alone = fileOfInterval(file, segments, i, rows);
        refuseIfCut(alone, alone.size() - 2, samples);
        left -= rows;
    }
}

FNImageReference decode(const FNRMem<unsigned char>& file, const ReadImagePropertiesFeedback& feedback,
                        const ImageLimits& limits) {
    if (file.empty()) FN_THROW(FNEBadFormat, "readJpegLS(): Compressed buffer too small");
    const charls::jpegls_decoder decoder(file.data(), file.size(), true);
    Samples samples{decoder.frame_info(), decoder.interleave_mode() == charls::interleave_mode::none, {}};
    const int bits = samples.frame.bits_per_sample, components = samples.frame.component_count;
    if (bits < 1 || bits > 16)
        FN_THROW(FNEBadFormat, "readJpegLS(): unsuported bits per sample = " + std::to_string(bits));
    if (components != 1 && components != 3 && components != 4)
        FN_THROW(FNEBadFormat,
                 "readJpegLS(): unsuported number of components = " + std::to_string(components));
    feedback.compressionMode(Mode::Unknown);
    feedback.pixelDepth(static_cast<unsigned int>(components * bits));

    const unsigned sampleSize = bits > 8 ? 2 : 1;
    const unsigned resultSize = components == 1 ? sampleSize : bits > 8 ? sizeof(Rgb48) : sizeof(Bgra32);
    limits.beside(file.size())
        .check(samples.frame.width, samples.frame.height,
               static_cast<unsigned>(components) * sampleSize + resultSize, "readJpegLS()");
    samples.bytes.resize(decoder.destination_size());
    refuseCutScans(file, samples.frame.height, samples.bytes);
    decoder.decode(samples.bytes);
    return bits > 8 ? toReference<unsigned short, Rgb48>(samples)
                    : toReference<unsigned char, Bgra32>(samples);
}

/// Three samples, red first, whatever order the pixel has.
template <class Sample, class Color> std::vector<Sample> toTriples(const FNImage<Color>& image) {
    std::vector<Sample> samples;
    samples.reserve(3 * image.size());
    for (const Color& p : image.span()) samples.insert(samples.end(), {p.r, p.g, p.b});
    return samples;
}

/// Codes into `bytes`. @return the number of bytes written. @throws charls::jpegls_error
template <class Sample>
std::size_t encodeInto(std::vector<unsigned char>& bytes, const Sample* samples, std::uint32_t w,
                       std::uint32_t h, int components) {
    charls::jpegls_encoder encoder;
    encoder.frame_info({w, h, 8 * sizeof(Sample), components});
    if (components > 1) encoder.interleave_mode(charls::interleave_mode::line);
    bytes.resize(std::max(bytes.size(), encoder.estimated_destination_size()));
    encoder.destination(bytes);
    return encoder.encode(samples, std::size_t{w} * h * static_cast<unsigned>(components) * sizeof(Sample));
}

template <class Sample>
FNRMem<unsigned char> encode(const Sample* samples, std::uint32_t w, std::uint32_t h, int components) {
    // CharLS's estimate is too small for noise, whose codes are longer than its samples: at most four times.
    constexpr int mostAttempts = 4;
    std::vector<unsigned char> bytes;
    for (int attempt = 1;; ++attempt) {
        try {
            const std::size_t written = encodeInto(bytes, samples, w, h, components);
            FNRMem<unsigned char> result(written);
            std::copy_n(bytes.begin(), written, result.getExclusive());
            return result;
        } catch (const charls::jpegls_error& error) {
            if (error.code() != charls::jpegls_errc::destination_buffer_too_small || attempt == mostAttempts)
                FN_THROW(FNESysError, std::string("writeJpegLS(): ") + textOf(error));
        }
        bytes.resize(2 * bytes.size());
    }
}

} // namespace

bool checkIfIsJpegLS(std::istream& stream) {
    if (!stream) FN_THROW(FNEBadFormat, "checkIfIsJpegLS(): can not read from stream");
    const std::string bytes = peekBytes(stream, headerBytes, "checkIfIsJpegLS()");
    try {
        const charls::jpegls_decoder decoder(bytes.data(), bytes.size(), true);
        return true;
    } catch (const charls::jpegls_error&) {
        return false;
    }
}

FNImageReference readJpegLS(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                            const ImageLimits& limits) {
    try {
        return decode(readRest(stream, limits.maxBytes, "readJpegLS()"), feedback, limits);
    } catch (const charls::jpegls_error& error) {
        FN_THROW(FNEBadFormat, std::string("readJpegLS(): ") + textOf(error));
    }
}

FNImageReference readJpegLS(const char* data, unsigned long size, const ReadImagePropertiesFeedback& feedback,
                            const ImageLimits& limits) {
    MemoryStream stream(data, size);
    return readJpegLS(stream, feedback, limits);
}

FNRMem<unsigned char> writeJpegLS(const FNImageReference& image) {
    const std::uint32_t w = image.w(), h = image.h();
    switch (image.native()) {
    case FNImageReference::MONO8:
        return encode(image.toMono8().data(), w, h, 1);
    case FNImageReference::BGRA32:
        return encode(toTriples<unsigned char>(image.toBgra32()).data(), w, h, 3);
    case FNImageReference::RGB48:
        return encode(toTriples<unsigned short>(image.toRgb48()).data(), w, h, 3);
    default:
        return encode(image.toMono16().data(), w, h, 1);
    }
}

void writeJpegLS(const FNImageReference& image, std::ostream& stream) {
    writeBytes(stream, writeJpegLS(image).span(), "writeJpegLS(): error writing to stream");
}

} // namespace Fn

#include "fn/imagefile/j2k.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/j2k_stream.h"
#include "fn/whole_file.h"

#include <array>
#include <bit>

namespace Fn {

namespace {

struct Format {
    const char* name;
    OPJ_CODEC_FORMAT codec;
};
constexpr std::array formats{Format{"jp2", OPJ_CODEC_JP2}, Format{"jpc", OPJ_CODEC_J2K}};

OPJ_CODEC_FORMAT codecOf(const std::string& formatName) {
    std::string known;
    for (const Format& format : formats) {
        if (formatName == format.name) return format.codec;
        known += (known.empty() ? "" : ", ") + std::string(format.name);
    }
    FN_THROW(FNEBadArg, "Fn::writeJ2k: unknown format '" + formatName + "', known formats are: " + known);
}

J2k::Image emptyImage(std::uint32_t w, std::uint32_t h, unsigned components, unsigned bits) {
    std::array<opj_image_cmptparm_t, 3> parameters{};
    for (auto& p : parameters) {
        p.dx = p.dy = 1;
        p.w = w;
        p.h = h;
        p.prec = bits;
    }
    J2k::Image image(
        opj_image_create(components, parameters.data(), components == 1 ? OPJ_CLRSPC_GRAY : OPJ_CLRSPC_SRGB));
    if (!image) FN_THROW(FNESysError, "Fn::writeJ2k: no memory for the image");
    image->x1 = w;
    image->y1 = h;
    return image;
}

template <class T> J2k::Image toComponents(const FNImage<T>& image) {
    constexpr unsigned bits = 8 * sizeof(typename SampleOf<T>::Type);
    J2k::Image result = emptyImage(image.w(), image.h(), isColorPixel<T> ? 3 : 1, bits);
    for (std::uint64_t i = 0; i < image.size(); ++i) {
        const T& p = image.data()[i];
        if constexpr (isColorPixel<T>) {
            result->comps[0].data[i] = p.r;
            result->comps[1].data[i] = p.g;
            result->comps[2].data[i] = p.b;
        } else {
            result->comps[0].data[i] = p;
        }
    }
    return result;
}

J2k::Image toComponents(const FNImageReference& image) {
    switch (image.native()) {
    case FNImageReference::MONO8:
        return toComponents(image.toMono8());
    case FNImageReference::BGRA32:
        return toComponents(image.toBgra32());
    case FNImageReference::RGB48:
        return toComponents(image.toRgb48());
    default:
        return toComponents(image.toMono16());
    }
}

opj_cparameters_t losslessParameters(std::uint32_t w, std::uint32_t h) {
    opj_cparameters_t parameters;
    opj_set_default_encoder_parameters(&parameters);
    parameters.tcp_numlayers = 1;
    parameters.tcp_rates[0] = 0; // no limit
    parameters.cp_disto_alloc = 1;
    // The smallest resolution has at least one pixel in each direction.
    parameters.numresolution =
        std::min(parameters.numresolution, static_cast<int>(std::bit_width(std::min(w, h))));
    return parameters;
}

} // namespace

std::vector<std::string> j2kFormats() {
    std::vector<std::string> names;
    for (const Format& format : formats) names.emplace_back(format.name);
    return names;
}

void writeJ2k(const FNImageReference& image, const std::string& formatName, std::ostream& target) {
    const OPJ_CODEC_FORMAT format = codecOf(formatName);
    if (image.w() == 0) FN_THROW(FNEBadArg, "Fn::writeJ2k: the image has no pixels");
    const J2k::Image components = toComponents(image);
    opj_cparameters_t parameters = losslessParameters(image.w(), image.h());
    parameters.tcp_mct = components->numcomps == 3 ? 1 : 0;

    J2k::Report report;
    J2k::Output output;
    const J2k::Codec codec(opj_create_compress(format));
    if (!codec) FN_THROW(FNESysError, "Fn::writeJ2k: failed to open jasper stream from std::iostream.");
    report.listenTo(codec.get());
    if (!opj_setup_encoder(codec.get(), &parameters, components.get()) ||
        !opj_start_compress(codec.get(), components.get(), output.stream()) ||
        !opj_encode(codec.get(), output.stream()) || !opj_end_compress(codec.get(), output.stream()))
        FN_THROW(FNESysError, "Fn::writeJ2k: the encoder failed:" + report.text);

    writeBytes(target, output.bytes(), "Fn::writeJ2k: error writing to stream");
}

void writeJ2k(const FNImageReference& image, const std::string& formatName, const std::string& fileName) {
    writeWholeFile(fileName, [&](std::ostream& file) { writeJ2k(image, formatName, file); });
}

void readWriteJ2k(const std::string& inFile, const std::string& outFile) {
    writeJ2k(loadJ2k(inFile), outFile.substr(outFile.rfind('.') + 1), outFile);
}

} // namespace Fn

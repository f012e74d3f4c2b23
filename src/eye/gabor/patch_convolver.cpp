#include "eye/gabor/patch_convolver.h"

#include "fn/exception.h"

namespace Eye::Ojo::T8 {
namespace {

/// Copies one row of responses, all columns, to the points of both phases that it belongs to.
void distribute(unsigned char* const bytes[8], std::uint32_t gridRow,
                std::vector<RowOrientedGaborSods>& phases) {
    for (std::uint32_t px = 0; px < 2; ++px) {
        RowOrientedGaborSods& phase = phases[px + 2 * (gridRow % 2)];
        const std::uint32_t y = gridRow / 2;
        if (y >= phase.rows) continue;
        unsigned char* out =
            phase.bytes.data() + std::size_t{y} * phase.columns * RowOrientedGaborSods::bytesPerPoint;
        for (std::uint32_t x = 0; x < phase.columns; ++x)
            for (std::uint32_t i = 0; i < RowOrientedGaborSods::bytesPerPoint; ++i)
                *out++ = bytes[i][2 * x + px];
    }
}

} // namespace

template <class Settings>
void FastSpatialGaborConvolver<unsigned short, int, Settings>::calculateResponses(
    const FNImage<unsigned short>& patch, ConvolutionData& data) const {
    if (patch.w() != Settings::getPatchWidth() || patch.h() != Settings::getPatchHeight())
        FN_THROW(FNEBadArg, "FastSpatialGaborConvolver: patch of " + std::to_string(patch.w()) + "x" +
                                std::to_string(patch.h()) + " instead of " +
                                std::to_string(Settings::getPatchWidth()) + "x" +
                                std::to_string(Settings::getPatchHeight()) + " pixels");
    Gabor::computeResponses(Gabor::kernelRep<Settings::directions>(), patch.data(), patch.w(), 1, data);
    data.done = true;
}

template <class Settings>
std::vector<RowOrientedGaborSods>
FastSpatialGaborConvolver<unsigned short, int, Settings>::getAllGaborSODs(const ConvolutionData& data) const {
    if (!data.done) FN_THROW(FNEBadFunCall, "Convolution must be done previous to getAllGaborSODs() call");
    std::vector<RowOrientedGaborSods> phases(4);
    for (std::uint32_t px = 0; px < 2; ++px)
        for (std::uint32_t py = 0; py < 2; ++py) {
            RowOrientedGaborSods& phase = phases[px + 2 * py];
            phase = {px, py, (Settings::gridHeight - py) >> 1, (Settings::gridWidth - px) >> 1, {}};
            phase.bytes.resize(std::size_t{phase.rows} * phase.columns * RowOrientedGaborSods::bytesPerPoint);
        }

    constexpr std::size_t width = (Settings::gridWidth + 15) / 16 * 16;
    unsigned char rows[8][width];
    unsigned char* bytes[8];
    for (unsigned i = 0; i < 8; ++i) bytes[i] = rows[i];
    for (std::uint32_t y = 0; y < Settings::gridHeight; ++y) {
        Gabor::compareInPatch(data, y, bytes);
        distribute(bytes, y, phases);
    }
    return phases;
}

template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<18, 18>>;
template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<22, 22>>;
template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<25, 25>>;
template class FastSpatialGaborConvolver<unsigned short, int, Boca::MConvolverSettings>;
template class FastSpatialGaborConvolver<unsigned short, int, Raiz::MConvolverSettings>;

} // namespace Eye::Ojo::T8

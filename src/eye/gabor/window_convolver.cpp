#include "eye/gabor/window_convolver.h"

namespace Eye::Cara::Impl {
namespace {

/// Packs groups of bits from the lowest up.
class BitWriter {
public:
    explicit BitWriter(unsigned char* out) : out_(out) {}
    void write(std::uint32_t bits, unsigned count) {
        pending_ |= std::uint64_t{bits} << pendingBits_;
        pendingBits_ += count;
        for (; pendingBits_ >= 32; pendingBits_ -= 32, pending_ >>= 32) flushBytes(4);
    }
    void finish() { flushBytes((pendingBits_ + 7) / 8); }

private:
    void flushBytes(unsigned n) {
        for (unsigned i = 0; i < n; ++i) *out_++ = static_cast<unsigned char>(pending_ >> 8 * i);
    }

    unsigned char* out_;
    std::uint64_t pending_ = 0;
    unsigned pendingBits_ = 0;
};

std::string sizeText(std::uint64_t w, std::uint64_t h) {
    return std::to_string(w) + "x" + std::to_string(h);
}

} // namespace

template <class Settings>
void FastSpatialGaborConvolver<unsigned short, int, Settings>::convolve(const FNImage<unsigned short>& image,
                                                                        FNGridPos pos,
                                                                        ConvolutionData& data) const {
    constexpr std::int64_t mask = Settings::mask;
    if (pos.x < 0 || pos.y < 0 || pos.x + mask > image.w() || pos.y + mask > image.h())
        FN_THROW(FNEBadArg, "Eye::Cara::Impl::FastSpatialGaborConvolver<unsigned short, int, " +
                                Settings::name() + ">: convolution failed: src: " +
                                sizeText(image.w(), image.h()) + ", mask: " + sizeText(mask, mask) +
                                ", pos: (" + std::to_string(pos.x) + ", " + std::to_string(pos.y) + ")");
    const unsigned short* const first = image.row(static_cast<std::uint32_t>(pos.y)) + pos.x;
    Gabor::computeResponses(Gabor::kernelRep<Settings::directions>(), first, image.w(), Gabor::gridStep,
                            data);
}

template <class Settings>
Fn::SignValueVector<int>
FastSpatialGaborConvolver<unsigned short, int, Settings>::getGaborSODs(const FNImage<unsigned short>& image,
                                                                       FNGridPos pos) const {
    constexpr unsigned directions = Settings::directions;
    constexpr std::uint32_t n = Settings::gridPoints;
    ConvolutionData data;
    convolve(image, pos, data);

    std::int32_t codes[n][directions][16];
    for (std::uint32_t y = 0; y < n; ++y)
        for (unsigned d = 0; d < directions; ++d) Gabor::compareInWindow(data, d, y, codes[y][d]);

    namespace Bits = Gabor::WindowBits;
    Fn::SignValueVector<int> signs(size);
    BitWriter writer(signs.exclusiveBytes());
    for (std::uint32_t x = 0; x < n; ++x)
        for (std::uint32_t y = 0; y < n; ++y)
            for (unsigned d = 0; d < directions; ++d) {
                const auto code = static_cast<std::uint32_t>(codes[y][d][x]);
                if (x + 1 < n && y + 1 < n) {
                    writer.write(code, 10); // all five pairs, in their order
                    continue;
                }
                if (x + 1 < n) writer.write(code >> Bits::right & 3, 2);
                if (y + 1 < n) writer.write(code >> Bits::down & 3, 2);
                writer.write(code >> Bits::next & 3, 2);
            }
    writer.finish();
    return signs;
}

template class FastSpatialGaborConvolver<unsigned short, int, SpatialGaborConvolverSettings_T8>;
template class FastSpatialGaborConvolver<unsigned short, int, SpatialGaborConvolverSettings_T8_FinalDecider>;

} // namespace Eye::Cara::Impl

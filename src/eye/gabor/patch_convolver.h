#pragma once

#include "eye/gabor/responses.h"
#include "fn/image.h"

#include <string>
#include <vector>

/// Gabor signs of all windows of a patch at once: the features of the finders of eyes, mouth and nose bridge.
///
///     const FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<25, 25>> convolver;
///     decltype(convolver)::ConvolutionData data;
///     convolver.calculateResponses(patch, data);
///     const std::vector<RowOrientedGaborSods> sods = convolver.getAllGaborSODs(data);
///     for (GSodWindowingIterator<7, 7, 6> window(sods); !window.atEnd(); ++window) ...

namespace Eye::Gabor {

/// A patch of pixels, the grid of responses at each of its pixels but the outer two, and the windows on that
/// grid, whose points are 2 pixels apart.
template <std::uint32_t gridWidth_, std::uint32_t gridHeight_, std::uint32_t windowColumns_,
          std::uint32_t windowRows_>
struct PatchSettings {
    static constexpr unsigned directions = 6;
    static constexpr std::uint32_t gridWidth = gridWidth_, gridHeight = gridHeight_;
    static constexpr std::uint32_t windowColumns = windowColumns_, windowRows = windowRows_;

    static constexpr std::uint32_t getPatchWidth() { return maskSize(gridWidth, 1); }
    static constexpr std::uint32_t getPatchHeight() { return maskSize(gridHeight, 1); }
    static constexpr unsigned getDirsEven() { return 1; }
    static constexpr unsigned getUpperLimitFirstCase() { return directions / 2; }
    /// Real part, imaginary part and magnitude of all points of a window in all directions.
    static constexpr std::uint32_t getFeatureVectorSize() {
        return windowColumns * windowRows * directions * 3;
    }
};

} // namespace Eye::Gabor

namespace Eye::Boca {
/// For the mouth.
struct MConvolverSettings : Gabor::PatchSettings<33, 36, 8, 6> {};
} // namespace Eye::Boca

namespace Eye::Raiz {
/// For the bridge of the nose.
struct MConvolverSettings : Gabor::PatchSettings<32, 32, 8, 8> {};
} // namespace Eye::Raiz

namespace Eye::Ojo::T8 {

/// For an eye, by the size of the grid: 18, 22 or 25 squared.
template <std::uint32_t gridWidth, std::uint32_t gridHeight>
struct ConvolverSettings : Gabor::PatchSettings<gridWidth, gridHeight, 7, 7> {};

/// The comparisons of one phase of a grid of responses: of every second point in x and y, from (px, py) on.
///
/// `bytes` holds 8 bytes for each point, row after row. Let cur be a point, left and up its neighbours in the
/// phase. Byte o, 0 to 5, has the bits of four pairs in direction o, from the lowest up: (left, cur), (up,
/// left), (upper left, cur), (up, cur). Bytes 6 and 7 have those of cur in the directions (5, 0), (0, 1), (1,
/// 2), (2, 3); (3, 4), (4, 5). Each pair has two bits, as in the vector of a single window. Pairs that reach
/// beyond the phase are clear.
struct RowOrientedGaborSods {
    static constexpr std::uint32_t bytesPerPoint = 8;

    std::uint32_t px, py;
    std::uint32_t rows, columns;
    std::vector<unsigned char> bytes;

    const unsigned char* point(std::uint32_t x, std::uint32_t y) const {
        return bytes.data() + (std::size_t{y} * columns + x) * bytesPerPoint;
    }
};

template <class Pixel, class Sum, class Settings> class FastSpatialGaborConvolver;

/// Stateless; all operations may run on any number of threads.
template <class Settings> class FastSpatialGaborConvolver<unsigned short, int, Settings> {
public:
    /// The responses of a patch; may be used again for the next one.
    class ConvolutionData : public Gabor::Responses {
    public:
        ConvolutionData() : Responses(Settings::directions, Settings::gridWidth, Settings::gridHeight) {}
        /// Whether there are responses.
        bool done = false;
    };

    /// @throws FNEBadArg for a patch of another size than the settings'
    void calculateResponses(const FNImage<unsigned short>& patch, ConvolutionData& data) const;

    /// The four phases (0, 0), (1, 0), (0, 1), (1, 1); element px + 2 * py.
    /// @throws FNEBadFunCall if the responses have not been calculated
    std::vector<RowOrientedGaborSods> getAllGaborSODs(const ConvolutionData& data) const;
};

extern template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<18, 18>>;
extern template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<22, 22>>;
extern template class FastSpatialGaborConvolver<unsigned short, int, ConvolverSettings<25, 25>>;
extern template class FastSpatialGaborConvolver<unsigned short, int, Boca::MConvolverSettings>;
extern template class FastSpatialGaborConvolver<unsigned short, int, Raiz::MConvolverSettings>;

} // namespace Eye::Ojo::T8

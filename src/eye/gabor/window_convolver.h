#pragma once

#include "eye/gabor/responses.h"
#include "fn/image.h"
#include "fn/sign_value_vector.h"

#include <string>

/// Gabor sign vectors of a single window: the features of the face finder's later stages.
///
///     const FastSpatialGaborConvolver<unsigned short, int, SpatialGaborConvolverSettings_T8> convolver;
///     const Fn::SignValueVector<int> sods = convolver.getGaborSODs(image, FNGridPos(x, y));
///
/// A vector tells for each pair of neighbouring grid points which one responds more strongly, and on which
/// side of the other its phase lies. So it does not depend on brightness and contrast.

namespace Eye::Cara::Impl {

/// A square grid of `gridPoints` by `gridPoints`, 2 pixels apart, in a mask of `mask` by `mask` pixels.
struct SpatialGaborConvolverSettings_T8 {
    static constexpr unsigned directions = 6;
    static constexpr std::uint32_t gridPoints = 7;
    static constexpr std::uint32_t mask = Gabor::maskSize(gridPoints, Gabor::gridStep);
    static std::string name() { return "Eye::Cara::Impl::SpatialGaborConvolverSettings_T8"; }
};

struct SpatialGaborConvolverSettings_T8_FinalDecider {
    static constexpr unsigned directions = 8;
    static constexpr std::uint32_t gridPoints = 10;
    static constexpr std::uint32_t mask = Gabor::maskSize(gridPoints, Gabor::gridStep);
    static std::string name() { return "Eye::Cara::Impl::SpatialGaborConvolverSettings_T8_FinalDecider"; }
};

/// Number of values of a window's vector: two for each pair.
constexpr std::uint32_t gaborSodSize(std::uint32_t gridPoints, std::uint32_t directions) {
    const std::uint32_t n = gridPoints;
    return 2 * directions * (2 * n * (n - 1) + 2 * (n - 1) * (n - 1) + n * n);
}

template <class Pixel, class Sum, class Settings> class FastSpatialGaborConvolver;

/// Stateless; all operations may run on any number of threads.
template <class Settings> class FastSpatialGaborConvolver<unsigned short, int, Settings> {
public:
    /// The responses of one window.
    class ConvolutionData : public Gabor::Responses {
    public:
        ConvolutionData() : Responses(Settings::directions, Settings::gridPoints, Settings::gridPoints) {}
    };

    /// Number of values of a vector.
    static constexpr std::uint32_t size = gaborSodSize(Settings::gridPoints, Settings::directions);

    /// Responses of the window whose upper left pixel is `pos`.
    /// @throws FNEBadArg if the window does not lie in the image
    void convolve(const FNImage<unsigned short>& image, FNGridPos pos, ConvolutionData& data) const;

    /// The sign vector of that window. Values run over the columns of the grid, in each over its rows, in
    /// each over the directions; for each point and direction p, in this order and as far as the points
    /// exist, they compare p with the point to the right; that with the one below p; p with the one below to
    /// the right; p with the one below; and p with itself in the next direction. The first value of a pair is
    /// positive if the magnitude of the first is not less, the second if Re(second) * Im(first) - Im(second)
    /// * Re(first) is not negative.
    /// @throws FNEBadArg if the window does not lie in the image
    Fn::SignValueVector<int> getGaborSODs(const FNImage<unsigned short>& image, FNGridPos pos) const;
};

extern template class FastSpatialGaborConvolver<unsigned short, int, SpatialGaborConvolverSettings_T8>;
extern template class FastSpatialGaborConvolver<unsigned short, int,
                                                SpatialGaborConvolverSettings_T8_FinalDecider>;

} // namespace Eye::Cara::Impl

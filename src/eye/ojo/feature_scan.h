#pragma once

#include "eye/gabor/windowing_iterator.h"
#include "eye/ojo/search_area.h"
#include "img/pyramid.h"

#include <array>
#include <tuple>
#include <utility>

/// How the finders of facial features look at an area of an image. The training looks in the same way.
///
///     forEachWindow<EyeScan>(image, area, [&](const Fn::SignValueVector<int>& window, FNPos centre, float
///     size) {
///         ...
///     });

namespace Eye::Ojo::T8 {

/// Eye distance in all windows, in pixels of their level.
inline constexpr float trainedEyeSize = 16;

/// Windows of one size on one or more levels of a patch.
/// @tparam Settings those of the convolver of each level
template <class... Settings> struct FeatureScan {
    using Levels = std::tuple<Settings...>;
    using First = std::tuple_element_t<0, Levels>;

    static constexpr std::uint32_t patchWidth = First::getPatchWidth(), patchHeight = First::getPatchHeight();
    static constexpr std::uint32_t columns = First::windowColumns, rows = First::windowRows;
};

/// Eyes: a patch at three scales.
struct EyeScan
    : FeatureScan<ConvolverSettings<25, 25>, ConvolverSettings<22, 22>, ConvolverSettings<18, 18>> {
    static constexpr std::array<float, 3> scaleFactors{1.0f, 29.0f / 26.0f, 29.0f / 22.0f};
    static constexpr FNPos windowCentre{8.5f, 8.5f};
};

/// The windows of one level.
/// @param toImage from pixels of the patch to those of the image
template <class Settings, class Visit>
void forEachWindowOfLevel(const Img::ScaledImage<unsigned short>& level, const Img::Affine::Mapping& toImage,
                          FNPos windowCentre, Visit& visit) {
    using Convolver = FastSpatialGaborConvolver<unsigned short, int, Settings>;
    const Convolver convolver;
    typename Convolver::ConvolutionData responses;
    convolver.calculateResponses(level.image, responses);
    const std::vector<RowOrientedGaborSods> phases = convolver.getAllGaborSODs(responses);

    const Img::Affine::Mapping map = level.mapping.compose(toImage);
    const float size = trainedEyeSize * std::sqrt(std::abs(map.m0 * map.m3 - map.m1 * map.m2));
    using Windows =
        GSodWindowingIterator<Settings::windowColumns, Settings::windowRows, Settings::directions>;
    for (Windows window(phases); !window.atEnd(); ++window)
        visit(*window, map(FNPos(window.position()) + windowCentre), size);
}

/// Cuts the area from the image, black outside of it, and calls visit(window, centre, size) for every window
/// of every level, level by level: the signs in the layout of the scan, the centre of the window in image
/// pixels, and the eye distance in image pixels that the level stands for.
template <class Scan, class Visit>
void forEachWindow(const FNImage<unsigned short>& image, const SearchArea& area, Visit visit) {
    FNImage<unsigned short> patch(Scan::patchWidth, Scan::patchHeight);
    const Img::Affine::Mapping toImage =
        Img::Affine::transform(image, patch, area.origin, area.u, area.v, true, 0);
    const Img::SuccessiveScaledPyramid<Img::PyramidScaling<unsigned short>, 0> pyramid(
        patch, {Scan::scaleFactors.begin(), Scan::scaleFactors.end()});
    [&]<std::size_t... i>(std::index_sequence<i...>) {
        (forEachWindowOfLevel<std::tuple_element_t<i, typename Scan::Levels>>(pyramid[i], toImage,
                                                                              Scan::windowCentre, visit),
         ...);
    }
    (std::make_index_sequence<std::tuple_size_v<typename Scan::Levels>>());
}

} // namespace Eye::Ojo::T8

#include "eye/cara/face_pyramid.h"

#include <cmath>

namespace Eye::Cara::T8 {
namespace {

constexpr int border = 8;
constexpr float maskSize = 17;
/// The point of the mask that a search box speaks of: between the eyes.
constexpr FNPos anchor{8.5f, 5.987774f};

FNGridPos toGrid(FNPos pos) {
    return FNGridPos(pos);
}

} // namespace

Img::ScaledImage<unsigned short> addBorder(const Img::ScaledImage<unsigned short>& level,
                                           const FNBox& searchBox) {
    const Img::Affine::Mapping toLevel = level.mapping.inverse();
    const auto corner = [&](std::int32_t x, std::int32_t y) {
        return toLevel(FNPos{static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f});
    };
    const FNGridPos a = toGrid(corner(searchBox.x0, searchBox.y0) - anchor);
    const FNGridPos b = toGrid(corner(searchBox.x1, searchBox.y1) + FNPos{maskSize, maskSize} - anchor);
    const FNBox wanted{std::min(a.x, b.x), std::min(a.y, b.y), std::max(a.x, b.x), std::max(a.y, b.y)};
    const FNBox inside = level.image.box();
    const FNBox region =
        wanted & FNBox{inside.x0 - border, inside.y0 - border, inside.x1 + border, inside.y1 + border};

    Img::ScaledImage<unsigned short> result{{region.width(), region.height()}, {}};
    const FNPos origin{static_cast<float>(region.x0), static_cast<float>(region.y0)};
    result.mapping = Img::Affine::Mapping::scaling(1, 1, origin).compose(level.mapping);
    if (result.image.empty()) return result;

    result.image.fill(0);
    const FNBox copied = region & inside;
    unsigned short* const pixels = result.image.getExclusive();
    for (std::int32_t y = copied.y0; y < copied.y1; ++y) {
        const unsigned short* const from = level.image.row(static_cast<std::uint32_t>(y));
        std::copy(from + copied.x0, from + copied.x1,
                  pixels + static_cast<std::size_t>(y - region.y0) * result.image.w() +
                      (copied.x0 - region.x0));
    }
    return result;
}

} // namespace Eye::Cara::T8

#include "img/local_equalization.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

/// Position of tile i along one axis.
int tilePosition(int i, int size, int tile, int step) {
    return static_cast<int>(std::min<std::int64_t>(std::int64_t{i} * step, size - tile));
}

int numberOfTiles(int size, int tile, int step) {
    const int room = size - tile;
    return room / step + 1 + (room % step != 0);
}

template <class T> T toPixel(float value) {
    if constexpr (std::is_floating_point_v<T>)
        return value;
    else
        return static_cast<T>(std::lround(value));
}

template <class T>
FNImage<T> equalizeLocally(const FNImage<T>& image, int dx, int dy, unsigned tileWidth, unsigned tileHeight,
                           T min, T max) {
    constexpr unsigned most = std::numeric_limits<int>::max();
    const NearlyRegularGrid<T> grid(image, dx, dy, static_cast<int>(std::min(tileWidth, most)),
                                    static_cast<int>(std::min(tileHeight, most)));
    std::vector<HistogramEqualizer<T>> equalizers;
    for (int j = 0; j < grid.ny(); ++j)
        for (int i = 0; i < grid.nx(); ++i) equalizers.emplace_back(image, grid.box(i, j), min, max);

    std::vector<typename NearlyRegularGrid<T>::Neighbours> columns;
    for (std::uint32_t x = 0; x < image.w(); ++x) columns.push_back(grid.alongX(static_cast<int>(x)));

    FNImage<T> result(image.w(), image.h());
    T* out = result.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y) {
        const auto rows = grid.alongY(static_cast<int>(y));
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            const auto& column = columns[x];
            const T pixel = image(x, y);
            const auto inRow = [&](int j) {
                const auto at = [&](int i) {
                    return static_cast<float>(equalizers[static_cast<std::size_t>(j * grid.nx() + i)](pixel));
                };
                if (column.first == column.second) return at(column.first);
                return (1 - column.weight) * at(column.first) + column.weight * at(column.second);
            };
            *out++ = toPixel<T>(rows.first == rows.second ? inRow(rows.first)
                                                          : (1 - rows.weight) * inRow(rows.first) +
                                                                rows.weight * inRow(rows.second));
        }
    }
    return result;
}

} // namespace

template <class T>
NearlyRegularGrid<T>::NearlyRegularGrid(const FNImage<T>& image, int dx, int dy, int tileWidth,
                                        int tileHeight)
    : image_(image), dx_(dx), dy_(dy), tileWidth_(tileWidth), tileHeight_(tileHeight),
      halfTileWidth_(static_cast<float>(tileWidth) / 2), halfTileHeight_(static_cast<float>(tileHeight) / 2) {
    const FNBox all = image.box();
    if (tileWidth <= 0 || tileHeight <= 0 || dx <= 0 || dy <= 0 || all.x1 < tileWidth || all.y1 < tileHeight)
        FN_THROW(FNEBadArg, "NearlyRegularGrid: invalid parameters");
    nx_ = numberOfTiles(all.x1, tileWidth, dx);
    ny_ = numberOfTiles(all.y1, tileHeight, dy);
}

template <class T> FNGridPos NearlyRegularGrid<T>::corner(int i, int j) const {
    return {tilePosition(i, image_.box().x1, tileWidth_, dx_),
            tilePosition(j, image_.box().y1, tileHeight_, dy_)};
}

template <class T> FNBox NearlyRegularGrid<T>::box(int i, int j) const {
    const FNGridPos p = corner(i, j);
    return {p.x, p.y, p.x + tileWidth_, p.y + tileHeight_};
}

template <class T> auto NearlyRegularGrid<T>::alongX(int x) const -> Neighbours {
    return neighbours(x, image_.box().x1, tileWidth_, halfTileWidth_, dx_, nx_);
}
template <class T> auto NearlyRegularGrid<T>::alongY(int y) const -> Neighbours {
    return neighbours(y, image_.box().y1, tileHeight_, halfTileHeight_, dy_, ny_);
}

template <class T>
auto NearlyRegularGrid<T>::neighbours(int x, int size, int tile, float halfTile, int step, int tiles)
    -> Neighbours {
    const int half = tile / 2;
    if (tiles == 1 || x < half) return {0, 0, 0};
    if (x >= size - half) return {tiles - 1, tiles - 1, 0};
    const int i = std::min((x - half) / step, tiles - 2);
    const int low = tilePosition(i, size, tile, step), high = tilePosition(i + 1, size, tile, step);
    return {i, i + 1, (static_cast<float>(x - low) - halfTile) / static_cast<float>(high - low)};
}

template class NearlyRegularGrid<float>;
template class NearlyRegularGrid<short>;

FNImage<float> imgLocalAdaptiveHistogramEqualization(const FNImage<float>& image, int dx, int dy,
                                                     unsigned tileWidth, unsigned tileHeight, float min,
                                                     float max) {
    return equalizeLocally(image, dx, dy, tileWidth, tileHeight, min, max);
}
FNImage<short> imgLocalAdaptiveHistogramEqualization(const FNImage<short>& image, int dx, int dy,
                                                     unsigned tileWidth, unsigned tileHeight, short min,
                                                     short max) {
    return equalizeLocally(image, dx, dy, tileWidth, tileHeight, min, max);
}

#include "img/local_filters.h"

#include <algorithm>
#include <vector>

namespace {

/// The part of the box whose pixels have all eight neighbours.
template <class T> FNBox inner(const FNImage<T>& image, const FNBox& box) {
    const FNBox all = image.box();
    return box & FNBox{1, 1, all.x1 - 1, all.y1 - 1};
}

/// Calls `onRow(first pixel of the row above, number of pixels, out)` for each row of `part`; the pixels are
/// those to the left of the first one.
template <class T, class R, class OnRow>
void forRows(const FNImage<T>& image, const FNBox& part, R* out, OnRow onRow) {
    for (std::int32_t y = part.y0; y < part.y1; ++y, out += part.width())
        onRow(image.row(static_cast<std::uint32_t>(y - 1)) + part.x0 - 1, part.width(), out);
}

template <class T> void sort2(T& a, T& b) {
    const T low = std::min(a, b);
    b = std::max(a, b);
    a = low;
}

/// The exchanges that bring the median of 9 values to the middle (N. Devillard, "Fast median search", 1998).
constexpr std::pair<int, int> medianExchanges[] = {{1, 2}, {4, 5}, {7, 8}, {0, 1}, {3, 4}, {6, 7}, {1, 2},
                                                   {4, 5}, {7, 8}, {0, 3}, {5, 8}, {4, 7}, {3, 6}, {1, 4},
                                                   {2, 5}, {4, 7}, {4, 2}, {6, 4}, {4, 2}};

} // namespace

template <class T> FNImage<T> imgMedian3x3(const FNImage<T>& image, const FNBox& box) {
    const FNBox part = inner(image, box);
    FNImage<T> result(part.width(), part.height());
    const std::uint32_t w = image.w();
    forRows(image, part, result.getExclusive(), [&](const T* above, std::uint32_t n, T* out) {
        for (std::uint32_t x = 0; x < n; ++x, ++above) {
            T v[9] = {above[0],     above[1],     above[2],         above[w],        above[w + 1],
                      above[w + 2], above[2 * w], above[2 * w + 1], above[2 * w + 2]};
            for (const auto& [a, b] : medianExchanges) sort2(v[a], v[b]);
            out[x] = v[4];
        }
    });
    return result;
}

template <class T> FNImage<T> imgMean(const FNImage<T>& image, int width, int height, const FNBox& box) {
    if (width <= 0 || height <= 0) FN_THROW(FNEBadArg, "imgMean: the window has no pixels");
    using Sum = std::conditional_t<std::is_floating_point_v<T>, double, std::int64_t>;
    const FNBox part = box & image.box();
    const auto w = static_cast<std::int64_t>(part.width()), h = static_cast<std::int64_t>(part.height());
    FNImage<T> result(part.width(), part.height());
    T* out = result.getExclusive();
    const auto row = [&](std::int64_t y) {
        return image.row(static_cast<std::uint32_t>(part.y0 + y)) + part.x0;
    };

    // Sums of the window's rows for each column, and from them along the row.
    std::vector<Sum> columns(part.width());
    std::int64_t top = 0, bottom = 0; // rows in the sums
    for (std::int64_t y = 0; y < h; ++y) {
        const std::int64_t newTop = std::max<std::int64_t>(0, y - height / 2),
                           newBottom = std::min(h, y - height / 2 + height);
        for (; bottom < newBottom; ++bottom)
            for (std::int64_t x = 0; x < w; ++x) columns[x] += row(bottom)[x];
        for (; top < newTop; ++top)
            for (std::int64_t x = 0; x < w; ++x) columns[x] -= row(top)[x];
        Sum sum{};
        std::int64_t left = 0, right = 0;
        for (std::int64_t x = 0; x < w; ++x) {
            const std::int64_t newLeft = std::max<std::int64_t>(0, x - width / 2),
                               newRight = std::min(w, x - width / 2 + width);
            while (right < newRight) sum += columns[right++];
            while (left < newLeft) sum -= columns[left++];
            *out++ = static_cast<T>(sum / static_cast<Sum>((right - left) * (bottom - top)));
        }
    }
    return result;
}

template <class T> FNImage<unsigned char> imgCensusTransform3x3(const FNImage<T>& image, const FNBox& box) {
    const FNBox part = inner(image, box);
    FNImage<unsigned char> result(part.width(), part.height());
    const std::uint32_t w = image.w();
    forRows(image, part, result.getExclusive(), [&](const T* above, std::uint32_t n, unsigned char* out) {
        const std::uint32_t neighbours[8] = {0, 1, 2, w, w + 2, 2 * w, 2 * w + 1, 2 * w + 2};
        for (std::uint32_t x = 0; x < n; ++x, ++above) {
            unsigned code = 0;
            for (const std::uint32_t neighbour : neighbours)
                code = code << 1 | (above[w + 1] > above[neighbour]);
            out[x] = static_cast<unsigned char>(code);
        }
    });
    return result;
}

std::array<int, 256> imgGrayHistogram(const FNImage<unsigned char>& image) {
    return imgGrayHistogram(image, [](FNGridPos) { return true; });
}

template FNImage<float> imgMedian3x3(const FNImage<float>&, const FNBox&);
template FNImage<unsigned char> imgMedian3x3(const FNImage<unsigned char>&, const FNBox&);
template FNImage<unsigned short> imgMedian3x3(const FNImage<unsigned short>&, const FNBox&);
template FNImage<short> imgMedian3x3(const FNImage<short>&, const FNBox&);
template FNImage<int> imgMedian3x3(const FNImage<int>&, const FNBox&);
template FNImage<float> imgMean(const FNImage<float>&, int, int, const FNBox&);
template FNImage<unsigned char> imgMean(const FNImage<unsigned char>&, int, int, const FNBox&);
template FNImage<unsigned short> imgMean(const FNImage<unsigned short>&, int, int, const FNBox&);
template FNImage<unsigned char> imgCensusTransform3x3(const FNImage<float>&, const FNBox&);
template FNImage<unsigned char> imgCensusTransform3x3(const FNImage<unsigned char>&, const FNBox&);
template FNImage<unsigned char> imgCensusTransform3x3(const FNImage<unsigned short>&, const FNBox&);

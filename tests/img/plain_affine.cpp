#include "plain_affine.h"

#include "img/affine/rothstein.h"

#include <cmath>
#include <numeric>

namespace Plain {

namespace {

using Widths = std::vector<std::uint32_t>;

/// Common length of the i-th interval of `a` and the j-th of `b`, each laid end to end from 0.
std::int64_t overlap(const Widths& a, std::uint32_t i, const Widths& b, std::uint32_t j) {
    const auto start = [](const Widths& widths, std::uint32_t n) {
        return std::accumulate(widths.begin(), widths.begin() + n, std::int64_t{0});
    };
    const std::int64_t a0 = start(a, i), b0 = start(b, j);
    return std::max<std::int64_t>(0, std::min(a0 + a[i], b0 + b[j]) - std::max(a0, b0));
}

/// weights[x][i] of source pixel i in result pixel x.
std::vector<Widths> weightTable(const Widths& source, const Widths& result) {
    std::vector<Widths> table(result.size(), Widths(source.size()));
    for (std::uint32_t x = 0; x < result.size(); ++x)
        for (std::uint32_t i = 0; i < source.size(); ++i)
            table[x][i] = static_cast<std::uint32_t>(overlap(source, i, result, x));
    return table;
}

/// Applies `finish(sum, x, y)` to the weighted sums of all result pixels.
template <class Finish>
Words weighted(const Words& src, const FNBox& box, const std::vector<Widths>& xs,
               const std::vector<Widths>& ys, Finish finish) {
    Words result(static_cast<std::uint32_t>(xs.size()), static_cast<std::uint32_t>(ys.size()));
    for (std::int32_t y = 0; y < static_cast<std::int32_t>(result.h()); ++y)
        for (std::int32_t x = 0; x < static_cast<std::int32_t>(result.w()); ++x) {
            std::uint64_t sum = 0;
            for (std::uint32_t j = 0; j < box.height(); ++j)
                for (std::uint32_t i = 0; i < box.width(); ++i)
                    sum += std::uint64_t{ys[y][j]} * xs[x][i] * src(box.x0 + i, box.y0 + j);
            result.set({x, y}, finish(sum, x, y));
        }
    return result;
}

Words quotients(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h, std::uint32_t units) {
    const Widths nx = imgRothsteinCode(box.width() * units, w),
                 ny = imgRothsteinCode(box.height() * units, h);
    return weighted(src, box, weightTable(Widths(box.width(), units), nx),
                    weightTable(Widths(box.height(), units), ny), [&](std::uint64_t sum, int x, int y) {
                        if (sum >> 32) return static_cast<unsigned short>(sum / (nx[x] * ny[y]));
                        const std::uint32_t r = 0xFFFFFFFFu / (nx[x] * ny[y]),
                                            s = static_cast<std::uint32_t>(sum);
                        const std::uint32_t rh = r >> 16, rl = r & 0xFFFF, sh = s >> 16, sl = s & 0xFFFF;
                        return static_cast<unsigned short>(((sh * rl) >> 16) + ((sl * rh) >> 16) + sh * rh);
                    });
}

/// Interpolation at one position in units of 2^-15, of the four pixels around it.
unsigned short interpolated(const Words& src, long ix, long iy, long fx, long fy) {
    const auto at = [&](long x, long y) {
        return static_cast<long>(src(static_cast<std::uint32_t>(std::min<long>(x, src.w() - 1)),
                                     static_cast<std::uint32_t>(std::min<long>(y, src.h() - 1))));
    };
    const long t = at(ix, iy) + (((at(ix + 1, iy) - at(ix, iy)) * fx) >> 15);
    const long s = at(ix, iy + 1) + (((at(ix + 1, iy + 1) - at(ix, iy + 1)) * fx) >> 15);
    return static_cast<unsigned short>(t + (((s - t) * fy) >> 15));
}

} // namespace

Words destinationAligned(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h) {
    int bits = 7;
    if (box.width() > 2 * w) bits = 6;
    if (box.width() > 4 * w) bits = 5;
    if (box.width() > 8 * w) bits = 4;
    while (box.height() > h * (1u << (8 - bits))) --bits;
    const std::uint32_t m = 1u << bits;
    return weighted(
        src, box, weightTable(imgRothsteinCode(m * w, box.width()), Widths(w, m)),
        weightTable(imgRothsteinCode(m * h, box.height()), Widths(h, m)),
        [&](std::uint64_t sum, int, int) { return static_cast<unsigned short>(sum >> (2 * bits)); });
}

Words sourceAligned(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h) {
    const float f = static_cast<float>(box.width()) / static_cast<float>(w);
    const int step =
        std::max(1, static_cast<int>(std::floor(std::log2(f))) + 1); // 1 for f < 2, 2 below 4, ...
    return quotients(src, box, w, h, step >= 8 ? 1 : 256u >> step);
}

Words integerAverage(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h) {
    return quotients(src, box, w, h, 1);
}

Words fourToThree(const Words& src) {
    static constexpr std::uint32_t weights[3][4] = {{3, 1, 0, 0}, {0, 2, 2, 0}, {0, 0, 1, 3}};
    Words result(3 * (src.w() / 4) + src.w() % 4, 3 * (src.h() / 4) + src.h() % 4);
    for (std::uint32_t y = 0; y < result.h(); ++y)
        for (std::uint32_t x = 0; x < result.w(); ++x) {
            std::uint32_t sum = 0;
            for (std::uint32_t r = 0; r < 4; ++r)
                for (std::uint32_t c = 0; c < 4; ++c) {
                    const std::uint32_t sx = x / 3 * 4 + c, sy = y / 3 * 4 + r;
                    if (sx < src.w() && sy < src.h())
                        sum += weights[y % 3][r] * weights[x % 3][c] * src(sx, sy);
                }
            result.set(FNGridPos(FN2Vector<std::uint32_t>(x, y)), static_cast<unsigned short>(sum >> 4));
        }
    return result;
}

template <class T>
FNImage<double> areaMean(const FNImage<T>& src, const FNBox& box, std::uint32_t w, std::uint32_t h) {
    FNImage<double> result(w, h);
    const double fx = static_cast<double>(box.width()) / w, fy = static_cast<double>(box.height()) / h;
    const auto common = [](std::uint32_t i, double low, double high) {
        return std::max(0.0, std::min(i + 1.0, high) - std::max<double>(i, low));
    };
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t x = 0; x < w; ++x) {
            double sum = 0;
            for (std::uint32_t j = 0; j < box.height(); ++j)
                for (std::uint32_t i = 0; i < box.width(); ++i)
                    sum += common(i, x * fx, (x + 1) * fx) * common(j, y * fy, (y + 1) * fy) *
                           static_cast<double>(src(box.x0 + i, box.y0 + j));
            result.set(FNGridPos(FN2Vector<std::uint32_t>(x, y)), sum / (fx * fy));
        }
    return result;
}
template FNImage<double> areaMean(const FNImage<float>&, const FNBox&, std::uint32_t, std::uint32_t);
template FNImage<double> areaMean(const FNImage<unsigned short>&, const FNBox&, std::uint32_t, std::uint32_t);

Words bilinearBox(const Words& src, const FNBox& box, std::uint32_t w, std::uint32_t h) {
    Words result(w, h);
    const float dx = static_cast<float>(box.width()) / static_cast<float>(w);
    const float dy = static_cast<float>(box.height()) / static_cast<float>(h);
    const long x0 = static_cast<long>((dx / 2 + static_cast<float>(box.x0)) * 32768) - 0x4000;
    const long y0 = static_cast<long>((dy / 2 + static_cast<float>(box.y0)) * 32768) - 0x4000;
    const long sx = static_cast<long>(dx * 32768), sy = static_cast<long>(dy * 32768);
    const auto clamped = [](long& index, long& fraction, long size) {
        if (index * 32768 + fraction <= 0x3FFF) index = fraction = 0;
        if (index >= size - 1) index = size - 1, fraction = 0;
    };
    for (std::uint32_t j = 0; j < h; ++j)
        for (std::uint32_t i = 0; i < w; ++i) {
            const long x = x0 + i * sx, y = y0 + j * sy;
            long ix = x >> 15, fx = x & 0x7FFF, iy = y >> 15, fy = y & 0x7FFF;
            clamped(ix, fx, src.w());
            clamped(iy, fy, src.h());
            result.set(FNGridPos(FN2Vector<std::uint32_t>(i, j)), interpolated(src, ix, iy, fx, fy));
        }
    return result;
}

Words bilinear(const Words& src, std::uint32_t w, std::uint32_t h, FNPos origin, FN2Vector<float> u,
               FN2Vector<float> v, const std::function<unsigned short()>& outside) {
    Words result(w, h);
    const FN2Vector<float> du = u / static_cast<float>(w), dv = v / static_cast<float>(h);
    const auto fixed = [](float f) { return static_cast<long>(f * 32768); };
    const long width = src.w() * 32768L, height = src.h() * 32768L;
    for (std::uint32_t j = 0; j < h; ++j)
        for (std::uint32_t i = 0; i < w; ++i) {
            const long x = fixed(du.x / 2 + dv.x / 2 + origin.x) - 0x4000 + i * fixed(du.x) + j * fixed(dv.x);
            const long y = fixed(du.y / 2 + dv.y / 2 + origin.y) - 0x4000 + i * fixed(du.y) + j * fixed(dv.y);
            const FNGridPos pos(FN2Vector<std::uint32_t>(i, j));
            if (x < -0x8000 || x > width || y < -0x8000 || y > height) {
                result.set(pos, outside());
                continue;
            }
            long ix = x >> 15, fx = x & 0x7FFF, iy = y >> 15, fy = y & 0x7FFF;
            if (x < 0) ix = fx = 0;
            if (y < 0) iy = fy = 0;
            if (x > width - 32768) ix = src.w() - 1, fx = 0;
            if (y > height - 32768) iy = src.h() - 1, fy = 0;
            result.set(pos, interpolated(src, ix, iy, fx, fy));
        }
    return result;
}

} // namespace Plain

#include "eye/gabor/responses.h"

namespace Eye::Gabor::Plain {
namespace {

/// Divides by 2^16, toward zero.
std::int32_t shifted(std::int32_t v) {
    return v < 0 ? -(-v >> 16) : v >> 16;
}

/// Sum of five numbers `stride` apart, weighted by the taps.
template <class T>
std::int32_t weighted(const KernelTable::Taps& weights, const T* first, std::size_t stride) {
    std::int32_t sum = 0;
    for (unsigned t = 0; t < taps; ++t) sum += static_cast<std::int32_t>(first[t * stride]) * weights[t];
    return sum;
}

/// All rows of the mask convolved with one kernel, at the grid columns.
class RowPass {
public:
    RowPass(const KernelTable::Taps& weights, const unsigned short* pixels, std::size_t pixelStride,
            std::uint32_t step, const Responses& grid)
        : columns_(grid.columns()), step_(step), values_(columns_ * maskSize(grid.rows(), step)) {
        for (std::size_t i = 0; i < values_.size(); ++i)
            values_[i] =
                shifted(weighted(weights, pixels + i / columns_ * pixelStride + i % columns_ * step, 1));
    }
    /// Sum down the column of a grid point.
    std::int32_t column(const KernelTable::Taps& weights, std::uint32_t x, std::uint32_t y) const {
        return weighted(weights, values_.data() + std::size_t{y} * step_ * columns_ + x, columns_);
    }

private:
    std::size_t columns_;
    std::uint32_t step_;
    std::vector<std::int32_t> values_;
};

struct Point {
    std::int32_t re, im, mag;
};

Point at(const Responses& r, unsigned d, std::int64_t x, std::int64_t y) {
    const std::size_t i = r.row(d, static_cast<std::uint32_t>(y)) + static_cast<std::size_t>(x);
    return {r.re()[i], r.im()[i], r.mag()[i]};
}

/// The two bits of a pair.
std::int32_t compare(const Point& a, const Point& b) {
    return (a.mag >= b.mag) | (b.re * a.im - b.im * a.re >= 0) << 1;
}

} // namespace

void computeResponses(const KernelTable& k, const unsigned short* pixels, std::size_t pixelStride,
                      std::uint32_t step, Responses& r) {
    const unsigned D = k.directions;
    const auto store = [&](unsigned d, std::uint32_t x, std::uint32_t y, std::int32_t re, std::int32_t im) {
        const std::size_t i = r.row(d, y) + x;
        r.re()[i] = shifted(re);
        r.im()[i] = shifted(im);
        r.mag()[i] = r.re()[i] * r.re()[i] + r.im()[i] * r.im()[i];
    };
    const auto forPoints = [&](auto operation) {
        for (std::uint32_t y = 0; y < r.rows(); ++y)
            for (std::uint32_t x = 0; x < r.columns(); ++x) operation(x, y);
    };
    const auto rowPass = [&](const KernelTable::Taps& weights) {
        return RowPass(weights, pixels, pixelStride, step, r);
    };

    const RowPass gauss = rowPass(k.gauss);
    forPoints([&](std::uint32_t x, std::uint32_t y) {
        store(D / 2, x, y, gauss.column(k.dc, x, y) + gauss.column(k.cosY[D / 2], x, y),
              gauss.column(k.sinY[D / 2], x, y));
    });
    for (unsigned m = 0; m < D / 2; ++m) {
        const RowPass c = rowPass(k.cosX[m]), s = rowPass(k.sinX[m]);
        forPoints([&](std::uint32_t x, std::uint32_t y) {
            const std::int32_t dc = gauss.column(k.dc, x, y);
            if (m == 0) return store(0, x, y, dc + c.column(k.gauss, x, y), s.column(k.gauss, x, y));
            const std::int32_t A = dc + c.column(k.cosY[m], x, y), B = s.column(k.sinY[m], x, y);
            const std::int32_t E = s.column(k.cosY[m], x, y), F = c.column(k.sinY[m], x, y);
            store(m, x, y, A - B, F + E);
            store(D - m, x, y, A + B, F - E);
        });
    }
}

void compareInWindow(const Responses& r, unsigned d, std::uint32_t y, std::int32_t* codes) {
    const bool hasDown = y + 1 < r.rows();
    for (std::uint32_t x = 0; x < r.columns(); ++x) {
        const bool hasRight = x + 1 < r.columns();
        const Point p = at(r, d, x, y);
        codes[x] = compare(p, at(r, (d + 1) % r.directions(), x, y)) << WindowBits::next;
        if (hasRight) codes[x] |= compare(p, at(r, d, x + 1, y)) << WindowBits::right;
        if (hasDown) codes[x] |= compare(p, at(r, d, x, y + 1)) << WindowBits::down;
        if (hasRight && hasDown)
            codes[x] |= compare(at(r, d, x + 1, y), at(r, d, x, y + 1)) << WindowBits::diagonal |
                        compare(p, at(r, d, x + 1, y + 1)) << WindowBits::downRight;
    }
}

void compareInPatch(const Responses& r, std::uint32_t y, unsigned char* const bytes[8]) {
    const unsigned D = r.directions();
    for (std::uint32_t x = 0; x < r.columns(); ++x) {
        std::int32_t pairs = 0;
        for (unsigned d = 0; d < D; ++d) {
            const Point cur = at(r, d, x, y);
            std::int32_t byte = 0;
            if (x >= 2) byte |= compare(at(r, d, x - 2, y), cur);
            if (x >= 2 && y >= 2)
                byte |= compare(at(r, d, x, y - 2), at(r, d, x - 2, y)) << 2 |
                        compare(at(r, d, x - 2, y - 2), cur) << 4;
            if (y >= 2) byte |= compare(at(r, d, x, y - 2), cur) << 6;
            bytes[d][x] = static_cast<unsigned char>(byte);
            pairs |= compare(at(r, (d + D - 1) % D, x, y), cur) << 2 * d;
        }
        bytes[6][x] = static_cast<unsigned char>(pairs);
        bytes[7][x] = static_cast<unsigned char>(pairs >> 8);
    }
}

} // namespace Eye::Gabor::Plain

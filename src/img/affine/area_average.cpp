#include "img/affine/area_average.h"

#include "img/affine/area_kernels.h"

#include <algorithm>
#include <array>
#include <type_traits>
#include <vector>

namespace Img::Affine {

namespace {

using Kernels::NarrowWindows;

/// The type in which pixels are summed up.
template <class T> using Sum = std::conditional_t<std::is_floating_point_v<T>, T, std::uint32_t>;

template <std::uint32_t taps, class S> void reduceOf(const S* columns, const Overlap& x, S* out) {
    const std::uint32_t* weight = x.weights.data();
    for (std::uint32_t i = 0; i < x.size(); ++i, weight += taps) {
        const S* const from = columns + x.first[i];
        S sum{};
        for (std::uint32_t k = 0; k < taps; ++k) sum += static_cast<S>(weight[k]) * from[k];
        out[i] = sum;
    }
}

/// Weighted sums along a row of sums; `columns` has `taps` zeros behind its end.
template <class S> void reduce(const S* columns, const Overlap& x, S* out) {
    switch (x.taps) {
    case 1:
        return reduceOf<1>(columns, x, out);
    case 2:
        return reduceOf<2>(columns, x, out);
    case 3:
        return reduceOf<3>(columns, x, out);
    case 4:
        return reduceOf<4>(columns, x, out);
    case 5:
        return reduceOf<5>(columns, x, out);
    case 6:
        return reduceOf<6>(columns, x, out);
    case 7:
        return reduceOf<7>(columns, x, out);
    case 8:
        return reduceOf<8>(columns, x, out);
    default:
        break;
    }
    for (std::uint32_t i = 0; i < x.size(); ++i) {
        const S* const from = columns + x.first[i];
        const std::uint32_t* const weight = x.weight(i);
        S sum{};
        for (std::uint32_t k = 0; k < x.count[i]; ++k) sum += static_cast<S>(weight[k]) * from[k];
        out[i] = sum;
    }
}

/// Gives the weighted sums of the result's rows, from top to bottom. Columns first: each source pixel meets
/// the vector unit once, and only the result's rows are summed up along x.
template <class T> class ColumnsFirst {
public:
    ColumnsFirst(const FNImage<T>& src, const AreaGrid& grid)
        : src_(src), grid_(grid), rows_(grid.y.taps), columns_(grid.box.width() + grid.x.taps) {}

    void sums(std::uint32_t y, Sum<T>* out) {
        const std::uint32_t count = grid_.y.count[y];
        for (std::uint32_t k = 0; k < count; ++k)
            rows_[k] = src_.row(grid_.box.y0 + grid_.y.first[y] + k) + grid_.box.x0;
        Kernels::combineRows({rows_.data(), count}, grid_.y.weight(y), columns_.data(), grid_.box.width());
        reduce(columns_.data(), grid_.x, out);
    }

private:
    const FNImage<T>& src_;
    const AreaGrid& grid_;
    std::vector<const T*> rows_;
    std::vector<Sum<T>> columns_;
};

/// As ColumnsFirst, for narrow windows of 16-bit pixels: rows first, since shuffles do that for 4 or 8 result
/// pixels at a time. A row that two result rows share is summed up once.
class RowsFirst {
public:
    static bool suits(const AreaGrid& grid) { return grid.y.taps <= 8 && NarrowWindows::suits(grid.x); }

    RowsFirst(const FNImage<unsigned short>& src, const AreaGrid& grid)
        : src_(src), grid_(grid), windows_(grid.x), rows_(grid.y.taps),
          ring_(grid.y.taps * windows_.paddedSize()) {}

    void sums(std::uint32_t y, std::uint32_t* out) {
        const std::uint32_t count = grid_.y.count[y], first = grid_.y.first[y];
        for (std::uint32_t k = 0; k < count; ++k) {
            std::uint32_t* const row = ring_.data() + (first + k) % grid_.y.taps * windows_.paddedSize();
            if (first + k >= next_) windows_.sums(sourceRow(next_ = first + k), row), ++next_;
            rows_[k] = row;
        }
        Kernels::combineRows({rows_.data(), count}, grid_.y.weight(y), out, grid_.x.size());
    }

private:
    /// A row that may be read a little beyond its end.
    const unsigned short* sourceRow(std::uint32_t j) {
        const unsigned short* const row = src_.row(grid_.box.y0 + j) + grid_.box.x0;
        const std::uint64_t rest = static_cast<std::uint64_t>(src_.data() + src_.size() - row);
        const std::uint32_t width = grid_.box.width();
        if (rest >= std::uint64_t{width} + NarrowWindows::overread) return row;
        lastRow_.resize(width + NarrowWindows::overread);
        std::copy_n(row, width, lastRow_.begin());
        return lastRow_.data();
    }

    const FNImage<unsigned short>& src_;
    const AreaGrid& grid_;
    const NarrowWindows windows_;
    std::vector<const std::uint32_t*> rows_;
    std::vector<std::uint32_t> ring_; ///< the sums of source row j at j % taps
    std::uint32_t next_ = 0;          ///< first source row that has no sums yet
    std::vector<unsigned short> lastRow_;
};

/// What the sums of a result row are multiplied with, by column. There are at most two heights of rows.
template <class F> class Reciprocals {
public:
    explicit Reciprocals(const Overlap& x) : x_(x) {}

    const F* ofHeight(std::uint32_t height) {
        for (const Row& row : rows_)
            if (row.height == height) return row.factors.data();
        Row& row = rows_[replaced_ ^= 1];
        row.height = height;
        row.factors.resize(x_.size());
        for (std::uint32_t i = 0; i < x_.size(); ++i) {
            const std::uint32_t units = x_.width[i] * height;
            if constexpr (std::is_floating_point_v<F>)
                row.factors[i] = 1 / static_cast<F>(units);
            else
                row.factors[i] = 0xFFFFFFFFu / units;
        }
        return row.factors.data();
    }

private:
    struct Row {
        std::uint32_t height = 0;
        std::vector<F> factors;
    };
    const Overlap& x_;
    std::array<Row, 2> rows_;
    int replaced_ = 1;
};

template <class Sums, class Finish>
void averageRows(Sums&& rowSums, const AreaGrid& grid, auto& dst, Finish finish) {
    auto* const out = dst.getExclusive();
    using S = Sum<std::remove_pointer_t<decltype(out)>>;
    std::vector<S> sums(grid.x.size());
    for (std::uint32_t y = 0; y < grid.y.size(); ++y) {
        rowSums.sums(y, sums.data());
        finish(sums.data(), y, out + std::uint64_t{y} * dst.w());
    }
}

template <class Finish>
void averageWords(const FNImage<unsigned short>& src, const AreaGrid& grid, FNImage<unsigned short>& dst,
                  Finish finish) {
    if (RowsFirst::suits(grid))
        averageRows(RowsFirst(src, grid), grid, dst, finish);
    else
        averageRows(ColumnsFirst(src, grid), grid, dst, finish);
}

/// For pixels of so many units that a sum may need more than 32 bits; slow.
void averageWide(const FNImage<unsigned short>& src, const AreaGrid& grid, FNImage<unsigned short>& dst) {
    unsigned short* out = dst.getExclusive();
    for (std::uint32_t y = 0; y < grid.y.size(); ++y)
        for (std::uint32_t x = 0; x < grid.x.size(); ++x) {
            std::uint64_t sum = 0;
            for (std::uint32_t j = 0; j < grid.y.count[y]; ++j) {
                const unsigned short* const row =
                    src.row(grid.box.y0 + grid.y.first[y] + j) + grid.box.x0 + grid.x.first[x];
                std::uint64_t rowSum = 0;
                for (std::uint32_t i = 0; i < grid.x.count[x]; ++i)
                    rowSum += std::uint64_t{grid.x.weight(x)[i]} * row[i];
                sum += rowSum * grid.y.weight(y)[j];
            }
            const std::uint64_t units = std::uint64_t{grid.x.width[x]} * grid.y.width[y];
            const auto low = static_cast<std::uint32_t>(sum);
            const auto reciprocal = static_cast<std::uint32_t>(0xFFFFFFFFu / units);
            if (sum == low)
                Kernels::multiplyHigh(&low, &reciprocal, out++, 1);
            else
                *out++ = static_cast<unsigned short>(sum / units);
        }
}

} // namespace

void averageByShift(const FNImage<unsigned short>& src, const AreaGrid& grid, int shift,
                    FNImage<unsigned short>& dst) {
    averageWords(src, grid, dst, [&](const std::uint32_t* sums, std::uint32_t, unsigned short* out) {
        Kernels::shiftDown(sums, shift, out, grid.x.size());
    });
}

void averageByDivision(const FNImage<unsigned short>& src, const AreaGrid& grid,
                       FNImage<unsigned short>& dst) {
    const std::uint64_t widest = *std::max_element(grid.x.width.begin(), grid.x.width.end());
    const std::uint64_t highest = *std::max_element(grid.y.width.begin(), grid.y.width.end());
    if (widest * highest > 65536) return averageWide(src, grid, dst);

    Reciprocals<std::uint32_t> reciprocals(grid.x);
    averageWords(src, grid, dst, [&](const std::uint32_t* sums, std::uint32_t y, unsigned short* out) {
        Kernels::multiplyHigh(sums, reciprocals.ofHeight(grid.y.width[y]), out, grid.x.size());
    });
}

void averageByDivision(const FNImage<float>& src, const AreaGrid& grid, FNImage<float>& dst) {
    Reciprocals<float> reciprocals(grid.x);
    averageRows(ColumnsFirst(src, grid), grid, dst, [&](const float* sums, std::uint32_t y, float* out) {
        Kernels::multiply(sums, reciprocals.ofHeight(grid.y.width[y]), out, grid.x.size());
    });
}

void averageByDivision(const FNImage<Fn::Bgra32>& src, const AreaGrid& grid, FNImage<Fn::Bgra32>& dst) {
    std::array<FNImage<unsigned short>, 3> planes, results;
    std::array<unsigned short*, 3> to;
    for (std::size_t c = 0; c < planes.size(); ++c) {
        planes[c] = FNImage<unsigned short>(grid.box.width(), grid.box.height());
        results[c] = FNImage<unsigned short>(dst.w(), dst.h());
        to[c] = planes[c].getExclusive();
    }
    for (FNConstImIter<Fn::Bgra32> it(src, grid.box); !it.atEnd(); it.nextRow()) {
        Kernels::splitColor(it.restOfRow().data(), to, it.width());
        for (unsigned short*& plane : to) plane += it.width();
    }
    const AreaGrid planeGrid{planes[0].box(), grid.x, grid.y};
    for (std::size_t c = 0; c < planes.size(); ++c) averageByDivision(planes[c], planeGrid, results[c]);
    Kernels::joinColor({results[0].data(), results[1].data(), results[2].data()}, dst.getExclusive(),
                       dst.size());
}

} // namespace Img::Affine

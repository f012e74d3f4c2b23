#include "img/fft/line_kernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "img/fft/line_kernels.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include "img/fft/butterflies-inl.h"
#include "img/fft/transposition-inl.h"

#include <algorithm>
#include <memory>

HWY_BEFORE_NAMESPACE();
namespace Img::Fft::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// Two buffers of points that the stages go between.
template <class T> class Lanes {
public:
    Lanes(const LinePlan<T>& plan, Workspace<T>& workspace) : plan_(plan) {
        constexpr std::size_t alignment = 64;
        const std::size_t size = std::size_t{plan.bufferSize()} * 2 * hn::Lanes(d_);
        std::size_t bytes = 2 * size * sizeof(T) + alignment;
        if (workspace.lanes.size() * sizeof(T) < bytes) workspace.lanes.resize(bytes / sizeof(T));
        void* start = workspace.lanes.data();
        input_ = static_cast<T*>(std::align(alignment, 2 * size * sizeof(T), start, bytes));
        other_ = input_ + size;
    }

    T* input() const { return input_; }
    void clear() const { std::fill_n(input_, std::size_t{plan_.n} * 2 * hn::Lanes(d_), T{}); }

    /// Transforms what is in input().
    /// @return the result, in one of the buffers
    const T* run() {
        if (plan_.convolution) return convolve();
        return runStages(plan_, input_, other_);
    }

private:
    static T* runStages(const LinePlan<T>& plan, T* in, T* out) {
        for (const auto& stage : plan.stages) {
            butterflies<T>(plan, stage, in, out);
            std::swap(in, out);
        }
        return in;
    }

    /// Multiplies n points of `in` with pairs of scalars, or their conjugates with the pairs.
    template <bool conjugate> void multiply(const T* in, const T* pairs, std::uint32_t n, T* out) const {
        const std::size_t lanes = hn::Lanes(d_);
        for (std::uint32_t k = 0; k < n; ++k) {
            auto re = hn::Load(d_, in + 2 * k * lanes), im = hn::Load(d_, in + (2 * k + 1) * lanes);
            if constexpr (conjugate) im = hn::Neg(im);
            Arithmetic<T>::rotate(d_, re, im, pairs[2 * k], pairs[2 * k + 1]);
            hn::Store(re, d_, out + 2 * k * lanes);
            hn::Store(im, d_, out + (2 * k + 1) * lanes);
        }
    }

    /// x_k c_k convolved with the conjugate chirp, times c_k. The inverse transform is the conjugate of the
    /// transform of the conjugate.
    const T* convolve() {
        if constexpr (std::is_floating_point_v<T>) {
            const LinePlan<T>& convolution = *plan_.convolution;
            const std::size_t point = 2 * hn::Lanes(d_);
            multiply<false>(input_, plan_.chirp.data(), plan_.n, input_);
            std::fill(input_ + plan_.n * point, input_ + convolution.n * point, T{});
            T* spectrum = runStages(convolution, input_, other_);
            multiply<false>(spectrum, plan_.filter.data(), convolution.n, spectrum);
            const auto minus = hn::Set(d_, T{-1});
            for (std::size_t i = hn::Lanes(d_); i < convolution.n * point; i += point)
                hn::Store(hn::Mul(hn::Load(d_, spectrum + i), minus), d_, spectrum + i);
            T* const result = runStages(convolution, spectrum, spectrum == input_ ? other_ : input_);
            multiply<true>(result, plan_.chirp.data(), plan_.n, result);
            return result;
        }
        return input_;
    }

    const hn::ScalableTag<T> d_;
    const LinePlan<T>& plan_;
    T* input_;
    T* other_;
};

/// The columns asked for.
class Columns {
public:
    Columns(std::span<const std::uint32_t> chosen, std::uint32_t n)
        : chosen_(chosen), count_(chosen.empty() ? n : static_cast<std::uint32_t>(chosen.size())) {}
    std::uint32_t count() const { return count_; }
    std::uint32_t operator[](std::uint32_t i) const { return chosen_.empty() ? i : chosen_[i]; }

private:
    std::span<const std::uint32_t> chosen_;
    std::uint32_t count_;
};

/// Fills the lanes from rows of `values` values per point. Lanes without a row repeat another one.
template <class T> void packRows(const RowSource<T>& source, const T* const* rows, int part, T* lanes) {
    for (const auto& segment : source.segments) {
        if (segment.count == 0) continue;
        if (source.complex)
            packPoints<T>(rows, segment.offset, segment.begin, segment.count, source.inverse, lanes);
        else
            packReals<T>(rows, segment.offset, segment.begin, segment.count, part, lanes);
    }
}

template <class T>
void rowsOf(const LinePlan<T>& plan, const RowSource<T>& source, std::span<const std::uint32_t> chosen,
            T* out, Workspace<T>& workspace) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d);
    // Two real rows of floats share a lane, as real and imaginary part.
    const bool pairs = std::is_floating_point_v<T> && !source.complex;
    const std::size_t rowsPerRun = pairs ? 2 * lanes : lanes;
    const Columns columns(chosen, plan.n);
    const std::size_t outStride = 2 * std::size_t{columns.count()};
    Lanes<T> buffer(plan, workspace);
    workspace.scratch.resize(std::max(workspace.scratch.size(), outStride));
    const bool gaps = source.segments[0].count + source.segments[1].count < plan.n;

    std::array<const T*, 2 * hn::MaxLanes(d)> from;
    std::array<T*, 2 * hn::MaxLanes(d)> to;
    for (std::size_t first = 0; first < source.lines; first += rowsPerRun) {
        for (std::size_t i = 0; i < rowsPerRun; ++i) {
            // The rows of a pair go to the same lane of the first and the second half.
            const std::size_t row = first + i;
            const bool exists = row < source.lines;
            from[i] = source.source + (exists ? row : first) * source.stride;
            to[i] = exists ? out + row * outStride : workspace.scratch.data();
        }
        if (gaps || !(source.complex || pairs)) buffer.clear();
        packRows(source, from.data(), 0, buffer.input());
        if (pairs) packRows(source, from.data() + lanes, 1, buffer.input());
        const T* const result = buffer.run();
        if (pairs) {
            unpackPairs<T, 0>(result, plan.n, columns, to.data());
            unpackPairs<T, 1>(result, plan.n, columns, to.data() + lanes);
        } else {
            unpackPoints<T>(result, columns, source.inverse, to.data());
        }
    }
}

template <class T>
void columnsOf(const LinePlan<T>& plan, const T* rows, std::span<const std::uint32_t> lines,
               std::uint32_t count, bool inverse, T* out, std::size_t outStride, Workspace<T>& workspace) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d);
    Lanes<T> buffer(plan, workspace);
    for (std::size_t c = 0; c < count; c += lanes) {
        const std::size_t used = std::min(lanes, count - c);
        if (lines.size() < plan.n || used < lanes) buffer.clear();
        for (std::size_t j = 0; j < lines.size(); ++j)
            loadPoints<T>(rows + 2 * (j * count + c), used, inverse, buffer.input() + 2 * lines[j] * lanes);
        const T* const result = buffer.run();
        for (std::size_t y = 0; y < plan.n; ++y)
            storePoints<T>(result + 2 * y * lanes, used, inverse, out + 2 * (y * outStride + c));
    }
}

void rowsFloat(const LinePlan<float>& plan, const RowSource<float>& rows,
               std::span<const std::uint32_t> columns, float* out, Workspace<float>& workspace) {
    rowsOf(plan, rows, columns, out, workspace);
}
void rowsFixed(const LinePlan<std::int32_t>& plan, const RowSource<std::int32_t>& rows,
               std::span<const std::uint32_t> columns, std::int32_t* out,
               Workspace<std::int32_t>& workspace) {
    rowsOf(plan, rows, columns, out, workspace);
}
void columnsFloat(const LinePlan<float>& plan, const float* rows, std::span<const std::uint32_t> lines,
                  std::uint32_t count, bool inverse, float* out, std::size_t outStride,
                  Workspace<float>& workspace) {
    columnsOf(plan, rows, lines, count, inverse, out, outStride, workspace);
}
void columnsFixed(const LinePlan<std::int32_t>& plan, const std::int32_t* rows,
                  std::span<const std::uint32_t> lines, std::uint32_t count, bool inverse, std::int32_t* out,
                  std::size_t outStride, Workspace<std::int32_t>& workspace) {
    columnsOf(plan, rows, lines, count, inverse, out, outStride, workspace);
}

} // namespace
} // namespace Img::Fft::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Img::Fft {

namespace {
HWY_EXPORT(rowsFloat);
HWY_EXPORT(rowsFixed);
HWY_EXPORT(columnsFloat);
HWY_EXPORT(columnsFixed);
} // namespace

template <>
void transformRows(const LinePlan<float>& plan, const RowSource<float>& rows,
                   std::span<const std::uint32_t> columns, float* out, Workspace<float>& workspace) {
    HWY_DYNAMIC_DISPATCH(rowsFloat)(plan, rows, columns, out, workspace);
}
template <>
void transformRows(const LinePlan<std::int32_t>& plan, const RowSource<std::int32_t>& rows,
                   std::span<const std::uint32_t> columns, std::int32_t* out,
                   Workspace<std::int32_t>& workspace) {
    HWY_DYNAMIC_DISPATCH(rowsFixed)(plan, rows, columns, out, workspace);
}
template <>
void transformColumns(const LinePlan<float>& plan, const float* rows, std::span<const std::uint32_t> lines,
                      std::uint32_t count, bool inverse, float* out, std::size_t outStride,
                      Workspace<float>& workspace) {
    HWY_DYNAMIC_DISPATCH(columnsFloat)(plan, rows, lines, count, inverse, out, outStride, workspace);
}
template <>
void transformColumns(const LinePlan<std::int32_t>& plan, const std::int32_t* rows,
                      std::span<const std::uint32_t> lines, std::uint32_t count, bool inverse,
                      std::int32_t* out, std::size_t outStride, Workspace<std::int32_t>& workspace) {
    HWY_DYNAMIC_DISPATCH(columnsFixed)(plan, rows, lines, count, inverse, out, outStride, workspace);
}

} // namespace Img::Fft
#endif

#pragma once

#include "img/fft/line_plan.h"

#include <array>
#include <span>

/// Transforms of many lines at once: one line in each lane of the vectors.
///
/// Complex numbers are pairs of T, real part first. The transform has the exponent -2 pi i k x / n and no
/// scale (but the shift of fixed point); the inverse has the other sign.
namespace Img::Fft {

/// Memory of one running transform.
template <class T> struct Workspace {
    std::vector<T> lanes;   ///< two buffers of points, a vector of real and one of imaginary parts each
    std::vector<T> scratch; ///< a row that is written but not wanted
    std::vector<T> rows;    ///< rows between the passes of a plane
};

/// Rows of an image, zero outside of two segments.
template <class T> struct RowSource {
    /// The values of a row from x = begin on, found at an offset (in values) from the row's first one.
    struct Segment {
        std::uint32_t begin = 0, count = 0, offset = 0;
    };

    const T* source;
    bool complex;             ///< values are pairs
    std::uint32_t lines;      ///< number of rows
    std::uint32_t stride = 0; ///< values from one row to the next
    std::array<Segment, 2> segments = {};
    bool inverse = false;
};

/// Transforms rows. `out` gets the points `columns` of each row (all if there are none), as pairs without
/// gaps. Of real rows, whose spectrum is symmetric, only points up to n / 2 may be asked for.
///
/// Fixed-point input is clamped to +-(2^31 - 2^16), each part of complex input to that over the root of 2.
template <class T>
void transformRows(const LinePlan<T>& plan, const RowSource<T>& rows, std::span<const std::uint32_t> columns,
                   T* out, Workspace<T>& workspace);

/// Transforms columns. Row j of `rows` (`count` pairs) is row lines[j] of the plane, all others are zero.
/// `out` gets plan.n rows of pairs, `outStride` pairs apart.
template <class T>
void transformColumns(const LinePlan<T>& plan, const T* rows, std::span<const std::uint32_t> lines,
                      std::uint32_t count, bool inverse, T* out, std::size_t outStride,
                      Workspace<T>& workspace);

} // namespace Img::Fft

#pragma once

#include "fn/matrix.h"

#include <cstdint>

namespace Cmp {

/// A vector as 16-bit integers: v = digits / scale + offset.
struct DigitizedVector {
    FNVector<short> digits;
    float scale, offset;

    /// The least element of `v` becomes -32767, the greatest one 32767; what a constant vector holds beside
    /// its offset is 0.
    /// @param size of `digits`; what `v` does not have is 0. @throws FNEBadArg if it is less than that of `v`
    DigitizedVector(FNVector<float> const& v, std::size_t size);
};

/// Products of 16-bit vectors with matrices of 8-bit weights.
struct FPMatVecMultiplier {
    /// The product of `v` with each column, summed exactly, and then cut to 32 bits.
    /// @throws FNEBadArg for a matrix of another number of rows
    FNVector<int> leftMultiply(FNVector<short> const& v, Fn::Matrix<signed char> const& m) const;
    /// The same column by column.
    FNVector<int> leftMultiplyPlain(FNVector<short> const& v, Fn::Matrix<signed char> const& m) const;
};

/// About v * (m * factor), in integers.
/// @param m may have more rows than `v` has elements
/// @param base for each column of `m` the sum of its first v.size() weights, times `factor`
/// @throws FNEBadArg if sizes do not fit
FNVector<float> multiplyDigitized(FNVector<float> const& v, Fn::Matrix<signed char> const& m,
                                  float const& factor, FNVector<float> const& base);

} // namespace Cmp

#pragma once

#include <cstddef>

namespace Fn::Numeric {

/// Adds up N partial sums, N a power of two, in the one order that all forms of a primitive share: each of
/// the lower half takes the one half the number away, until one is left.
template <class T, std::size_t N> T foldPartialSums(T (&partial)[N]) {
    static_assert((N & (N - 1)) == 0);
    for (std::size_t half = N / 2; half > 0; half /= 2)
        for (std::size_t i = 0; i < half; ++i) partial[i] += partial[i + half];
    return partial[0];
}

} // namespace Fn::Numeric

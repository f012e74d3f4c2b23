#pragma once

#include "fn/byte_order.h"
#include "fn/complex.h"
#include "fn/geometry.h"

#include <cstddef>
#include <cstdint>
#include <type_traits>

/// Arrays of numbers to and from their stored form (see byte_order.h): what the second core of a vector or
/// matrix holds. 16-bit integers are stored most significant byte first, complex numbers as real and
/// imaginary part.

namespace Fn::Numeric {

/// Bytes of one stored element.
template <class T> inline constexpr std::size_t storedSize = sizeof(T);

template <class T> void storeElements(const T* values, unsigned char* stored, std::size_t n) {
    if (n == 0) return; // there may be no memory at all
    if constexpr (std::is_same_v<T, float>)
        htonf(values, stored, n);
    else if constexpr (std::is_same_v<T, double>)
        htond(values, stored, n);
    else if constexpr (std::is_same_v<T, FNComplex<float>>)
        htonf(&values->re, stored, 2 * n);
    else if constexpr (std::is_same_v<T, FNComplex<double>>)
        htond(&values->re, stored, 2 * n);
    else if constexpr (std::is_same_v<T, FNGridPos>)
        storeElements(&values->x, stored, 2 * n);
    else
        for (std::size_t i = 0; i < n; ++i, stored += sizeof(T)) {
            if constexpr (sizeof(T) == 1) {
                *stored = static_cast<unsigned char>(values[i]);
            } else if constexpr (sizeof(T) == 2) {
                const auto bits = static_cast<std::uint16_t>(values[i]);
                stored[0] = static_cast<unsigned char>(bits >> 8);
                stored[1] = static_cast<unsigned char>(bits);
            } else if constexpr (sizeof(T) == 4) {
                storeUInt32(static_cast<std::uint32_t>(values[i]), stored);
            } else {
                storeUInt64(static_cast<std::uint64_t>(values[i]), stored);
            }
        }
}

template <class T> void loadElements(const unsigned char* stored, T* values, std::size_t n) {
    if (n == 0) return;
    if constexpr (std::is_same_v<T, float>)
        ntohf(stored, values, n);
    else if constexpr (std::is_same_v<T, double>)
        ntohd(stored, values, n);
    else if constexpr (std::is_same_v<T, FNComplex<float>>)
        ntohf(stored, &values->re, 2 * n);
    else if constexpr (std::is_same_v<T, FNComplex<double>>)
        ntohd(stored, &values->re, 2 * n);
    else if constexpr (std::is_same_v<T, FNGridPos>)
        loadElements(stored, &values->x, 2 * n);
    else
        for (std::size_t i = 0; i < n; ++i, stored += sizeof(T)) {
            if constexpr (sizeof(T) == 1)
                values[i] = static_cast<T>(*stored);
            else if constexpr (sizeof(T) == 2)
                values[i] = static_cast<T>(stored[0] << 8 | stored[1]);
            else if constexpr (sizeof(T) == 4)
                values[i] = static_cast<T>(loadUInt32(stored));
            else
                values[i] = static_cast<T>(loadUInt64(stored));
        }
}

} // namespace Fn::Numeric

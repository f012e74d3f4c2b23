#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

/// Positions and boxes in an image: x points right, y points down, the origin is the upper left corner.

/// A pair of scalars: a position or a displacement.
template <class T> struct FN2Vector {
    T x{};
    T y{};

    constexpr FN2Vector() = default;
    constexpr FN2Vector(T x_, T y_) : x(x_), y(y_) {}

    /// Conversion of both scalars; reals become integers by dropping the fraction, and those that do not fit
    /// become the nearest integer that does (0 for NaN).
    template <class U>
    constexpr explicit FN2Vector(const FN2Vector<U>& other) : x(converted(other.x)), y(converted(other.y)) {}

    constexpr FN2Vector& operator+=(FN2Vector v) { return *this = *this + v; }
    constexpr FN2Vector& operator-=(FN2Vector v) { return *this = *this - v; }
    friend constexpr FN2Vector operator+(FN2Vector a, FN2Vector b) { return {a.x + b.x, a.y + b.y}; }
    friend constexpr FN2Vector operator-(FN2Vector a, FN2Vector b) { return {a.x - b.x, a.y - b.y}; }
    friend constexpr FN2Vector operator-(FN2Vector v) { return {-v.x, -v.y}; }
    friend constexpr FN2Vector operator*(FN2Vector v, T s) { return {v.x * s, v.y * s}; }
    friend constexpr FN2Vector operator*(T s, FN2Vector v) { return v * s; }
    friend constexpr FN2Vector operator/(FN2Vector v, T s) { return {v.x / s, v.y / s}; }
    friend constexpr bool operator==(FN2Vector, FN2Vector) = default;

private:
    template <class U> static constexpr T converted(U value) {
        if constexpr (std::is_floating_point_v<U> && std::is_integral_v<T>) {
            constexpr T lowest = std::numeric_limits<T>::lowest(), greatest = std::numeric_limits<T>::max();
            if (value != value) return 0;
            // The greatest integer may round up to a power of two that does not fit any more: hence >=.
            if (value >= static_cast<U>(greatest)) return greatest;
            if (value <= static_cast<U>(lowest)) return lowest;
        }
        return static_cast<T>(value);
    }
};

/// A position between pixels: (0.5, 0.5) is the middle of the first pixel's square if not said otherwise.
using FNPos = FN2Vector<float>;
/// The position of a pixel.
using FNGridPos = FN2Vector<std::int32_t>;

/// Scalar product.
template <class T> constexpr T dot(FN2Vector<T> a, FN2Vector<T> b) {
    return a.x * b.x + a.y * b.y;
}

/// Euclidean length.
template <class T> T length(FN2Vector<T> v) {
    return std::hypot(v.x, v.y);
}

/// The pixels with x0 <= x < x1 and y0 <= y < y1.
struct FNBox {
    std::int32_t x0 = 0;
    std::int32_t y0 = 0;
    std::int32_t x1 = 0;
    std::int32_t y1 = 0;

    constexpr bool empty() const { return x0 >= x1 || y0 >= y1; }
    /// Extent in pixels, 0 if the upper bound does not lie above the lower one.
    constexpr std::uint32_t width() const { return extent(x0, x1); }
    constexpr std::uint32_t height() const { return extent(y0, y1); }
    constexpr bool contains(FNGridPos pos) const {
        return x0 <= pos.x && pos.x < x1 && y0 <= pos.y && pos.y < y1;
    }

    /// What lies in both boxes; all bounds are 0 if that is nothing.
    friend constexpr FNBox operator&(const FNBox& a, const FNBox& b) {
        const FNBox both{std::max(a.x0, b.x0), std::max(a.y0, b.y0), std::min(a.x1, b.x1),
                         std::min(a.y1, b.y1)};
        return both.empty() ? FNBox{} : both;
    }
    friend constexpr bool operator==(const FNBox&, const FNBox&) = default;

private:
    static constexpr std::uint32_t extent(std::int32_t lower, std::int32_t upper) {
        return lower < upper ? static_cast<std::uint32_t>(upper) - static_cast<std::uint32_t>(lower) : 0;
    }
};

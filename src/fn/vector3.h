#pragma once

#include <cmath>

/// Vectors of space and 3 by 3 matrices. Both are plain values without padding.

template <class T> struct FN3Vector {
    T x{};
    T y{};
    T z{};

    constexpr T& operator[](int i) { return i == 0 ? x : i == 1 ? y : z; }
    constexpr const T& operator[](int i) const { return i == 0 ? x : i == 1 ? y : z; }

    constexpr FN3Vector& operator+=(const FN3Vector& v) { return *this = *this + v; }
    constexpr FN3Vector& operator-=(const FN3Vector& v) { return *this = *this - v; }
    friend constexpr FN3Vector operator+(const FN3Vector& a, const FN3Vector& b) {
        return {a.x + b.x, a.y + b.y, a.z + b.z};
    }
    friend constexpr FN3Vector operator-(const FN3Vector& a, const FN3Vector& b) {
        return {a.x - b.x, a.y - b.y, a.z - b.z};
    }
    friend constexpr FN3Vector operator-(const FN3Vector& v) { return {-v.x, -v.y, -v.z}; }
    friend constexpr FN3Vector operator*(const FN3Vector& v, T s) { return {v.x * s, v.y * s, v.z * s}; }
    friend constexpr FN3Vector operator*(T s, const FN3Vector& v) { return v * s; }
    friend constexpr FN3Vector operator/(const FN3Vector& v, T s) { return {v.x / s, v.y / s, v.z / s}; }
    friend constexpr bool operator==(const FN3Vector&, const FN3Vector&) = default;
};

/// Scalar product.
template <class T> constexpr T dot(const FN3Vector<T>& a, const FN3Vector<T>& b) {
    return a.x * b.x + a.y * b.y + a.z * b.z;
}

/// Vector product.
template <class T> constexpr FN3Vector<T> cross(const FN3Vector<T>& a, const FN3Vector<T>& b) {
    return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}

/// Euclidean length.
template <class T> T length(const FN3Vector<T>& v) {
    return std::sqrt(dot(v, v));
}

/// A 3 by 3 matrix, rows in order. A default-constructed one is zero.
template <class T> struct FN3Matrix {
    FN3Vector<T> rows[3];

    static constexpr FN3Matrix identity() { return {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}}; }

    constexpr T& operator()(int row, int column) { return rows[row][column]; }
    constexpr const T& operator()(int row, int column) const { return rows[row][column]; }
    constexpr FN3Vector<T> column(int i) const { return {rows[0][i], rows[1][i], rows[2][i]}; }
    constexpr void setColumn(int i, const FN3Vector<T>& v) {
        for (int row = 0; row < 3; ++row) rows[row][i] = v[row];
    }

    constexpr FN3Matrix transposed() const { return {{column(0), column(1), column(2)}}; }
    constexpr T determinant() const { return dot(rows[0], cross(rows[1], rows[2])); }

    /// Of a column vector.
    friend constexpr FN3Vector<T> operator*(const FN3Matrix& m, const FN3Vector<T>& v) {
        return {dot(m.rows[0], v), dot(m.rows[1], v), dot(m.rows[2], v)};
    }
    /// Of a row vector.
    friend constexpr FN3Vector<T> operator*(const FN3Vector<T>& v, const FN3Matrix& m) {
        return v.x * m.rows[0] + v.y * m.rows[1] + v.z * m.rows[2];
    }
    friend constexpr FN3Matrix operator*(const FN3Matrix& a, const FN3Matrix& b) {
        return {{a.rows[0] * b, a.rows[1] * b, a.rows[2] * b}};
    }
    friend constexpr bool operator==(const FN3Matrix&, const FN3Matrix&) = default;
};

#pragma once

/// A complex number of any scalar, the integers of the fixed-point transforms included. Real part first in
/// memory.
template <class T> struct FNComplex {
    T re{};
    T im{};

    friend constexpr FNComplex operator+(FNComplex a, FNComplex b) { return {a.re + b.re, a.im + b.im}; }
    friend constexpr FNComplex operator-(FNComplex a, FNComplex b) { return {a.re - b.re, a.im - b.im}; }
    friend constexpr FNComplex operator*(FNComplex a, FNComplex b) {
        return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
    }
    friend constexpr FNComplex operator*(FNComplex a, T s) { return {a.re * s, a.im * s}; }
    friend constexpr bool operator==(FNComplex, FNComplex) = default;
};

template <class T> constexpr FNComplex<T> conj(FNComplex<T> z) {
    return {z.re, -z.im};
}

/// Squared magnitude.
template <class T> constexpr T norm(FNComplex<T> z) {
    return z.re * z.re + z.im * z.im;
}

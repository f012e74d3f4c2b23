#pragma once

#include "fn/geometry.h"
#include "fn/package.h"
#include "fn/rmem.h"

#include <algorithm>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <span>
#include <type_traits>
#include <vector>

/// Dense vectors of numbers.
///
/// A vector is a view on a counted memory block: a copy shares the block, and the first write to a shared
/// block copies it. Elements are those of the block in order. Vectors pack as two cores: the number of
/// elements in 4 bytes, most significant first, and the elements in stored form (byte_order.h).
///
///     FNVector<float> a(3), b(3);
///     a.fill(1); b.fill(2);
///     const float six = (a + a) * b / 2;

namespace VectorImplementations::IPP {

/// What the scalar product of two vectors of `T` gives.
template <class T> struct ScalarProduct { using Type = T; };
template <> struct ScalarProduct<short> { using Type = std::int64_t; }; ///< exact
template <> struct ScalarProduct<int> { using Type = std::int64_t; };   ///< each product in 32 bits

/// Elements are of type short, int, unsigned int, unsigned long, float, double, FNComplex<float>,
/// FNComplex<double> or FNGridPos, for which all operations run by coordinate. All size mismatches throw
/// FNEBadArg.
template <class T> class Vector {
public:
    using value_type = T;

    Vector() = default;
    /// `n` uninitialised elements.
    explicit Vector(std::size_t n) : elements_(n) {}
    Vector(std::size_t n, const T& value) : elements_(n) { fill(value); }
    /// On the given memory, which is shared.
    explicit Vector(const FNRMem<T>& elements) : elements_(elements) {}
    /// Copies the values.
    explicit Vector(std::span<const T> values) : elements_(values.size()) {
        if (!values.empty()) std::copy(values.begin(), values.end(), getExclusive());
    }
    explicit Vector(const std::vector<T>& values) : Vector(std::span<const T>(values)) {}
    /// @throws FNEBadArg if the package does not hold a vector of T.
    explicit Vector(const Fn::Package& package);
    explicit operator Fn::Package() const;

    std::size_t size() const noexcept { return elements_.size(); }
    bool empty() const noexcept { return elements_.empty(); }

    /// First element for reading, null if there is none.
    const T* get() const noexcept { return elements_.data(); }
    /// First element for writing; holds until the vector is copied.
    T* getExclusive() { return elements_.getExclusive(); }
    const FNRMem<T>& core() const noexcept { return elements_; }
    std::span<const T> span() const noexcept { return elements_.span(); }
    const T* begin() const noexcept { return elements_.begin(); }
    const T* end() const noexcept { return elements_.end(); }

    /// @throws FNEOutOfRange. In loops, take getExclusive() once instead.
    T& operator[](std::size_t i) { return elements_[i]; }
    const T& operator[](std::size_t i) const { return elements_[i]; }
    void fill(const T& value) { std::fill_n(getExclusive(), size(), value); }

    Vector& operator+=(const Vector& other);
    Vector& operator-=(const Vector& other);
    Vector operator+(const Vector& other) const;
    Vector operator-(const Vector& other) const;
    Vector& operator*=(T factor);
    Vector operator*(T factor) const { return Vector(*this) *= factor; }
    /// @throws FNEBadArg for 0.
    Vector& operator/=(T divisor);
    Vector operator/(T divisor) const { return Vector(*this) /= divisor; }

    /// Scalar product; of complex vectors, that of the conjugate of this one with `other`.
    typename ScalarProduct<T>::Type operator*(const Vector& other) const;
    /// Adds factor * other.
    void linear_add(T factor, const Vector& other);

    T sum() const;
    /// Element-wise product of two vectors; the second form leaves it in `a`.
    static Vector componentMult(const Vector& a, const Vector& b);
    static void componentMultI(Vector& a, const Vector& b);

    /// Sample standard deviation (divisor n - 1); sets `mean`. @throws FNEBadArg for less than 2 elements.
    double stdDeviation(double& mean) const requires std::is_arithmetic_v<T>;

    /// Element-wise.
    Vector componentSqr() const;
    Vector componentSqrt() const requires std::floating_point<T>;
    Vector componentTanh() const requires std::floating_point<T>;

    /// Same number of elements, each equal.
    bool operator==(const Vector& other) const {
        return std::equal(begin(), end(), other.begin(), other.end());
    }

private:
    FNRMem<T> elements_;
};

extern template class Vector<short>;
extern template class Vector<int>;
extern template class Vector<unsigned int>;
extern template class Vector<unsigned long>;
extern template class Vector<float>;
extern template class Vector<double>;
extern template class Vector<FNComplex<float>>;
extern template class Vector<FNComplex<double>>;
extern template class Vector<FNGridPos>;

} // namespace VectorImplementations::IPP

template <class T> using FNVector = VectorImplementations::IPP::Vector<T>;

#pragma once

#include "fn/package.h"

#include <cstdint>

namespace Fn {

/// A vector of +1 and -1, stored as bits: value i is bit i % 8 of byte i / 8, and a set bit means +1. Bits
/// behind the last value are clear. Copies share the bytes.
///
/// It packs as two cores: the number of values in 4 bytes, most significant first, and the bytes.
///
/// `T` is the type of the values and of the scalar product; there is SignValueVector<int>.
template <class T> class SignValueVector {
public:
    SignValueVector() : SignValueVector(0) {}
    /// `n` values of -1.
    explicit SignValueVector(std::uint32_t n);
    /// The first `n` bits of `bits`, which are shared unless bits behind the last value have to be cleared.
    /// @throws FNEBadArg if there are less.
    SignValueVector(std::uint32_t n, const FNRMem<unsigned char>& bits);
    /// @throws FNEBadArg
    explicit SignValueVector(const Package& package);
    explicit operator Package() const;

    /// Number of values.
    std::uint32_t size() const noexcept { return n_; }
    /// Number of bytes in use.
    std::uint32_t byteCount() const noexcept { return fullBytes_ + (restBits_ != 0); }
    const unsigned char* bytes() const noexcept { return bits_.data(); }
    /// For writing; bits behind the last value have to stay clear.
    unsigned char* exclusiveBytes() { return bits_.getExclusive(); }

    /// Value i, unchecked: 1 or -1.
    T operator[](std::uint32_t i) const noexcept { return bytes()[i / 8] >> i % 8 & 1 ? T{1} : T{-1}; }

    /// Scalar product. @throws FNEBadArg for vectors of unequal size.
    T operator*(const SignValueVector& other) const;

    bool operator==(const SignValueVector& other) const noexcept;

private:
    std::uint32_t n_;
    std::uint32_t fullBytes_;
    std::uint32_t restBits_;
    FNRMem<unsigned char> bits_;
};

/// Writes the values of a vector one after another.
template <class T> class SVVectorSequentialBuilder {
public:
    /// For a vector of `n` values, -1 until they are set.
    explicit SVVectorSequentialBuilder(std::uint32_t n) : vector_(n), bytes_(vector_.exclusiveBytes()) {}
    SVVectorSequentialBuilder(const SVVectorSequentialBuilder&) = delete;
    SVVectorSequentialBuilder& operator=(const SVVectorSequentialBuilder&) = delete;

    /// @throws FNEOutOfRange behind the last value.
    void setNextSignPositive() { setNextSign(true); }
    void setNextSignNegative() { setNextSign(false); }
    void setNextSign(bool positive) {
        if (next_ == vector_.size()) throwFull();
        bytes_[next_ / 8] |= static_cast<unsigned char>(positive << next_ % 8);
        ++next_;
    }

    /// Number of values that are set.
    std::uint32_t position() const noexcept { return next_; }
    /// The vector as far as it is written.
    const SignValueVector<T>& vector() const noexcept { return vector_; }

private:
    [[noreturn]] static void throwFull();

    SignValueVector<T> vector_;
    unsigned char* bytes_;
    std::uint32_t next_ = 0;
};

extern template class SignValueVector<int>;
extern template class SVVectorSequentialBuilder<int>;

} // namespace Fn

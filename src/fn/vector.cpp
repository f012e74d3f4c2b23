#include "fn/vector.h"

#include "fn/numeric/blas.h"
#include "fn/numeric/stored_elements.h"
#include "fn/numeric/vector_primitives.h"

#include <cmath>
#include <concepts>
#include <limits>
#include <string>

namespace VectorImplementations::IPP {
namespace {

namespace Numeric = Fn::Numeric;

template <class T>
constexpr bool isComplex = std::is_same_v<T, FNComplex<float>> || std::is_same_v<T, FNComplex<double>>;

/// The longest run of elements that one call of a primitive processes.
constexpr std::size_t chunkSize = 0x100000;

/// Calls operation(first, count) for the chunks of n elements.
template <class Operation> void forChunks(std::size_t n, Operation operation) {
    for (std::size_t first = 0; first < n; first += chunkSize)
        operation(first, std::min(chunkSize, n - first));
}

/// Sum, difference and product of integers wrap.
template <std::integral T, class Operation> T wrapping(T a, T b, Operation operation) {
    using Bits = std::make_unsigned_t<decltype(T() + T())>;
    return static_cast<T>(operation(static_cast<Bits>(a), static_cast<Bits>(b)));
}

template <class T, class Operation> T combine(T a, T b, Operation operation) {
    if constexpr (std::integral<T>)
        return wrapping(a, b, operation);
    else if constexpr (std::is_same_v<T, FNGridPos>)
        return {wrapping(a.x, b.x, operation), wrapping(a.y, b.y, operation)};
    else
        return operation(a, b);
}

template <class T, class Operation>
void combineAll(const T* a, const T* b, T* out, std::size_t n, Operation operation) {
    for (std::size_t i = 0; i < n; ++i) out[i] = combine(a[i], b[i], operation);
}

template <class T> void addAll(const T* a, const T* b, T* out, std::size_t n) {
    if constexpr (std::floating_point<T>)
        forChunks(n, [=](std::size_t i, std::size_t count) { Numeric::add(a + i, b + i, out + i, count); });
    else
        combineAll(a, b, out, n, [](auto x, auto y) { return x + y; });
}

template <class T> void subtractAll(const T* a, const T* b, T* out, std::size_t n) {
    if constexpr (std::floating_point<T>)
        forChunks(n,
                  [=](std::size_t i, std::size_t count) { Numeric::subtract(a + i, b + i, out + i, count); });
    else
        combineAll(a, b, out, n, [](auto x, auto y) { return x - y; });
}

template <class T> void multiplyAll(const T* a, const T* b, T* out, std::size_t n) {
    if constexpr (std::floating_point<T>)
        forChunks(n,
                  [=](std::size_t i, std::size_t count) { Numeric::multiply(a + i, b + i, out + i, count); });
    else
        combineAll(a, b, out, n, [](auto x, auto y) { return x * y; });
}

template <class T> void scaleAll(T* a, T factor, std::size_t n) {
    if constexpr (std::floating_point<T>)
        forChunks(n, [=](std::size_t i, std::size_t count) { Numeric::scale(a + i, factor, a + i, count); });
    else
        for (std::size_t i = 0; i < n; ++i)
            a[i] = combine(a[i], factor, [](auto x, auto y) { return x * y; });
}

template <class T> T quotient(T a, T b) {
    if constexpr (isComplex<T>) {
        const T product = a * conj(b);
        return {product.re / norm(b), product.im / norm(b)};
    } else if constexpr (std::is_same_v<T, FNGridPos>) {
        return {quotient(a.x, b.x), quotient(a.y, b.y)};
    } else if (std::is_signed_v<T> && b == static_cast<T>(-1)) {
        return combine(T{}, a, [](auto x, auto y) { return x - y; }); // the lowest integer has no quotient
    } else {
        return static_cast<T>(a / b);
    }
}

/// Whether a division by b is one by 0.
template <class T> bool isZeroDivisor(T b) {
    if constexpr (std::is_same_v<T, FNGridPos>)
        return b.x == 0 || b.y == 0;
    else
        return b == T{};
}

/// The text for a scalar product of vectors of different size.
template <class T> std::string scalarProductMismatch(std::size_t a, std::size_t b) {
    if constexpr (isComplex<T>) return "Vector<>: Scalar product: Wrong dimensions";
    std::string text = std::is_same_v<T, float>    ? "Vector<float>"
                       : std::is_same_v<T, double> ? "Vector<double>"
                       : std::is_same_v<T, short>  ? "Vector<FNInt16>"
                                                   : "Vector<>";
    text += ": Scalar product: Wrong dimensions ";
    if constexpr (!std::floating_point<T> && !std::is_same_v<T, short>)
        text += "(" + std::to_string(a) + ", " + std::to_string(b) + ")";
    return text;
}

/// Body of a constrained member for the types that it excludes: clang 14 instantiates it all the same.
[[noreturn]] void notInstantiated() {
    FN_THROW(FNEBadFunCall, "Vector<>: no such operation on these elements");
}

void requireEqual(std::size_t a, std::size_t b, const char* text) {
    if (a != b) FN_THROW(FNEBadArg, text);
}

} // namespace

template <class T> Vector<T>::Vector(const Fn::Package& package) {
    const auto& cores = package.cores();
    if (cores.size() != 2 || cores.front().size() != 4)
        FN_THROW(FNEBadArg, "converting to Vector<T> from an invalid package");
    const std::size_t n = Fn::loadUInt32(cores.front().data());
    if (cores.back().size() != n * Numeric::storedSize<T>)
        FN_THROW(FNEBadArg, "T-vector dimensions contradicts packages dimension");
    elements_.resize(n);
    Numeric::loadElements(cores.back().data(), elements_.getExclusive(), n);
}

template <class T> Vector<T>::operator Fn::Package() const {
    Fn::Package::Core count(4), stored(size() * Numeric::storedSize<T>);
    Fn::storeUInt32(static_cast<std::uint32_t>(size()), count.getExclusive());
    Numeric::storeElements(get(), stored.getExclusive(), size());
    return Fn::Package(std::list<Fn::Package::Core>{count, stored});
}

template <class T> Vector<T>& Vector<T>::operator+=(const Vector& other) {
    requireEqual(size(), other.size(), "Vector<>: Assigning Vector<T>: Wrong dimensions");
    T* const own = getExclusive();
    addAll(own, other.get(), own, size());
    return *this;
}

template <class T> Vector<T>& Vector<T>::operator-=(const Vector& other) {
    requireEqual(size(), other.size(), "Vector<>: Assigning Vector<T>: Wrong dimensions");
    T* const own = getExclusive();
    subtractAll(own, other.get(), own, size());
    return *this;
}

template <class T> Vector<T> Vector<T>::operator+(const Vector& other) const {
    requireEqual(size(), other.size(), "Vector<>: Vector<T> +: Wrong dimensions");
    Vector result(size());
    addAll(get(), other.get(), result.getExclusive(), size());
    return result;
}

template <class T> Vector<T> Vector<T>::operator-(const Vector& other) const {
    requireEqual(size(), other.size(), "Vector<>: Vector<T> -: Wrong dimensions");
    Vector result(size());
    subtractAll(get(), other.get(), result.getExclusive(), size());
    return result;
}

template <class T> Vector<T>& Vector<T>::operator*=(T factor) {
    scaleAll(getExclusive(), factor, size());
    return *this;
}

template <class T> Vector<T>& Vector<T>::operator/=(T divisor) {
    if (isZeroDivisor(divisor)) FN_THROW(FNEBadArg, "Vector<>: Vector<T>::operator/=(): Dividing by 0");
    T* const own = getExclusive();
    if constexpr (std::floating_point<T>)
        scaleAll(own, T{1} / divisor, size());
    else
        for (std::size_t i = 0; i < size(); ++i) own[i] = quotient(own[i], divisor);
    return *this;
}

template <class T> typename ScalarProduct<T>::Type Vector<T>::operator*(const Vector& other) const {
    if (size() != other.size()) FN_THROW(FNEBadArg, scalarProductMismatch<T>(size(), other.size()));
    const T *const a = get(), *const b = other.get();
    if constexpr (isComplex<T>) {
        T result{};
        if (empty()) return result;
        Numeric::Blas<decltype(T::re)>::dotc(size(), &a->re, &b->re, &result.re);
        return result;
    } else if constexpr (std::floating_point<T>) {
        double result = 0;
        forChunks(size(), [&](std::size_t i, std::size_t n) { result += Numeric::dot(a + i, b + i, n); });
        return static_cast<T>(result);
    } else if constexpr (std::is_same_v<T, short>) {
        return Numeric::dot(a, b, size());
    } else {
        typename ScalarProduct<T>::Type result{};
        for (std::size_t i = 0; i < size(); ++i)
            result += combine(a[i], b[i], [](auto x, auto y) { return x * y; });
        return result;
    }
}

template <class T> void Vector<T>::linear_add(T factor, const Vector& other) {
    requireEqual(size(), other.size(), "Vector<>: Linear Adding Vector<float>: Wrong dimensions");
    T* const own = getExclusive();
    const T* const b = other.get();
    if constexpr (std::floating_point<T>) {
        forChunks(size(),
                  [=](std::size_t i, std::size_t n) { Numeric::Blas<T>::axpy(n, factor, b + i, own + i); });
    } else {
        for (std::size_t i = 0; i < size(); ++i) {
            const T product = combine(factor, b[i], [](auto x, auto y) { return x * y; });
            own[i] = combine(own[i], product, [](auto x, auto y) { return x + y; });
        }
    }
}

template <class T> T Vector<T>::sum() const {
    if constexpr (std::floating_point<T>) {
        double result = 0;
        forChunks(size(), [&](std::size_t i, std::size_t n) { result += Numeric::sum(get() + i, n); });
        return static_cast<T>(result);
    } else {
        T result{};
        for (const T& element : *this)
            result = combine(result, element, [](auto x, auto y) { return x + y; });
        return result;
    }
}

template <class T> Vector<T> Vector<T>::componentMult(const Vector& a, const Vector& b) {
    requireEqual(a.size(), b.size(), "Vector<>: componentMult: Wrong dimensions");
    Vector result(a.size());
    multiplyAll(a.get(), b.get(), result.getExclusive(), a.size());
    return result;
}

template <class T> void Vector<T>::componentMultI(Vector& a, const Vector& b) {
    requireEqual(a.size(), b.size(), "Vector<>: componentMultI: Wrong dimensions");
    T* const own = a.getExclusive();
    multiplyAll(own, b.get(), own, a.size());
}

// One pass of the recurrence of Welford, Technometrics 4 (1962).
template <class T> double Vector<T>::stdDeviation(double& mean) const requires std::is_arithmetic_v<T> {
    if constexpr (!std::is_arithmetic_v<T>) {
        notInstantiated();
    } else {
        if (size() < 2) FN_THROW(FNEBadArg, "Vector<>: stdDeviation: Size < 2");
        double m = 0, squares = 0;
        for (std::size_t i = 0; i < size(); ++i) {
            const double d = static_cast<double>(get()[i]) - m;
            const double weight = 1 / static_cast<double>(i + 1);
            squares += d * d * static_cast<double>(i) * weight;
            m += d * weight;
        }
        mean = m;
        const double variance = squares / static_cast<double>(size() - 1);
        return variance > 0 ? std::sqrt(variance) : 0;
    }
}

template <class T> Vector<T> Vector<T>::componentSqr() const {
    return componentMult(*this, *this);
}

template <class T> Vector<T> Vector<T>::componentSqrt() const requires std::floating_point<T> {
    if constexpr (std::floating_point<T>) {
        Vector result(size());
        T* const out = result.getExclusive();
        forChunks(size(),
                  [=, this](std::size_t i, std::size_t n) { Numeric::squareRoot(get() + i, out + i, n); });
        return result;
    } else {
        notInstantiated();
    }
}

template <class T> Vector<T> Vector<T>::componentTanh() const requires std::floating_point<T> {
    if constexpr (std::floating_point<T>) {
        Vector result(size());
        std::transform(begin(), end(), result.getExclusive(), [](T x) { return std::tanh(x); });
        return result;
    } else {
        notInstantiated();
    }
}

template class Vector<short>;
template class Vector<int>;
template class Vector<unsigned int>;
template class Vector<unsigned long>;
template class Vector<float>;
template class Vector<double>;
template class Vector<FNComplex<float>>;
template class Vector<FNComplex<double>>;
template class Vector<FNGridPos>;

} // namespace VectorImplementations::IPP

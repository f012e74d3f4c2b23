#include "fn/matrix_symmetric.h"

#include "fn/matrix_diagonal.h"
#include "fn/matrix_product.h"
#include "fn/matrix_stream.h"
#include "fn/matrix_text.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"
#include "fn/numeric/work_space.h"

#include <algorithm>
#include <iostream>

namespace Fn {
namespace {

using MatrixText::dimensions;
using Numeric::Blas;
using Numeric::Lapack;

template <class T>
void requireEqual(const SymmMatrix<T>& a, const SymmMatrix<T>& b, const char* operation, const char* symbol) {
    if (a.size() != b.size())
        FN_THROW(FNEBadArg,
                 std::string(operation) + ": Wrong dimensions: " + dimensions(a) + symbol + dimensions(b));
}

std::uint64_t readSize(std::istream& stream) {
    std::uint64_t n = 0;
    if (!(stream >> n)) FN_THROW(FNEBadArg, "SymmMatrix: reading from istream: size missing");
    return n;
}

} // namespace

template <class T> SymmMatrix<T>::SymmMatrix(std::size_t n) : n_(n), elements_(Matrix<T>(n, n).core()) {}

template <class T> SymmMatrix<T>::SymmMatrix(const Matrix<T>& m) : n_(m.rows()), elements_(m.core()) {
    if (m.rows() != m.cols())
        FN_THROW(FNEBadArg, "SymmMatrix::SymmMatrix( const Matrix&): not square!" + dimensions(m));
    if (!m.symmetric()) std::cerr << "Warning: converting Matrix into symmetric where Matrix it's not!\n";
}

template <class T>
SymmMatrix<T>::SymmMatrix(const FNVector<T>& diagonal) : SymmMatrix(DiagonalMatrix<T>(diagonal)) {}

template <class T>
SymmMatrix<T>::SymmMatrix(const DiagonalMatrix<T>& diagonal)
    : n_(diagonal.size()), elements_(Matrix<T>(diagonal).core()) {}

template <class T>
SymmMatrix<T>::SymmMatrix(const SymmMatrix& other, const std::set<unsigned long>& indices)
    : SymmMatrix(indices.size()) {
    if (!indices.empty() && *indices.rbegin() >= other.n_)
        FN_THROW(FNEGeneric, "The largest given index " + std::to_string(*indices.rbegin()) +
                                 " is larger or equal to the given matrix width " + std::to_string(other.n_));
    T* const out = getExclusive();
    std::size_t c = 0;
    for (auto column = indices.begin(); column != indices.end(); ++column, ++c) {
        std::size_t r = c;
        for (auto row = column; row != indices.end(); ++row, ++r) out[index(r, c)] = other(*row, *column);
    }
}

template <class T> SymmMatrix<T>::SymmMatrix(std::istream& stream) : n_(readSize(stream)) {
    const std::uint64_t count = n_ > 0xFFFFFFFF ? ~std::uint64_t{0} : n_ * (n_ + 1) / 2;
    const std::vector<T> triangle =
        readText<T>(stream, count, "SymmMatrix: reading from istream: elements missing");
    elements_.resize(n_ * n_);
    T* const out = getExclusive();
    auto next = triangle.begin();
    for (std::size_t c = 0; c < n_; ++c)
        for (std::size_t r = c; r < n_; ++r) out[index(r, c)] = out[r * n_ + c] = *next++;
}

template <class T> T& SymmMatrix<T>::operator()(std::size_t i, std::size_t j) {
    if (i >= n_ || j >= n_) FN_THROW(FNEOutOfRange, "SymmMatrix: element beyond the end");
    return getExclusive()[index(i, j)];
}

template <class T> void SymmMatrix<T>::updatecol(std::size_t i) {
    if (i >= n_) FN_THROW(FNEOutOfRange, "SymmMatrix: column beyond the end");
    T* const data = getExclusive();
    for (std::size_t r = 0; r < i; ++r) data[i * n_ + r] = data[r * n_ + i];
}

template <class T> FNVector<T> SymmMatrix<T>::column(std::size_t i) const {
    if (i >= n_) FN_THROW(FNEOutOfRange, "SymmMatrix: column beyond the end");
    FNVector<T> result(n_);
    T* const out = result.getExclusive();
    for (std::size_t r = 0; r < n_; ++r) out[r] = (*this)(r, i);
    return result;
}

template <class T> void SymmMatrix<T>::column(std::size_t i, const FNVector<T>& values) {
    if (i >= n_) FN_THROW(FNEOutOfRange, "SymmMatrix: column beyond the end");
    if (values.size() != n_) FN_THROW(FNEBadArg, "SymmMatrix::column(): incompatible sizes");
    T* const data = getExclusive();
    for (std::size_t r = 0; r < n_; ++r) data[index(r, i)] = values.get()[r];
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator=(const SymmMatrix& other) {
    requireEqual(*this, other, "SymmMatrix::operator=( const SymmMatrix& rhs)", " = ");
    elements_ = other.elements_;
    return *this;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator=(T value) {
    std::fill_n(getExclusive(), n_ * n_, value);
    return *this;
}

template <class T> SymmMatrix<T> SymmMatrix<T>::operator+(const SymmMatrix& other) const {
    requireEqual(*this, other, "+( SymmMatrix&, SymmMatrix&)", " + ");
    return SymmMatrix(*this) += other;
}

template <class T> SymmMatrix<T> SymmMatrix<T>::operator-(const SymmMatrix& other) const {
    requireEqual(*this, other, "-( SymmMatrix&, SymmMatrix&)", " - ");
    return SymmMatrix(*this) -= other;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator+=(const SymmMatrix& other) {
    requireEqual(*this, other, "SymmMatrix::operator+=( const SymmMatrix& rhs)", " += ");
    linear_add(1, other);
    return *this;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator-=(const SymmMatrix& other) {
    requireEqual(*this, other, "SymmMatrix::operator-=( const SymmMatrix& rhs)", " -= ");
    linear_add(-1, other);
    return *this;
}

template <class T> void SymmMatrix<T>::linear_add(T factor, const SymmMatrix& other) {
    if (n_ != other.n_)
        FN_THROW(FNEBadArg, "SymmMatrix::linear_add( d, const SymmMatrix& m): Wrong dimensions: " +
                                dimensions(*this) + " m = " + dimensions(other));
    T* const own = getExclusive();
    for (std::size_t c = 0; c < n_; ++c) {
        std::size_t length;
        const std::size_t first = colidx(c, length);
        Blas<T>::axpy(length, factor, other.get() + first, own + first);
    }
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator*=(T factor) {
    T* const own = getExclusive();
    for (std::size_t c = 0; c < n_; ++c) {
        std::size_t length;
        const std::size_t first = colidx(c, length);
        Blas<T>::scal(length, factor, own + first, 1);
    }
    return *this;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator/=(T divisor) {
    if (divisor == 0) FN_THROW(FNEBadArg, "Matrix<T>::operator/=(): Dividing by 0\n");
    return *this *= T{1} / divisor;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator+=(const FNVector<T>& diagonal) {
    linear_add(1, diagonal);
    return *this;
}

template <class T> SymmMatrix<T>& SymmMatrix<T>::operator-=(const FNVector<T>& diagonal) {
    linear_add(-1, diagonal);
    return *this;
}

template <class T> void SymmMatrix<T>::linear_add(T factor, const FNVector<T>& diagonal) {
    if (n_ != diagonal.size())
        FN_THROW(FNEBadArg, "SymmMatrix::linear_add: Wrong dimensions: " + std::to_string(n_) +
                                " != " + std::to_string(diagonal.size()));
    T* const own = getExclusive();
    for (std::size_t i = 0; i < n_; ++i) own[index(i, i)] += factor * diagonal.get()[i];
}

template <class T> FNVector<T> SymmMatrix<T>::operator*(const FNVector<T>& vector) const {
    if (n_ != vector.size())
        FN_THROW(FNEBadArg, "operator*(SymmMatrix&, FNVector&): Wrong dimensions: " + std::to_string(n_) +
                                " != " + std::to_string(vector.size()));
    FNVector<T> result(n_, T{0});
    if (n_ != 0) Blas<T>::symv(n_, get(), vector.get(), result.getExclusive());
    return result;
}

template <class T> Matrix<T> SymmMatrix<T>::operator*(const Matrix<T>& m) const {
    return MKL::smmult(*this, m);
}

template <class T> SymmMatrix<T> SymmMatrix<T>::getSquare() const {
    SymmMatrix result(n_);
    if (n_ != 0) {
        result = T{0};
        const Matrix<T> full(*this);
        Blas<T>::syrk(n_, n_, full.get(), result.getExclusive());
    }
    return result;
}

template <class T> void SymmMatrix<T>::addOuterProduct(const FNVector<T>& v) {
    if (v.size() != n_)
        FN_THROW(FNEBadArg, "SymmMatrix::addOuterProduct(): inappropriate size of update vector");
    if (n_ != 0) Blas<T>::syr(n_, 1, v.get(), getExclusive());
}

template <class T> void SymmMatrix<T>::addOuterProducts(const Matrix<T>& m) {
    if (m.rows() != n_)
        FN_THROW(FNEBadArg, "SymmMatrix::addOuterProducts(): inappropriate update matrix row count");
    if (m.size() != 0) Blas<T>::syrk(n_, m.cols(), m.get(), getExclusive());
}

template <class T> void SymmMatrix<T>::addOuterProducts(const Matrix<T>& a, const Matrix<T>& b) {
    if (a.rows() != n_)
        FN_THROW(FNEBadArg, "SymmMatrix::addOuterProducts(): inappropriate 1st update matrix row count");
    if (b.rows() != n_)
        FN_THROW(FNEBadArg, "SymmMatrix::addOuterProducts(): inappropriate 2nd update matrix row count");
    if (a.cols() != b.cols())
        FN_THROW(FNEBadArg,
                 "SymmMatrix::addOuterProducts(): 1st and 2nd update matrix have different column counts");
    if (a.size() != 0) Blas<T>::syr2k(n_, a.cols(), a.get(), b.get(), getExclusive());
}

template <class T> T SymmMatrix<T>::norm_sq() const {
    double diagonal = 0, below = 0;
    for (std::size_t c = 0; c < n_; ++c) {
        std::size_t length;
        const T* const column = get() + colidx(c, length);
        diagonal += static_cast<double>(column[0]) * static_cast<double>(column[0]);
        for (std::size_t i = 1; i < length; ++i)
            below += static_cast<double>(column[i]) * static_cast<double>(column[i]);
    }
    return static_cast<T>(diagonal + 2 * below);
}

template <class T> void SymmMatrix<T>::invert() {
    if (n_ == 0) return;
    const std::string start = "invert(): the ", illegal = " had an illegal value";
    const std::string singular = "Attempt to invert singular matrix";
    std::vector<int> pivots(n_);
    T* const a = getExclusive();
    const auto factorise = [&](T* work, std::size_t size) {
        return Lapack<T>::sytrf(n_, a, pivots.data(), work, size);
    };
    Numeric::WorkSpace<T> work;
    MatrixText::check(work.query(factorise), start, "-th argument of ?sytrf" + illegal, singular);
    MatrixText::check(work.run(factorise), start, "-th argument of ?sytrf" + illegal, singular);
    std::vector<T> scratch(n_);
    MatrixText::check(Lapack<T>::sytri(n_, a, pivots.data(), scratch.data()), start,
                      "-th argument of ?getri" + illegal, singular);
}

template <class T> bool SymmMatrix<T>::unit() const {
    for (std::size_t c = 0; c < n_; ++c)
        for (std::size_t r = c; r < n_; ++r)
            if (!MatrixZero<T>(r == c ? T{1} - (*this)(r, c) : (*this)(r, c))) return false;
    return true;
}

template class SymmMatrix<float>;
template class SymmMatrix<double>;

} // namespace Fn

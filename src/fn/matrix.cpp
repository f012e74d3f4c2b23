#include "fn/matrix.h"

#include "fn/matrix_decomposition.h"
#include "fn/matrix_diagonal.h"
#include "fn/matrix_product.h"
#include "fn/matrix_solve.h"
#include "fn/matrix_stream.h"
#include "fn/matrix_symmetric.h"
#include "fn/matrix_text.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"

#include <algorithm>

namespace Fn {
namespace {

template <class T> bool sameDimensions(const Matrix<T>& a, const Matrix<T>& b) {
    return a.rows() == b.rows() && a.cols() == b.cols();
}

/// All elements as one vector on the same block.
template <class T> FNVector<T> asVector(const Matrix<T>& m) {
    return FNVector<T>(m.core());
}

template <class T> Matrix<T> shaped(const FNVector<T>& elements, const Matrix<T>& like) {
    return Matrix<T>(elements.core(), like.rows(), like.cols());
}

} // namespace

template <class T>
Matrix<T>::Matrix(const FNVector<T>& a, const FNVector<T>& b) : MatrixStorage<T>(a.size(), b.size()) {
    T* out = this->getExclusive();
    for (const T factor : b)
        out = std::transform(a.begin(), a.end(), out, [=](T element) { return element * factor; });
}

template <class T>
Matrix<T>::Matrix(const DiagonalMatrix<T>& diagonal) : MatrixStorage<T>(diagonal.size(), diagonal.size()) {
    this->fill(0);
    T* const out = this->getExclusive();
    for (std::size_t i = 0; i < this->rows(); ++i) out[this->colidx(i) + i] = diagonal(i);
}

template <class T>
Matrix<T>::Matrix(const SymmMatrix<T>& symmetric) : MatrixStorage<T>(symmetric.size(), symmetric.size()) {
    T* const out = this->getExclusive();
    for (std::size_t c = 0; c < this->cols(); ++c)
        for (std::size_t r = 0; r < this->rows(); ++r) out[this->colidx(c) + r] = symmetric(r, c);
}

template <class T> Matrix<T>::Matrix(std::istream& stream) : Matrix(readMatrix<T>(stream)) {}

template <class T> Matrix<T> Matrix<T>::identity(std::size_t n) {
    return Matrix(DiagonalMatrix<T>(FNVector<T>(n, T{1})));
}

template <class T> Matrix<T>& Matrix<T>::operator=(const Matrix& other) {
    if (!sameDimensions(*this, other))
        FN_THROW(FNEBadArg, "Matrix<T>::operator=( const Matrix<T>&): Wrong dimensions: " +
                                MatrixText::dimensions(*this) + " = " + MatrixText::dimensions(other));
    become(other);
    return *this;
}

template <class T> Matrix<T>& Matrix<T>::operator=(T value) {
    this->fill(value);
    return *this;
}

template <class T> Matrix<T> Matrix<T>::operator+(const Matrix& other) const {
    if (!sameDimensions(*this, other))
        FN_THROW(FNEBadArg, "Matrix operator+( const Matrix& a, const Matrix& b): Wrong dimensions: a = " +
                                MatrixText::dimensions(*this) + " b = " + MatrixText::dimensions(other));
    return shaped(asVector(*this) + asVector(other), *this);
}

template <class T> Matrix<T> Matrix<T>::operator-(const Matrix& other) const {
    if (!sameDimensions(*this, other))
        FN_THROW(FNEBadArg, "Matrix operator-(const Matrix& a, const Matrix& b): Wrong dimensions: a = " +
                                MatrixText::dimensions(*this) + " b = " + MatrixText::dimensions(other));
    return shaped(asVector(*this) - asVector(other), *this);
}

template <class T> Matrix<T>& Matrix<T>::operator+=(const Matrix& other) {
    if (!sameDimensions(*this, other))
        FN_THROW(FNEBadArg, "Matrix<T>::operator+=( const Matrix<T>&): Wrong dimensions: " +
                                MatrixText::dimensions(*this) + " += " + MatrixText::dimensions(other));
    become(*this + other);
    return *this;
}

template <class T> Matrix<T>& Matrix<T>::operator-=(const Matrix& other) {
    if (!sameDimensions(*this, other))
        FN_THROW(FNEBadArg, "Matrix<T>::operator-=( const Matrix<T>&): Wrong dimensions: " +
                                MatrixText::dimensions(*this) + " -= " + MatrixText::dimensions(other));
    become(*this - other);
    return *this;
}

template <class T> Matrix<T>& Matrix<T>::operator*=(T factor) {
    T* const own = this->getExclusive();
    for (std::size_t c = 0; c < this->cols(); ++c)
        Numeric::Blas<T>::scal(this->rows(), factor, own + this->colidx(c), 1);
    return *this;
}

template <class T> Matrix<T>& Matrix<T>::operator/=(T divisor) {
    if (divisor == 0) FN_THROW(FNEBadArg, "Matrix<T>::operator/=(): Dividing by 0\n");
    return *this *= T{1} / divisor;
}

template <class T> void Matrix<T>::linear_add(T factor, const Matrix& other) {
    if (this->size() != other.size()) // as vectors: the shape does not matter
        FN_THROW(FNEBadArg, "Vector<>: Linear Adding Vector<float>: Wrong dimensions");
    T* const own = this->getExclusive();
    for (std::size_t c = 0; c < this->cols(); ++c)
        Numeric::Blas<T>::axpy(this->rows(), factor, other.get() + this->colidx(c), own + this->colidx(c));
}

template <class T> void Matrix<T>::addOuterProduct(const FNVector<T>& u, const FNVector<T>& v) {
    if (u.size() != this->rows())
        FN_THROW(FNEBadArg, "Matrix::addOuterProduct(): inappropriate size of 1st update vector");
    if (v.size() != this->cols())
        FN_THROW(FNEBadArg, "Matrix::addOuterProduct(): inappropriate size of 2nd update vector");
    Numeric::Blas<T>::ger(this->rows(), this->cols(), 1, u.get(), v.get(), this->getExclusive());
}

template <class T>
Matrix<T> Matrix<T>::permuteRows(const Matrix& m, const FNVector<unsigned long>& permutation) {
    Matrix result(m);
    result.permuteRows(permutation);
    return result;
}

template <class T> T Matrix<T>::norm_sq() const {
    const T norm = Numeric::Lapack<T>::frobeniusNorm(this->rows(), this->cols(), this->get());
    return norm * norm;
}

template <class T> T Matrix<T>::sum() const {
    return asVector(*this).sum();
}

template <class T> bool Matrix<T>::symmetric() const {
    if (this->rows() != this->cols()) return false;
    for (std::size_t c = 0; c < this->cols(); ++c)
        for (std::size_t r = c + 1; r < this->rows(); ++r)
            if (!MatrixZero<T>((*this)(r, c) - (*this)(c, r))) return false;
    return true;
}

template <class T> bool Matrix<T>::unit() const {
    if (this->rows() != this->cols()) return false;
    for (std::size_t c = 0; c < this->cols(); ++c)
        for (std::size_t r = 0; r < this->rows(); ++r)
            if (!MatrixZero<T>(r == c ? T{1} - (*this)(r, c) : (*this)(r, c))) return false;
    return true;
}

template <class T> Matrix<T> Matrix<T>::convertToRows(const Matrix& m, std::size_t n) {
    if (n == m.rows()) return m;
    Matrix result(n, m.cols());
    T* const out = result.getExclusive();
    for (std::size_t c = 0; c < m.cols(); ++c)
        std::copy_n(m.get() + m.colidx(c), std::min(n, m.rows()), out + result.colidx(c));
    return result;
}

template <class T> FNVector<T> Matrix<T>::operator*(const FNVector<T>& vector) const {
    return MKL::mvmult(*this, vector, false);
}

template <class T> FNVector<T> operator*(const FNVector<T>& vector, const Matrix<T>& m) {
    return MKL::mvmult(m, vector, true);
}

template <class T> Matrix<T> Matrix<T>::operator*(const Matrix& other) const {
    return MKL::mmmult(*this, other, false, false);
}

template <class T> Matrix<T> Matrix<T>::multWithTransposed(const Matrix& m) const {
    return MKL::mmmult(*this, m, false, true);
}

template <class T> Matrix<T> Matrix<T>::transposedMultWith(const Matrix& m) const {
    return MKL::mmmult(*this, m, true, false);
}

template <class T> void Matrix<T>::addMultWith(const Matrix& a, const Matrix& b, T f) {
    MKL::addmmmult(*this, a, b, false, false, f);
}

template <class T> void Matrix<T>::addMultWithTransposed(const Matrix& a, const Matrix& b, T f) {
    MKL::addmmmult(*this, a, b, false, true, f);
}

template <class T> void Matrix<T>::addTransposedMultWith(const Matrix& a, const Matrix& b, T f) {
    MKL::addmmmult(*this, a, b, true, false, f);
}

template <class T> Matrix<T> Matrix<T>::operator*(const SymmMatrix<T>& other) const {
    return MKL::smmult(*this, other);
}

template <class T> Matrix<T>& Matrix<T>::operator*=(const DiagonalMatrix<T>& diagonal) {
    MKL::diagmult(*this, diagonal);
    return *this;
}

template <class T> void Matrix<T>::invert() {
    MKL::invert(*this);
}

template <class T> Matrix<T> Matrix<T>::invert(const Matrix& m) {
    Matrix result(m);
    MKL::invert(result);
    return result;
}

template <class T> void Matrix<T>::linearSolve(Matrix& b) {
    MKL::gesv(*this, b);
}

template <class T> void Matrix<T>::linearSolve(const Matrix& a, Matrix& b) {
    Matrix(a).linearSolve(b);
}

template <class T> void Matrix<T>::linearSolveLS(Matrix& b) {
    if (this->rows() != b.rows()) FN_THROW(FNEBadArg, "Row sizes of matrices for linearSolveLS do not match");
    Matrix x(convertToRows(b, std::max(this->rows(), this->cols())));
    MKL::gels(*this, x);
    b.become(convertToRows(x, this->cols()));
}

template <class T> void Matrix<T>::linearSolveLS(const Matrix& a, Matrix& b) {
    Matrix(a).linearSolveLS(b);
}

template <class T> void Matrix<T>::linearSolveLS_SVD(Matrix& b) {
    if (this->rows() != b.rows())
        FN_THROW(FNEBadArg, "Row sizes of matrices for linearSolveLS_SVD do not match");
    Matrix x(convertToRows(b, std::max(this->rows(), this->cols())));
    MKL::gelsd(*this, x);
    b.become(convertToRows(x, this->cols()));
}

template <class T> void Matrix<T>::linearSolveLS_SVD(const Matrix& a, Matrix& b) {
    Matrix(a).linearSolveLS_SVD(b);
}

template <class T> MatrixLU<T> Matrix<T>::luDecomposition() {
    return MKL::lu(*this);
}

template <class T> MatrixLU<T> Matrix<T>::createLUDecomposition(const Matrix& m) {
    return Matrix(m).luDecomposition();
}

template <class T> T Matrix<T>::determinantInPlace() {
    return this->rows() == this->cols() ? luDecomposition().determinant() : T{0};
}

template <class T> MatrixQR<T> Matrix<T>::qrDecomposition() {
    return MKL::QR(*this);
}

template <class T> MatrixQR<T> Matrix<T>::createQRDecomposition(const Matrix& m) {
    return Matrix(m).qrDecomposition();
}

template <class T> MatrixSVD<T> Matrix<T>::svd() {
    return MKL::svd(*this);
}

template <class T> MatrixSVD<T> Matrix<T>::createSVD(const Matrix& m) {
    return Matrix(m).svd();
}

template <class T> void Matrix<T>::pseudoInverse() {
    become(svd().pseudoInverse());
}

template <class T> Matrix<T> Matrix<T>::pseudoInverse(const Matrix& m) {
    return createSVD(m).pseudoInverse();
}

template class Matrix<float>;
template class Matrix<double>;
template FNVector<float> operator*(const FNVector<float>&, const Matrix<float>&);
template FNVector<double> operator*(const FNVector<double>&, const Matrix<double>&);

} // namespace Fn

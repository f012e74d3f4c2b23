#include "fn/matrix_product.h"

#include "fn/matrix_diagonal.h"
#include "fn/matrix_symmetric.h"
#include "fn/matrix_text.h"
#include "fn/numeric/blas.h"

namespace Fn {
namespace {

using MatrixText::dimensions;

/// The factors of a product after their transpositions: m by k and kOther by n.
struct Factors {
    std::size_t m, k, kOther, n;
    std::string text() const { return dimensions(m, k) + "*" + dimensions(kOther, n); }
};

template <class T> Factors factors(const Matrix<T>& a, const Matrix<T>& b, bool transA, bool transB) {
    return {transA ? a.cols() : a.rows(), transA ? a.rows() : a.cols(), transB ? b.cols() : b.rows(),
            transB ? b.rows() : b.cols()};
}

} // namespace

namespace MKL {

template <class T> FNVector<T> mvmult(const Matrix<T>& m, const FNVector<T>& v, bool transposed) {
    if (v.size() != (transposed ? m.rows() : m.cols()))
        FN_THROW(FNEBadArg, "Matrix operator*: Wrong dimensions: " +
                                (transposed ? dimensions(1, v.size()) + "*" + dimensions(m)
                                            : dimensions(m) + "*" + dimensions(v.size(), 1)));
    FNVector<T> result(transposed ? m.cols() : m.rows(), T{0});
    if (m.size() != 0)
        Numeric::Blas<T>::gemv(transposed, m.rows(), m.cols(), 1, m.get(), v.get(), 0, result.getExclusive());
    return result;
}
template <class T> Matrix<T> mmmult(const Matrix<T>& a, const Matrix<T>& b, bool transA, bool transB) {
    const Factors f = factors(a, b, transA, transB);
    if (f.k != f.kOther) FN_THROW(FNEBadArg, "MKL matrix mult: Wrong dimensions: " + f.text());
    Matrix<T> result(f.m, f.n);
    result.fill(0); // a product over no elements is 0
    if (f.k != 0)
        Numeric::Blas<T>::gemm(transA, transB, f.m, f.n, f.k, 1, a.get(), b.get(), 0, result.getExclusive());
    return result;
}

template <class T>
void addmmmult(Matrix<T>& result, const Matrix<T>& a, const Matrix<T>& b, bool transA, bool transB,
               T factor) {
    const Factors f = factors(a, b, transA, transB);
    if (f.k != f.kOther) FN_THROW(FNEBadArg, "MKL add matrix mult*: Wrong dimensions: " + f.text());
    if (result.rows() != f.m || result.cols() != f.n)
        FN_THROW(FNEBadArg,
                 "MKL add matrix mult*: Wrong dimensions: " + dimensions(result) + " != " + f.text());
    const Matrix<T> left(a), right(b); // the result may be one of the factors
    if (f.k != 0)
        Numeric::Blas<T>::gemm(transA, transB, f.m, f.n, f.k, factor, left.get(), right.get(), 1,
                               result.getExclusive());
}

template <class T> Matrix<T> smmult(const Matrix<T>& m, const SymmMatrix<T>& s) {
    if (m.cols() != s.size())
        FN_THROW(FNEBadArg, "MKL matrix * symm : Wrong dimensions: " + dimensions(m) + "*" +
                                dimensions(s.size(), s.size()));
    Matrix<T> result(m.rows(), m.cols());
    if (m.size() != 0)
        Numeric::Blas<T>::symm(false, m.rows(), m.cols(), s.get(), m.get(), result.getExclusive());
    return result;
}

template <class T> Matrix<T> smmult(const SymmMatrix<T>& s, const Matrix<T>& m) {
    if (s.size() != m.rows())
        FN_THROW(FNEBadArg, "MKL symm * matrix : Wrong dimensions: " + dimensions(s.size(), s.size()) + "*" +
                                dimensions(m));
    Matrix<T> result(m.rows(), m.cols());
    if (m.size() != 0)
        Numeric::Blas<T>::symm(true, m.rows(), m.cols(), s.get(), m.get(), result.getExclusive());
    return result;
}

template <class T> void diagmult(Matrix<T>& m, const DiagonalMatrix<T>& d) {
    if (m.cols() != d.size())
        FN_THROW(FNEBadArg, "Matrix::*=(DiagonalMatrix): #matrix colums != #diagonal matrix rows");
    T* const elements = m.getExclusive();
    for (std::size_t c = 0; c < m.cols(); ++c)
        Numeric::Blas<T>::scal(m.rows(), d(c), elements + m.colidx(c), 1);
}

template <class T> void diagmult(const DiagonalMatrix<T>& d, Matrix<T>& m) {
    if (m.rows() != d.size())
        FN_THROW(FNEBadArg, "DiagonalMatrix * Matrix: #diagonal matrix colums != #matrix rows");
    T* const elements = m.getExclusive();
    for (std::size_t r = 0; r < m.rows(); ++r) Numeric::Blas<T>::scal(m.cols(), d(r), elements + r, m.rows());
}

template FNVector<float> mvmult(const Matrix<float>&, const FNVector<float>&, bool);
template FNVector<double> mvmult(const Matrix<double>&, const FNVector<double>&, bool);
template Matrix<float> mmmult(const Matrix<float>&, const Matrix<float>&, bool, bool);
template Matrix<double> mmmult(const Matrix<double>&, const Matrix<double>&, bool, bool);
template void addmmmult(Matrix<float>&, const Matrix<float>&, const Matrix<float>&, bool, bool, float);
template void addmmmult(Matrix<double>&, const Matrix<double>&, const Matrix<double>&, bool, bool, double);
template Matrix<float> smmult(const Matrix<float>&, const SymmMatrix<float>&);
template Matrix<double> smmult(const Matrix<double>&, const SymmMatrix<double>&);
template Matrix<float> smmult(const SymmMatrix<float>&, const Matrix<float>&);
template Matrix<double> smmult(const SymmMatrix<double>&, const Matrix<double>&);
template void diagmult(Matrix<float>&, const DiagonalMatrix<float>&);
template void diagmult(Matrix<double>&, const DiagonalMatrix<double>&);
template void diagmult(const DiagonalMatrix<float>&, Matrix<float>&);
template void diagmult(const DiagonalMatrix<double>&, Matrix<double>&);

} // namespace MKL

} // namespace Fn

#include "fn/matrix_decomposition.h"

#include "fn/matrix_diagonal.h"
#include "fn/matrix_product.h"
#include "fn/matrix_text.h"
#include "fn/numeric/lapack.h"
#include "fn/numeric/work_space.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Fn {
namespace {

using MatrixText::check;
using Numeric::Lapack;
using Numeric::WorkSpace;

const std::string illegal = " had an illegal value";
const std::string onQuery = " in worksize retrieval";

/// The upper triangle of the first k rows.
template <class T> Matrix<T> upperTriangle(const Matrix<T>& m, std::size_t k) {
    Matrix<T> result(k, m.cols());
    result.fill(0);
    T* const out = result.getExclusive();
    for (std::size_t c = 0; c < m.cols(); ++c)
        std::copy_n(m.get() + m.colidx(c), std::min(c + 1, k), out + result.colidx(c));
    return result;
}

} // namespace

template <class T> Matrix<T> MatrixSVD<T>::pseudoInverse() const {
    DiagonalMatrix<T> reciprocals(singularValues.size());
    for (std::size_t i = 0; i < reciprocals.size(); ++i) {
        const T s = singularValues.get()[i];
        reciprocals(i) = s < 0 || MatrixZero<T>(s) ? 0 : 1 / s;
    }
    Matrix<T> scaled(Vt);
    reciprocals.mult(scaled);
    return MKL::mmmult(scaled, U, true, true);
}

// The sum of logarithms keeps products of many pivots in range.
template <class T> T MatrixLU<T>::determinant() const {
    if (singular) return 0;
    double logarithm = 0;
    bool negative = false;
    for (std::size_t i = 0; i < factors.rows(); ++i) {
        const double pivot = static_cast<double>(factors(i, i));
        logarithm += std::log(std::abs(pivot));
        negative ^= pivot < 0;
        negative ^= pivots.get()[i] != i;
    }
    if (logarithm < std::log(static_cast<double>(std::numeric_limits<T>::min()))) return 0;
    const T magnitude = static_cast<T>(std::exp(logarithm));
    return negative ? -magnitude : magnitude;
}

namespace MKL {

template <class T> MatrixLU<T> lu(Matrix<T>& m) {
    const std::size_t n = std::min(m.rows(), m.cols());
    std::vector<int> pivots(n);
    int info = 0;
    if (n != 0) info = Lapack<T>::getrf(m.rows(), m.cols(), m.getExclusive(), pivots.data());
    check(std::min(info, 0), "luDecomposition(): the ", "-th argument of ?getrf" + illegal, "");

    FNVector<unsigned long> zeroBased(n);
    unsigned long* const out = zeroBased.getExclusive();
    for (std::size_t i = 0; i < n; ++i) {
        if (pivots[i] < 1 || static_cast<std::size_t>(pivots[i]) > m.rows())
            FN_THROW(FNEBadArg, "Invalid position in permutation vector");
        out[i] = static_cast<unsigned long>(pivots[i] - 1);
    }
    return {m, zeroBased, info > 0};
}

template <class T> MatrixQR<T> QR(Matrix<T>& m) {
    const std::size_t k = std::min(m.rows(), m.cols());
    if (k == 0) return {Matrix<T>(m.rows(), 0), Matrix<T>(0, m.cols())};
    std::vector<T> tau(k);
    const std::string start = "MKL::QR(): the ", error = "MKL::QR(): error %d in ?geqrf";
    const std::string geqrf = "-th argument of ?geqrf" + illegal, orgqr = "-th argument of ?orgqr" + illegal;

    T* const a = m.getExclusive();
    const auto factorise = [&](T* work, std::size_t size) {
        return Lapack<T>::geqrf(m.rows(), m.cols(), a, tau.data(), work, size);
    };
    WorkSpace<T> work;
    check(work.query(factorise), start, geqrf + onQuery, error + " worksize retrieval");
    check(work.run(factorise), start, geqrf, error);
    const Matrix<T> r(upperTriangle(m, k));

    Matrix<T> q(m.core(), m.rows(), k);
    T* const columns = q.getExclusive();
    const auto expand = [&](T* workArray, std::size_t size) {
        return Lapack<T>::orgqr(m.rows(), k, k, columns, tau.data(), workArray, size);
    };
    check(work.query(expand), start, orgqr + onQuery, error);
    check(work.run(expand), start, orgqr, error);
    return {q, r};
}

template <class T> MatrixSVD<T> svd(Matrix<T>& m) {
    const std::size_t rows = m.rows(), cols = m.cols(), k = std::min(rows, cols);
    if (k == 0) return {FNVector<T>(), Matrix<T>(rows, 0), Matrix<T>(0, cols)};
    const std::string start = "MKL::svd(): the ", gesdd = "-th argument of ?gesdd" + illegal;

    const bool tall = rows >= cols; // then U takes the place of m, else Vt
    FNVector<T> values(k);
    Matrix<T> other(k, k);
    std::vector<int> integerWork(8 * k);
    T *const a = m.getExclusive(), *const s = values.getExclusive(), *const o = other.getExclusive();
    const auto decompose = [&](T* work, std::size_t size) {
        return Lapack<T>::gesdd(rows, cols, a, s, tall ? nullptr : o, tall ? o : nullptr, work, size,
                                integerWork.data());
    };
    WorkSpace<T> work;
    check(work.query(decompose), start, gesdd + onQuery, "MKL::svd(): error %d in ?gesdd worksize retrieval");
    check(work.run(decompose), start, gesdd, "MKL::svd(): ?bdsqr did not converge in %d superdiagonals");
    return tall ? MatrixSVD<T>{values, m, other} : MatrixSVD<T>{values, other, m};
}

template MatrixLU<float> lu(Matrix<float>&);
template MatrixLU<double> lu(Matrix<double>&);
template MatrixQR<float> QR(Matrix<float>&);
template MatrixQR<double> QR(Matrix<double>&);
template MatrixSVD<float> svd(Matrix<float>&);
template MatrixSVD<double> svd(Matrix<double>&);

} // namespace MKL

template struct MatrixSVD<float>;
template struct MatrixSVD<double>;
template struct MatrixLU<float>;
template struct MatrixLU<double>;

} // namespace Fn

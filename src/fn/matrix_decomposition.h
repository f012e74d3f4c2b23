#pragma once

#include "fn/matrix.h"

/// Results of decompositions of a matrix, and the functions that make them; the members of Matrix call these.

namespace Fn {

/// m = U * diag(singularValues) * Vt; with k the smaller dimension of m, U has k columns and Vt has k rows.
/// Singular values descend.
template <class T> struct MatrixSVD {
    FNVector<T> singularValues;
    Matrix<T> U;
    Matrix<T> Vt;

    /// Vt^T * diag(1 / s) * U^T, where a singular value below 0 or of MatrixZero counts as having the
    /// reciprocal 0.
    Matrix<T> pseudoInverse() const;
};

/// m = Q * R; with k the smaller dimension of m, Q has k orthonormal columns and R, upper triangular, has k
/// rows.
template <class T> struct MatrixQR {
    Matrix<T> Q;
    Matrix<T> R;
};

/// Row exchange `pivots` of m gives L * U: for i in order, rows i and pivots[i] are swapped
/// (Matrix::permuteRows).
template <class T> struct MatrixLU {
    /// U in the upper triangle, L below it; the diagonal of L is 1 and not stored.
    Matrix<T> factors;
    FNVector<unsigned long> pivots;
    /// U has a 0 on its diagonal.
    bool singular;

    /// 0 if singular, or if below the smallest normal number in magnitude.
    T determinant() const;
};

namespace MKL {

/// All destroy their argument; the results may use its block.
template <class T> MatrixLU<T> lu(Matrix<T>& m);
template <class T> MatrixQR<T> QR(Matrix<T>& m);
template <class T> MatrixSVD<T> svd(Matrix<T>& m);

} // namespace MKL

extern template struct MatrixSVD<float>;
extern template struct MatrixSVD<double>;
extern template struct MatrixLU<float>;
extern template struct MatrixLU<double>;

} // namespace Fn

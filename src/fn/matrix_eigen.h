#pragma once

#include "fn/matrix_diagonal.h"
#include "fn/matrix_symmetric.h"

/// Eigenvectors and triangular factors of symmetric matrices of float or double.
///
/// Eigenvectors are the columns of a matrix, of unit length, in the order of the eigenvalues that are
/// returned. Unless said otherwise eigenvalues ascend. Failures throw FNEBadArg.

namespace Fn {

/// The lower factor L of m = L * L^T. @throws FNEBadArg if m is not positive definite.
template <class T> Matrix<T> cholesky(const SymmMatrix<T>& m);

/// The diagonal D of m = L * D * L^T; `lower` receives L, whose diagonal is 1. Rows are not exchanged.
/// @throws FNEBadArg if a diagonal element but the last is 0, or `lower` has other dimensions.
template <class T> DiagonalMatrix<T> ldlDecomposition(const SymmMatrix<T>& m, Matrix<T>& lower);

/// Eigenvalues of a symmetric matrix, of which the lower triangle is used. `m` is destroyed; with `vectors`
/// it receives the eigenvectors.
template <class T> FNVector<T> eigenVectorsInPlace(Matrix<T>& m, bool vectors);

/// The `wanted` largest eigenvalues (all for -1). `m` is destroyed. With `vectors`, the first columns of
/// `eigenVectors` receive the eigenvectors: as many rows as `m` and at least as many columns as wanted.
template <class T>
FNVector<T> eigenVectorsLowMem(SymmMatrix<T>& m, Matrix<T>& eigenVectors, bool vectors, int wanted = -1);

/// The `wanted` eigenvalues that are largest by absolute value, largest first; otherwise like
/// eigenVectorsLowMem.
template <class T>
FNVector<T> dominantEigenVectors(SymmMatrix<T>& m, Matrix<T>& eigenVectors, bool vectors,
                                 unsigned int wanted);

/// Indices of the `n` values that are largest by absolute value, largest first, of equal ones the earlier
/// first.
template <class T> std::vector<std::size_t> absOrdered(const FNVector<T>& values, std::size_t n);

/// Solutions of a * x = lambda * b * x for symmetric `a` (lower triangle) and positive definite `b`. Both are
/// destroyed; with `vectors`, `a` receives the eigenvectors, which are orthonormal in the scalar product of
/// b.
template <class T> FNVector<T> generalizedEigenVectors(Matrix<T>& a, SymmMatrix<T>& b, bool vectors);

/// The `wanted` largest eigenvalues of the same problem (all for -1); `eigenVectors` as for
/// eigenVectorsLowMem.
template <class T>
FNVector<T> generalizedEigenVectorsLowMem(SymmMatrix<T>& a, SymmMatrix<T>& b, Matrix<T>& eigenVectors,
                                          bool vectors, int wanted = -1);

} // namespace Fn

#pragma once

#include "fn/vector3.h"

/// Eigenvectors and singular vectors of 3 by 3 matrices. They are the columns of the matrices that are
/// written, in the order of the values, of length 1 and at right angles.

/// Eigenvalues of a symmetric matrix, descending, in closed form (O. K. Smith, "Eigenvalues of a symmetric 3
/// x 3 matrix", 1961). Differences below about 1e-14 of the greatest element count as none.
/// @param order whether orderEigenVectors finishes the result
FN3Vector<double> symmetricDouble3MatrixEigenVectors(FN3Matrix<double> const& matrix,
                                                     FN3Matrix<double>& vectors, bool order);

/// Sets eigenvalues below 1e-14 in magnitude and their vectors to zero, and moves them to the end.
void orderEigenVectors(FN3Vector<double>& values, FN3Matrix<double>& vectors);

/// Singular values, descending: matrix = u * diag(values) * transposed v. For `double`.
template <class T> FN3Vector<T> FN3MatrixSVD(FN3Matrix<T> const& matrix, FN3Matrix<T>& u, FN3Matrix<T>& v);

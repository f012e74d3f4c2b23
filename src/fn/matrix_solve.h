#pragma once

#include "fn/matrix.h"

/// Solvers over LAPACK, in place; the members of Matrix call these. Dimensions that do not fit, singular
/// matrices and arguments that LAPACK rejects throw FNEBadArg.

namespace Fn::MKL {

template <class T> void invert(Matrix<T>& m);

/// Overwrites `a` with its factors and `b` with the solution of a * x = b.
template <class T> void gesv(Matrix<T>& a, Matrix<T>& b);

/// Least squares for a matrix of full rank and for any; `b` has max(a.rows(), a.cols()) rows, of which the
/// first a.cols() become the solution.
template <class T> void gels(Matrix<T>& a, Matrix<T>& b);
template <class T> void gelsd(Matrix<T>& a, Matrix<T>& b);

} // namespace Fn::MKL

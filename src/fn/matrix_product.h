#pragma once

#include "fn/matrix.h"

/// Products of matrices of all kinds, with transposition flags; the operators of the classes call these.

namespace Fn::MKL {

/// m * v, or v^T * m as a vector if `transposed`.
template <class T> FNVector<T> mvmult(const Matrix<T>& m, const FNVector<T>& v, bool transposed);

/// op(a) * op(b), where op is the transposition if its flag is set.
template <class T> Matrix<T> mmmult(const Matrix<T>& a, const Matrix<T>& b, bool transA, bool transB);

/// result += f * op(a) * op(b).
template <class T>
void addmmmult(Matrix<T>& result, const Matrix<T>& a, const Matrix<T>& b, bool transA, bool transB, T f);

/// m * s and s * m.
template <class T> Matrix<T> smmult(const Matrix<T>& m, const SymmMatrix<T>& s);
template <class T> Matrix<T> smmult(const SymmMatrix<T>& s, const Matrix<T>& m);

/// m becomes m * d, its columns scaled, or d * m, its rows scaled.
template <class T> void diagmult(Matrix<T>& m, const DiagonalMatrix<T>& d);
template <class T> void diagmult(const DiagonalMatrix<T>& d, Matrix<T>& m);

} // namespace Fn::MKL

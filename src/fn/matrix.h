#pragma once

#include "fn/matrix_storage.h"

#include <iosfwd>

/// Dense matrices over BLAS and LAPACK.
///
///     Fn::Matrix<double> a(2, 2), b(2, 1);
///     ...
///     Fn::Matrix<double>::linearSolve(a, b);   // b becomes the solution of a * x = b
///
/// Layout, copying and package form are told at MatrixStorage. All mismatches of dimensions throw FNEBadArg
/// and name both. What is called in place destroys its input; the static forms of the same name copy first.
/// Threads: a matrix has no lock; two handles of one block may be used on two threads.
///
/// matrix_symmetric.h and matrix_diagonal.h have the special forms, matrix_decomposition.h the results of
/// decompositions, matrix_eigen.h eigenvectors and the triangular factors of symmetric matrices.

namespace Fn {

template <class T> class SymmMatrix;
template <class T> class DiagonalMatrix;
template <class T> struct MatrixSVD;
template <class T> struct MatrixQR;
template <class T> struct MatrixLU;

/// Half width of the open interval around 0 in which a number counts as 0: 1000 times the machine epsilon of
/// T.
template <class T> inline constexpr double matrixEpsilon = 0;
template <> inline constexpr double matrixEpsilon<float> = 1.1920928955078125e-4;
template <> inline constexpr double matrixEpsilon<double> = 2.220446049250313e-13;

/// Whether x counts as 0 beside numbers of the order of 1.
template <class T> constexpr bool MatrixZero(T x) {
    return -matrixEpsilon<T> < x && x < matrixEpsilon<T>;
}

/// Matrix of float or double.
template <class T> class Matrix : public MatrixStorage<T> {
public:
    using MatrixStorage<T>::MatrixStorage;
    Matrix() = default;
    Matrix(const Matrix&) = default;
    ~Matrix() = default;
    /// Outer product: column c is a * b[c].
    Matrix(const FNVector<T>& a, const FNVector<T>& b);
    /// Zeros and the diagonal.
    explicit Matrix(const DiagonalMatrix<T>& diagonal);
    /// The full square.
    explicit Matrix(const SymmMatrix<T>& symmetric);
    /// Reads either the binary form, a line "Fn::Matrix<float> Little Endian v2.0 ROWS COLS" ("double" for
    /// double) followed by the elements as they lie in memory, or plain text: rows, columns and the elements
    /// row after row. Memory grows with what has arrived. @throws FNEBadArg
    explicit Matrix(std::istream& stream);

    /// The n by n unit matrix.
    static Matrix identity(std::size_t n);

    /// Shares the block of a matrix of the same dimensions; assignment never reshapes. @throws FNEBadArg
    Matrix& operator=(const Matrix& other);
    /// Sets all elements.
    Matrix& operator=(T value);

    Matrix operator+(const Matrix& other) const;
    Matrix operator-(const Matrix& other) const;
    Matrix& operator+=(const Matrix& other);
    Matrix& operator-=(const Matrix& other);
    Matrix& operator*=(T factor);
    Matrix operator*(T factor) const { return Matrix(*this) *= factor; }
    /// Multiplies by the reciprocal. @throws FNEBadArg for 0.
    Matrix& operator/=(T divisor);
    Matrix operator/(T divisor) const { return Matrix(*this) /= divisor; }
    /// Adds factor * other.
    void linear_add(T factor, const Matrix& other);

    FNVector<T> operator*(const FNVector<T>& vector) const;
    Matrix operator*(const Matrix& other) const;
    Matrix operator*(const SymmMatrix<T>& other) const;
    Matrix operator*(const DiagonalMatrix<T>& diagonal) const { return Matrix(*this) *= diagonal; }
    /// Scales the columns.
    Matrix& operator*=(const DiagonalMatrix<T>& diagonal);
    /// this * m^T and this^T * m.
    Matrix multWithTransposed(const Matrix& m) const;
    Matrix transposedMultWith(const Matrix& m) const;
    /// Adds f * a * b, f * a * b^T, f * a^T * b.
    void addMultWith(const Matrix& a, const Matrix& b, T f);
    void addMultWithTransposed(const Matrix& a, const Matrix& b, T f);
    void addTransposedMultWith(const Matrix& a, const Matrix& b, T f);
    /// Adds u * v^T.
    void addOuterProduct(const FNVector<T>& u, const FNVector<T>& v);

    /// In place, without a second block.
    Matrix& transpose() { return this->transposeInPlace(), *this; }
    using MatrixStorage<T>::permuteRows;
    static Matrix permuteRows(const Matrix& m, const FNVector<unsigned long>& permutation);

    /// Square of the Frobenius norm.
    T norm_sq() const;
    T sum() const;
    /// Whether this is square and equal to its transpose, by MatrixZero.
    bool symmetric() const;
    /// Whether this is a unit matrix, by MatrixZero.
    bool unit() const;

    /// Inverse. @throws FNEBadArg if not square or singular.
    void invert();
    static Matrix invert(const Matrix& m);
    /// Solves this * x = b for each column of b, which is overwritten. @throws FNEBadArg if not square or
    /// singular.
    void linearSolve(Matrix& b);
    static void linearSolve(const Matrix& a, Matrix& b);
    /// Least squares for a matrix of full rank; b gets as many rows as this has columns.
    void linearSolveLS(Matrix& b);
    static void linearSolveLS(const Matrix& a, Matrix& b);
    /// The least squares solution of least norm, for any rank.
    void linearSolveLS_SVD(Matrix& b);
    static void linearSolveLS_SVD(const Matrix& a, Matrix& b);

    MatrixLU<T> luDecomposition();
    static MatrixLU<T> createLUDecomposition(const Matrix& m);
    /// 0 for a matrix that is singular or not square.
    T determinantInPlace();
    T determinant() const { return Matrix(*this).determinantInPlace(); }
    MatrixQR<T> qrDecomposition();
    static MatrixQR<T> createQRDecomposition(const Matrix& m);
    MatrixSVD<T> svd();
    static MatrixSVD<T> createSVD(const Matrix& m);
    /// Moore-Penrose inverse: reciprocals of singular values that are 0, by MatrixZero, are 0.
    void pseudoInverse();
    static Matrix pseudoInverse(const Matrix& m);

    /// The same columns with `n` rows; rows beyond the old end are uninitialised.
    static Matrix convertToRows(const Matrix& m, std::size_t n);

private:
    /// Takes over the dimensions too, which assignment does not.
    void become(const Matrix& other) { MatrixStorage<T>::operator=(other); }
};

/// vector^T * m, as a vector.
template <class T> FNVector<T> operator*(const FNVector<T>& vector, const Matrix<T>& m);

extern template class Matrix<float>;
extern template class Matrix<double>;
extern template FNVector<float> operator*(const FNVector<float>&, const Matrix<float>&);
extern template FNVector<double> operator*(const FNVector<double>&, const Matrix<double>&);

/// Matrices that are only stored: 8-bit weights of projections, and labels.
template <> class Matrix<signed char> : public MatrixStorage<signed char> {
public:
    using MatrixStorage::MatrixStorage;
    Matrix() = default;
};
template <> class Matrix<int> : public MatrixStorage<int> {
public:
    using MatrixStorage::MatrixStorage;
    Matrix() = default;
};

/// `name` with the element type: "name<float>" or "name<double>".
template <class T> std::string templateId(const std::string& name);
template <> inline std::string templateId<float>(const std::string& name) {
    return name + "<float>";
}
template <> inline std::string templateId<double>(const std::string& name) {
    return name + "<double>";
}

} // namespace Fn

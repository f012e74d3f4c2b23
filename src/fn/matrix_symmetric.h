#pragma once

#include "fn/matrix.h"

#include <iosfwd>
#include <set>

namespace Fn {

/// Symmetric n by n matrix of float or double.
///
/// Stored as a full square, column after column, of which only the triangle with row not smaller than column
/// counts: element (i, j) is number min(i, j) * n + max(i, j). What lies above the diagonal is undefined.
/// Copies share the block until one is written.
template <class T> class SymmMatrix {
public:
    /// Uninitialised.
    explicit SymmMatrix(std::size_t n);
    /// The lower triangle of a square matrix. If that is not symmetric, a warning goes to the error stream.
    /// @throws FNEBadArg if it is not square.
    explicit SymmMatrix(const Matrix<T>& m);
    /// Zeros and the diagonal.
    explicit SymmMatrix(const FNVector<T>& diagonal);
    explicit SymmMatrix(const DiagonalMatrix<T>& diagonal);
    /// The rows and columns of these indices. @throws FNEGeneric for an index beyond the end.
    SymmMatrix(const SymmMatrix& other, const std::set<unsigned long>& indices);
    /// Reads text: n, then for each column the entries from the diagonal down. @throws FNEBadArg
    explicit SymmMatrix(std::istream& stream);
    SymmMatrix(const SymmMatrix&) = default;

    /// Number of rows and of columns.
    std::size_t size() const noexcept { return n_; }
    std::size_t rows() const noexcept { return n_; }
    std::size_t cols() const noexcept { return n_; }

    const T* get() const noexcept { return elements_.data(); }
    T* getExclusive() { return elements_.getExclusive(); }
    const FNRMem<T>& core() const noexcept { return elements_; }
    /// Index of the diagonal element of column i, where its valid part begins, whose length is left in `len`.
    std::size_t colidx(std::size_t i, std::size_t& len) const noexcept {
        len = n_ - i;
        return i * (n_ + 1);
    }
    /// Element for reading, unchecked.
    T operator()(std::size_t i, std::size_t j) const noexcept { return get()[index(i, j)]; }
    /// Element for writing. @throws FNEOutOfRange
    T& operator()(std::size_t i, std::size_t j);
    /// Makes column i whole above the diagonal too.
    void updatecol(std::size_t i);
    /// @throws FNEOutOfRange beyond the end; FNEBadArg for a wrong size.
    FNVector<T> column(std::size_t i) const;
    void column(std::size_t i, const FNVector<T>& values);
    Matrix<T> toMatrix() const { return Matrix<T>(*this); }

    /// Shares the block of a matrix of the same size. @throws FNEBadArg
    SymmMatrix& operator=(const SymmMatrix& other);
    /// Sets all elements.
    SymmMatrix& operator=(T value);
    SymmMatrix operator+(const SymmMatrix& other) const;
    SymmMatrix operator-(const SymmMatrix& other) const;
    SymmMatrix& operator+=(const SymmMatrix& other);
    SymmMatrix& operator-=(const SymmMatrix& other);
    SymmMatrix& operator*=(T factor);
    SymmMatrix operator*(T factor) const { return SymmMatrix(*this) *= factor; }
    /// Multiplies by the reciprocal. @throws FNEBadArg for 0.
    SymmMatrix& operator/=(T divisor);
    void linear_add(T factor, const SymmMatrix& other);
    /// On the diagonal.
    SymmMatrix& operator+=(const FNVector<T>& diagonal);
    SymmMatrix& operator-=(const FNVector<T>& diagonal);
    void linear_add(T factor, const FNVector<T>& diagonal);

    FNVector<T> operator*(const FNVector<T>& vector) const;
    Matrix<T> operator*(const Matrix<T>& m) const;
    /// This matrix times itself.
    SymmMatrix getSquare() const;
    /// Adds v * v^T.
    void addOuterProduct(const FNVector<T>& v);
    /// Adds m * m^T, and a * b^T + b * a^T.
    void addOuterProducts(const Matrix<T>& m);
    void addOuterProducts(const Matrix<T>& a, const Matrix<T>& b);

    /// Square of the Frobenius norm.
    T norm_sq() const;
    T determinant() const { return toMatrix().determinantInPlace(); }
    /// @throws FNEBadArg if singular.
    void invert();
    /// Whether this is a unit matrix, by MatrixZero.
    bool unit() const;

private:
    std::size_t index(std::size_t i, std::size_t j) const noexcept { return i < j ? i * n_ + j : j * n_ + i; }

    std::size_t n_;
    FNRMem<T> elements_;
};

extern template class SymmMatrix<float>;
extern template class SymmMatrix<double>;

} // namespace Fn

#pragma once

#include "fn/vector.h"

#include <iosfwd>

namespace Fn {

/// The elements of a matrix, column after column with no padding: element (r, c) is number c * rows + r,
/// which is the layout of LAPACK with leading dimension `rows`. Copies share the block, and the first write
/// to a shared block copies it.
///
/// Elements are float, double, int or signed char. A matrix packs as two cores: rows and columns, 4 bytes
/// each, most significant first, and the elements in storage order in stored form (byte_order.h).
template <class T> class MatrixStorage {
public:
    using value_type = T;

    /// 1 by 1, uninitialised.
    MatrixStorage() : MatrixStorage(1, 1) {}
    /// Uninitialised elements.
    MatrixStorage(std::size_t rows, std::size_t cols);
    /// Shares the first rows * cols elements of `elements`. @throws FNEBadArg if there are less.
    MatrixStorage(const FNRMem<T>& elements, std::size_t rows, std::size_t cols);
    /// One column.
    explicit MatrixStorage(const FNVector<T>& column)
        : rows_(column.size()), cols_(1), elements_(column.core()) {}
    /// Copies the block from (i1, j1) to (i2, j2), both included. @throws FNEBadArg for indices beyond the
    /// end or in descending order.
    MatrixStorage(const MatrixStorage& other, std::size_t i1, std::size_t j1, std::size_t i2, std::size_t j2);
    /// @throws FNEBadArg if the package does not hold a matrix of T.
    explicit MatrixStorage(const Package& package);
    explicit operator Package() const;

    std::size_t rows() const noexcept { return rows_; }
    std::size_t cols() const noexcept { return cols_; }
    /// Number of elements.
    std::size_t size() const noexcept { return rows_ * cols_; }

    /// First element for reading.
    const T* get() const noexcept { return elements_.data(); }
    /// First element for writing; holds until the matrix is copied.
    T* getExclusive() { return elements_.getExclusive(); }
    const FNRMem<T>& core() const noexcept { return elements_; }
    /// Index of the first element of a column.
    std::size_t colidx(std::size_t c) const noexcept { return c * rows_; }
    /// Element (r, c) of the elements at `first`, which come from get() or getExclusive().
    template <class Pointer> auto& access(Pointer first, std::size_t r, std::size_t c) const noexcept {
        return first[colidx(c) + r];
    }

    /// Element for writing. @throws FNEOutOfRange. In loops, take getExclusive() once instead.
    T& operator()(std::size_t r, std::size_t c) {
        if (r >= rows_ || c >= cols_) throwOutOfRange();
        return getExclusive()[colidx(c) + r];
    }
    /// Element for reading, unchecked.
    const T& operator()(std::size_t r, std::size_t c) const noexcept { return get()[colidx(c) + r]; }

    /// Copies of a row or column, and writing of one. @throws FNEBadArg beyond the end or for a wrong size.
    FNVector<T> row(std::size_t i) const;
    FNVector<T> column(std::size_t i) const;
    void row(std::size_t i, const FNVector<T>& values);
    void column(std::size_t i, const FNVector<T>& values);

    void fill(T value);

    /// Exchanges rows and columns without a second block.
    void transposeInPlace();
    /// @throws FNEBadArg beyond the last column.
    void swapColumns(std::size_t i, std::size_t j);
    /// The same with scratch memory for one column, on elements that getExclusive() gave.
    void swapColumns(T* buffer, T* data, std::size_t i, std::size_t j) const;
    /// Reverses the order of the first `n` columns. @throws FNEBadArg if there are less.
    void mirror(std::size_t n);
    void mirror() { mirror(cols_); }
    /// For each i in order, swaps the rows i and permutation[i]. @throws FNEBadArg for more entries than
    /// rows, or for an entry beyond the last row.
    void permuteRows(const FNVector<unsigned long>& permutation);

    /// Same dimensions and all elements equal.
    bool operator==(const MatrixStorage& other) const;

    /// Writes rows and columns in one line, then one line for each row with a blank before each element.
    void print(std::ostream& stream) const;

protected:
    ~MatrixStorage() = default;
    MatrixStorage(const MatrixStorage&) = default;
    /// Takes over dimensions and block.
    MatrixStorage& operator=(const MatrixStorage&) = default;

private:
    [[noreturn]] static void throwOutOfRange();

    std::size_t rows_;
    std::size_t cols_;
    FNRMem<T> elements_;
};

extern template class MatrixStorage<float>;
extern template class MatrixStorage<double>;
extern template class MatrixStorage<int>;
extern template class MatrixStorage<signed char>;

} // namespace Fn

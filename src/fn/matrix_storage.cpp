#include "fn/matrix_storage.h"

#include "fn/matrix_text.h"
#include "fn/numeric/stored_elements.h"

#include <algorithm>
#include <ostream>
#include <string>

namespace Fn {
namespace {

constexpr std::size_t dimensionsSize = 8;

/// Number of elements of a fresh block. @throws std::bad_array_new_length
std::size_t product(std::size_t rows, std::size_t cols) {
    if (cols != 0 && rows > std::numeric_limits<std::size_t>::max() / cols) throw std::bad_array_new_length();
    return rows * cols;
}

} // namespace

template <class T>
MatrixStorage<T>::MatrixStorage(std::size_t rows, std::size_t cols)
    : rows_(rows), cols_(cols), elements_(product(rows, cols)) {}

template <class T>
MatrixStorage<T>::MatrixStorage(const FNRMem<T>& elements, std::size_t rows, std::size_t cols)
    : rows_(rows), cols_(cols), elements_(elements) {
    if (cols != 0 && elements.size() / cols < rows)
        FN_THROW(FNEBadArg, "Matrix ctor from FNRMem: size too small");
    if (elements.size() != size()) elements_ = FNRMem<T>(elements, 0, size());
}

template <class T>
MatrixStorage<T>::MatrixStorage(const MatrixStorage& other, std::size_t i1, std::size_t j1, std::size_t i2,
                                std::size_t j2)
    : rows_(0), cols_(0) {
    if (i1 > i2 || j1 > j2 || i2 >= other.rows_ || j2 >= other.cols_)
        FN_THROW(FNEBadArg, "Matrix::Matrix( const Matrix&, idx, idx, idx, idx): Wrong indexes: " +
                                MatrixText::indexes(i1, j1, i2, j2));
    rows_ = i2 - i1 + 1;
    cols_ = j2 - j1 + 1;
    elements_.resize(size());
    T* out = elements_.getExclusive();
    for (std::size_t c = j1; c <= j2; ++c) out = std::copy_n(other.get() + other.colidx(c) + i1, rows_, out);
}

template <class T> MatrixStorage<T>::MatrixStorage(const Package& package) : rows_(0), cols_(0) {
    const auto& cores = package.cores();
    if (cores.size() != 2 || cores.front().size() != dimensionsSize)
        FN_THROW(FNEBadArg, "Creating a Matrix from an invalid package");
    const unsigned char* const dimensions = cores.front().data();
    const std::uint64_t rows = loadUInt32(dimensions), cols = loadUInt32(dimensions + 4);
    const std::uint64_t stored = cores.back().size();
    if (stored % Numeric::storedSize<T> != 0 || stored / Numeric::storedSize<T> != rows * cols)
        FN_THROW(FNEBadArg, "Matrix dimensions contradicts packages dimension");
    rows_ = rows;
    cols_ = cols;
    if constexpr (sizeof(T) == 1) {
        // The large matrices of this type are used where they were read.
        elements_ = FNRMem<T>(FNRMem<T>(cores.back().core()), cores.back().offset(), size());
    } else {
        elements_.resize(size());
        Numeric::loadElements(cores.back().data(), elements_.getExclusive(), size());
    }
}

template <class T> MatrixStorage<T>::operator Package() const {
    Package::Core dimensions(dimensionsSize), stored(size() * Numeric::storedSize<T>);
    unsigned char* const out = dimensions.getExclusive();
    storeUInt32(static_cast<std::uint32_t>(rows_), out);
    storeUInt32(static_cast<std::uint32_t>(cols_), out + 4);
    Numeric::storeElements(get(), stored.getExclusive(), size());
    return Package(std::list<Package::Core>{dimensions, stored});
}

template <class T> FNVector<T> MatrixStorage<T>::row(std::size_t i) const {
    if (i >= rows_) FN_THROW(FNEBadArg, "Matrix<T>::row(size_t): argument outside of row range");
    FNVector<T> result(cols_);
    T* const out = result.getExclusive();
    for (std::size_t c = 0; c < cols_; ++c) out[c] = (*this)(i, c);
    return result;
}

template <class T> FNVector<T> MatrixStorage<T>::column(std::size_t i) const {
    if (i >= cols_) FN_THROW(FNEBadArg, "Matrix<T>::column(size_t): argument outside of column range");
    return FNVector<T>(std::span<const T>(get() + colidx(i), rows_));
}

template <class T> void MatrixStorage<T>::row(std::size_t i, const FNVector<T>& values) {
    if (i >= rows_) FN_THROW(FNEBadArg, "Matrix<T>::row(size_t, vector): argument outside of row range");
    if (values.size() != cols_)
        FN_THROW(FNEBadArg, "Matrix<T>::row(): incompatible sizes in vector and column");
    T* const out = getExclusive();
    for (std::size_t c = 0; c < cols_; ++c) out[colidx(c) + i] = values.get()[c];
}

template <class T> void MatrixStorage<T>::column(std::size_t i, const FNVector<T>& values) {
    if (i >= cols_)
        FN_THROW(FNEBadArg, "Matrix<T>::column(size_t, vector): argument outside of column range");
    if (values.size() != rows_)
        FN_THROW(FNEBadArg, "Matrix<T>::column(): incompatible sizes in vector and row");
    std::copy(values.begin(), values.end(), getExclusive() + colidx(i));
}

template <class T> void MatrixStorage<T>::fill(T value) {
    std::fill_n(getExclusive(), size(), value);
}

// The element at i goes to i * cols modulo (size - 1), the last one stays. Each cycle of that permutation is
// followed once, from its lowest index.
template <class T> void MatrixStorage<T>::transposeInPlace() {
    if (rows_ > 1 && cols_ > 1) {
        T* const data = getExclusive();
        const std::size_t last = size() - 1;
        const auto next = [&](std::size_t i) { return (i % rows_) * cols_ + i / rows_; };
        for (std::size_t start = 1; start < last; ++start) {
            std::size_t i = next(start);
            while (i > start) i = next(i);
            if (i < start) continue; // seen from a lower index
            T carried = data[start];
            do {
                i = next(i);
                std::swap(carried, data[i]);
            } while (i != start);
        }
    }
    std::swap(rows_, cols_);
}

template <class T> void MatrixStorage<T>::swapColumns(std::size_t i, std::size_t j) {
    if (i >= cols_ || j >= cols_) FN_THROW(FNEBadArg, "Cannot swap columns outside of column range");
    FNVector<T> buffer(rows_);
    swapColumns(buffer.getExclusive(), getExclusive(), i, j);
}

template <class T>
void MatrixStorage<T>::swapColumns(T* buffer, T* data, std::size_t i, std::size_t j) const {
    if (i >= cols_ || j >= cols_) FN_THROW(FNEBadArg, "Cannot swap columns outside of column range");
    if (i == j || rows_ == 0) return;
    std::memcpy(buffer, data + colidx(i), rows_ * sizeof(T));
    std::memcpy(data + colidx(i), data + colidx(j), rows_ * sizeof(T));
    std::memcpy(data + colidx(j), buffer, rows_ * sizeof(T));
}

template <class T> void MatrixStorage<T>::mirror(std::size_t n) {
    if (n > cols_) FN_THROW(FNEBadArg, "Cannot swap columns outside of column range");
    FNVector<T> buffer(rows_);
    T* const scratch = buffer.getExclusive();
    T* const data = getExclusive();
    for (std::size_t c = 0; c < n / 2; ++c) swapColumns(scratch, data, c, n - 1 - c);
}

template <class T> void MatrixStorage<T>::permuteRows(const FNVector<unsigned long>& permutation) {
    if (permutation.size() > rows_) FN_THROW(FNEBadArg, "Matrix::permute(): row permutation vector too long");
    T* const data = getExclusive();
    for (std::size_t i = 0; i < permutation.size(); ++i) {
        const std::size_t other = permutation.get()[i];
        if (other >= rows_) FN_THROW(FNEBadArg, "Invalid position in permutation vector");
        if (other == i) continue;
        for (std::size_t c = 0; c < cols_; ++c) std::swap(data[colidx(c) + i], data[colidx(c) + other]);
    }
}

template <class T> bool MatrixStorage<T>::operator==(const MatrixStorage& other) const {
    return rows_ == other.rows_ && cols_ == other.cols_ && std::equal(get(), get() + size(), other.get());
}

template <class T> void MatrixStorage<T>::print(std::ostream& stream) const {
    stream << rows_ << ' ' << cols_ << '\n';
    for (std::size_t r = 0; r < rows_; ++r) {
        for (std::size_t c = 0; c < cols_; ++c) stream << ' ' << +(*this)(r, c);
        stream << '\n';
    }
}

template <class T> void MatrixStorage<T>::throwOutOfRange() {
    FN_THROW(FNEOutOfRange, "Matrix: element beyond the end");
}

template class MatrixStorage<float>;
template class MatrixStorage<double>;
template class MatrixStorage<int>;
template class MatrixStorage<signed char>;

} // namespace Fn

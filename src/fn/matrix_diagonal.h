#pragma once

#include "fn/matrix.h"

namespace Fn {

/// Square matrix of float or double that is 0 off its diagonal.
template <class T> class DiagonalMatrix {
public:
    /// Uninitialised.
    explicit DiagonalMatrix(std::size_t n) : n_(n), diagonal_(n) {}
    /// Shares the vector.
    explicit DiagonalMatrix(const FNVector<T>& diagonal) : n_(diagonal.size()), diagonal_(diagonal) {}

    std::size_t size() const noexcept { return n_; }
    const FNVector<T>& diagonal() const noexcept { return diagonal_; }
    /// Diagonal element for writing. @throws FNEOutOfRange
    T& operator()(std::size_t i) { return diagonal_[i]; }
    /// Diagonal element for reading, unchecked.
    T operator()(std::size_t i) const noexcept { return diagonal_.get()[i]; }

    /// m becomes this * m, its rows scaled. @throws FNEBadArg
    void mult(Matrix<T>& m) const;

private:
    std::size_t n_;
    FNVector<T> diagonal_;
};

extern template class DiagonalMatrix<float>;
extern template class DiagonalMatrix<double>;

} // namespace Fn

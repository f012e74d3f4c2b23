#include "fn/matrix_diagonal.h"

#include "fn/matrix_product.h"

namespace Fn {

template <class T> void DiagonalMatrix<T>::mult(Matrix<T>& m) const {
    MKL::diagmult(*this, m);
}

template class DiagonalMatrix<float>;
template class DiagonalMatrix<double>;

} // namespace Fn

#include "fn/numeric/blas.h"

#include "fn/exception.h"
#include "fn/numeric/blas_size.h"

#include <algorithm>
#include <climits>
#include <string>
#include <type_traits>

#include <cblas.h>

namespace Fn::Numeric {
namespace {

/// Once for the process.
void runOnCallingThread() {
    static const bool once = (openblas_set_num_threads(1), true);
    static_cast<void>(once);
}

/// Distance of two columns of `n` elements; the kernels want at least 1.
int leading(std::size_t n) {
    return std::max(1, blasSize(n));
}

CBLAS_TRANSPOSE op(bool transposed) {
    return transposed ? CblasTrans : CblasNoTrans;
}

/// The kernel for T of those for float and double.
template <class T, class F, class D> constexpr auto of(F forFloat, D forDouble) {
    if constexpr (std::is_same_v<T, float>)
        return forFloat;
    else
        return forDouble;
}

} // namespace

int blasSize(std::size_t n) {
    runOnCallingThread();
    if (n > INT_MAX)
        FN_THROW(FNEBadArg, "Size " + std::to_string(n) + " is too large for the numeric kernels");
    return static_cast<int>(n);
}

void setBlasThreads(int n) {
    runOnCallingThread();
    openblas_set_num_threads(std::max(1, n));
}

template <class T>
void Blas<T>::gemv(bool transposed, std::size_t rows, std::size_t cols, T alpha, const T* a, const T* x,
                   T beta, T* y) {
    of<T>(cblas_sgemv, cblas_dgemv)(CblasColMajor, op(transposed), blasSize(rows), blasSize(cols), alpha, a,
                                    leading(rows), x, 1, beta, y, 1);
}

template <class T>
void Blas<T>::gemm(bool transA, bool transB, std::size_t m, std::size_t n, std::size_t k, T alpha, const T* a,
                   const T* b, T beta, T* c) {
    of<T>(cblas_sgemm, cblas_dgemm)(CblasColMajor, op(transA), op(transB), blasSize(m), blasSize(n),
                                    blasSize(k), alpha, a, leading(transA ? k : m), b,
                                    leading(transB ? n : k), beta, c, leading(m));
}

template <class T> void Blas<T>::symm(bool left, std::size_t m, std::size_t n, const T* a, const T* b, T* c) {
    of<T>(cblas_ssymm, cblas_dsymm)(CblasColMajor, left ? CblasLeft : CblasRight, CblasLower, blasSize(m),
                                    blasSize(n), 1, a, leading(left ? m : n), b, leading(m), 0, c,
                                    leading(m));
}

template <class T> void Blas<T>::symv(std::size_t n, const T* a, const T* x, T* y) {
    of<T>(cblas_ssymv, cblas_dsymv)(CblasColMajor, CblasLower, blasSize(n), 1, a, leading(n), x, 1, 0, y, 1);
}

template <class T>
void Blas<T>::ger(std::size_t rows, std::size_t cols, T alpha, const T* x, const T* y, T* a) {
    of<T>(cblas_sger, cblas_dger)(CblasColMajor, blasSize(rows), blasSize(cols), alpha, x, 1, y, 1, a,
                                  leading(rows));
}

template <class T> void Blas<T>::syr(std::size_t n, T alpha, const T* x, T* a) {
    of<T>(cblas_ssyr, cblas_dsyr)(CblasColMajor, CblasLower, blasSize(n), alpha, x, 1, a, leading(n));
}

template <class T> void Blas<T>::syrk(std::size_t n, std::size_t k, const T* a, T* c) {
    of<T>(cblas_ssyrk, cblas_dsyrk)(CblasColMajor, CblasLower, CblasNoTrans, blasSize(n), blasSize(k), 1, a,
                                    leading(n), 1, c, leading(n));
}

template <class T> void Blas<T>::syr2k(std::size_t n, std::size_t k, const T* a, const T* b, T* c) {
    of<T>(cblas_ssyr2k, cblas_dsyr2k)(CblasColMajor, CblasLower, CblasNoTrans, blasSize(n), blasSize(k), 1, a,
                                      leading(n), b, leading(n), 1, c, leading(n));
}

template <class T> void Blas<T>::scal(std::size_t n, T alpha, T* x, std::size_t stride) {
    of<T>(cblas_sscal, cblas_dscal)(blasSize(n), alpha, x, leading(stride));
}

template <class T> void Blas<T>::axpy(std::size_t n, T alpha, const T* x, T* y) {
    of<T>(cblas_saxpy, cblas_daxpy)(blasSize(n), alpha, x, 1, y, 1);
}

template <class T> void Blas<T>::dotc(std::size_t n, const T* x, const T* y, T result[2]) {
    of<T>(cblas_cdotc_sub, cblas_zdotc_sub)(blasSize(n), x, 1, y, 1, result);
}

template struct Blas<float>;
template struct Blas<double>;

} // namespace Fn::Numeric

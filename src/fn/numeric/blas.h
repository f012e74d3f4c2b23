#pragma once

#include <cstddef>

/// The dense products of linear algebra, for float and double. Matrices lie column after column with no
/// padding; where only a triangle is used, it is the lower one. Sizes of 2^31 and more are refused with
/// FNEBadArg.
///
/// The BLAS below runs on the calling thread alone: results do not depend on the number of processors, and
/// threads of ours do not compete with its own. This holds for the whole process from the first call on.

namespace Fn::Numeric {

/// Lets the BLAS use up to `n` threads, for programs that do one large computation at a time (training).
void setBlasThreads(int n);

template <class T> struct Blas {
    /// y = alpha * op(a) * x + beta * y, `a` with `rows` by `cols` elements.
    static void gemv(bool transposed, std::size_t rows, std::size_t cols, T alpha, const T* a, const T* x,
                     T beta, T* y);
    /// c = alpha * op(a) * op(b) + beta * c, `c` with m by n elements, op(a) with m by k.
    static void gemm(bool transA, bool transB, std::size_t m, std::size_t n, std::size_t k, T alpha,
                     const T* a, const T* b, T beta, T* c);
    /// c = a * b if `left`, else b * a, with `a` symmetric and `b`, `c` of m by n elements.
    static void symm(bool left, std::size_t m, std::size_t n, const T* a, const T* b, T* c);
    /// y = a * x with a symmetric n by n matrix.
    static void symv(std::size_t n, const T* a, const T* x, T* y);
    /// a += alpha * x * y^T, `a` with `rows` by `cols` elements.
    static void ger(std::size_t rows, std::size_t cols, T alpha, const T* x, const T* y, T* a);
    /// a += alpha * x * x^T, `a` symmetric n by n.
    static void syr(std::size_t n, T alpha, const T* x, T* a);
    /// c += a * a^T, `c` symmetric n by n, `a` with n by k elements.
    static void syrk(std::size_t n, std::size_t k, const T* a, T* c);
    /// c += a * b^T + b * a^T, `c` symmetric n by n, `a` and `b` with n by k elements.
    static void syr2k(std::size_t n, std::size_t k, const T* a, const T* b, T* c);
    /// x *= alpha, over n elements that lie `stride` apart.
    static void scal(std::size_t n, T alpha, T* x, std::size_t stride);
    /// y += alpha * x.
    static void axpy(std::size_t n, T alpha, const T* x, T* y);
    /// Scalar product of complex numbers, real and imaginary part alternating, the first operand conjugated.
    static void dotc(std::size_t n, const T* x, const T* y, T result[2]);
};

extern template struct Blas<float>;
extern template struct Blas<double>;

} // namespace Fn::Numeric

#pragma once

#include <cstddef>

/// Solvers and decompositions of linear algebra, for float and double. Matrices lie column after column with
/// no padding; of a symmetric one the lower triangle is used. Arrays named as in LAPACK are overwritten as
/// LAPACK does.
///
/// Each function returns LAPACK's `info`: 0, or -i if argument i is illegal, or a positive number whose
/// meaning depends on the function. Those that need work space take `workSize` 0 and `work` of one element to
/// ask for the best size, which they leave in work[0].

namespace Fn::Numeric {

template <class T> struct Lapack {
    /// Square root of the sum of all squares, scaled against overflow.
    static T frobeniusNorm(std::size_t m, std::size_t n, const T* a);

    static int getrf(std::size_t m, std::size_t n, T* a, int* pivots);
    static int getri(std::size_t n, T* a, const int* pivots, T* work, std::size_t workSize);
    static int gesv(std::size_t n, std::size_t rightSides, T* a, int* pivots, T* b);
    /// `b` has max(m, n) rows.
    static int gels(std::size_t m, std::size_t n, std::size_t rightSides, T* a, T* b, T* work,
                    std::size_t workSize);
    /// `integerWork` of one element at the query, whose size is left there.
    static int gelsd(std::size_t m, std::size_t n, std::size_t rightSides, T* a, T* b, T* singularValues,
                     T* work, std::size_t workSize, int* integerWork);

    static int geqrf(std::size_t m, std::size_t n, T* a, T* tau, T* work, std::size_t workSize);
    static int orgqr(std::size_t m, std::size_t n, std::size_t k, T* a, const T* tau, T* work,
                     std::size_t workSize);
    /// Singular values with the smaller of the two factors in `a`: U if m >= n, else Vt; `integerWork` has
    /// 8 * min(m, n) elements.
    static int gesdd(std::size_t m, std::size_t n, T* a, T* singularValues, T* u, T* vt, T* work,
                     std::size_t workSize, int* integerWork);

    static int sytrf(std::size_t n, T* a, int* pivots, T* work, std::size_t workSize);
    static int sytri(std::size_t n, T* a, const int* pivots, T* work);
    static int potrf(std::size_t n, T* a);

    static int syev(bool vectors, std::size_t n, T* a, T* values, T* work, std::size_t workSize);
    /// The eigenvalues number `first` to `last` in ascending order, counted from 1.
    static int syevr(bool vectors, std::size_t n, T* a, std::size_t first, std::size_t last, int& found,
                     T* values, T* z, int* support, T* work, std::size_t workSize, int* integerWork,
                     std::size_t integerWorkSize);
    static int sygv(bool vectors, std::size_t n, T* a, T* b, T* values, T* work, std::size_t workSize);
    static int sygvx(bool vectors, std::size_t n, T* a, T* b, std::size_t first, std::size_t last, int& found,
                     T* values, T* z, T* work, std::size_t workSize, int* integerWork, int* failed);

    static int sytrd(std::size_t n, T* a, T* diagonal, T* offDiagonal, T* tau, T* work, std::size_t workSize);
    /// All eigenvalues of a tridiagonal matrix, by blocks; `work` has 4 * n elements, `integerWork` 3 * n.
    static int stebz(std::size_t n, const T* diagonal, const T* offDiagonal, int& found, int& splits,
                     T* values, int* block, int* split, T* work, int* integerWork);
    /// Eigenvectors of given eigenvalues; `work` has 5 * n elements, `integerWork` n, `failed` `count`.
    static int stein(std::size_t n, const T* diagonal, const T* offDiagonal, std::size_t count,
                     const T* values, const int* block, const int* split, T* z, T* work, int* integerWork,
                     int* failed);
    /// c = q * c with the `q` of sytrd; `c` has n by `cols` elements.
    static int ormtr(std::size_t n, std::size_t cols, const T* a, const T* tau, T* c, T* work,
                     std::size_t workSize);
};

extern template struct Lapack<float>;
extern template struct Lapack<double>;

} // namespace Fn::Numeric

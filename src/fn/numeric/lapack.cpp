#include "fn/numeric/lapack.h"

#include "fn/numeric/blas_size.h"

#include <algorithm>
#include <type_traits>

#include <lapacke.h>

namespace Fn::Numeric {
namespace {

int size(std::size_t n) {
    return blasSize(n);
}
int leading(std::size_t n) {
    return std::max(1, blasSize(n));
}
/// Work sizes: 0 asks.
int workLength(std::size_t n) {
    return n == 0 ? -1 : blasSize(n);
}
char job(bool vectors) {
    return vectors ? 'V' : 'N';
}

constexpr int columns = LAPACK_COL_MAJOR;
constexpr char lower = 'L';

/// The kernel for T of those for float and double.
template <class T, class F, class D> constexpr auto of(F forFloat, D forDouble) {
    if constexpr (std::is_same_v<T, float>)
        return forFloat;
    else
        return forDouble;
}

} // namespace

template <class T> T Lapack<T>::frobeniusNorm(std::size_t m, std::size_t n, const T* a) {
    return of<T>(LAPACKE_slange_work, LAPACKE_dlange_work)(columns, 'F', size(m), size(n), a, leading(m),
                                                           nullptr);
}

template <class T> int Lapack<T>::getrf(std::size_t m, std::size_t n, T* a, int* pivots) {
    return of<T>(LAPACKE_sgetrf_work, LAPACKE_dgetrf_work)(columns, size(m), size(n), a, leading(m), pivots);
}

template <class T>
int Lapack<T>::getri(std::size_t n, T* a, const int* pivots, T* work, std::size_t workSize) {
    return of<T>(LAPACKE_sgetri_work, LAPACKE_dgetri_work)(columns, size(n), a, leading(n), pivots, work,
                                                           workLength(workSize));
}

template <class T> int Lapack<T>::gesv(std::size_t n, std::size_t rightSides, T* a, int* pivots, T* b) {
    return of<T>(LAPACKE_sgesv_work, LAPACKE_dgesv_work)(columns, size(n), size(rightSides), a, leading(n),
                                                         pivots, b, leading(n));
}

template <class T>
int Lapack<T>::gels(std::size_t m, std::size_t n, std::size_t rightSides, T* a, T* b, T* work,
                    std::size_t workSize) {
    return of<T>(LAPACKE_sgels_work, LAPACKE_dgels_work)(columns, 'N', size(m), size(n), size(rightSides), a,
                                                         leading(m), b, leading(std::max(m, n)), work,
                                                         workLength(workSize));
}

template <class T>
int Lapack<T>::gelsd(std::size_t m, std::size_t n, std::size_t rightSides, T* a, T* b, T* singularValues,
                     T* work, std::size_t workSize, int* integerWork) {
    constexpr T machinePrecision = -1; // singular values below it, relative to the largest, count as zero
    int rank = 0;
    return of<T>(LAPACKE_sgelsd_work, LAPACKE_dgelsd_work)(
        columns, size(m), size(n), size(rightSides), a, leading(m), b, leading(std::max(m, n)),
        singularValues, machinePrecision, &rank, work, workLength(workSize), integerWork);
}

template <class T>
int Lapack<T>::geqrf(std::size_t m, std::size_t n, T* a, T* tau, T* work, std::size_t workSize) {
    return of<T>(LAPACKE_sgeqrf_work, LAPACKE_dgeqrf_work)(columns, size(m), size(n), a, leading(m), tau,
                                                           work, workLength(workSize));
}

template <class T>
int Lapack<T>::orgqr(std::size_t m, std::size_t n, std::size_t k, T* a, const T* tau, T* work,
                     std::size_t workSize) {
    return of<T>(LAPACKE_sorgqr_work, LAPACKE_dorgqr_work)(columns, size(m), size(n), size(k), a, leading(m),
                                                           tau, work, workLength(workSize));
}

template <class T>
int Lapack<T>::gesdd(std::size_t m, std::size_t n, T* a, T* singularValues, T* u, T* vt, T* work,
                     std::size_t workSize, int* integerWork) {
    return of<T>(LAPACKE_sgesdd_work, LAPACKE_dgesdd_work)(columns, 'O', size(m), size(n), a, leading(m),
                                                           singularValues, u, leading(m), vt, leading(n),
                                                           work, workLength(workSize), integerWork);
}

template <class T> int Lapack<T>::sytrf(std::size_t n, T* a, int* pivots, T* work, std::size_t workSize) {
    return of<T>(LAPACKE_ssytrf_work, LAPACKE_dsytrf_work)(columns, lower, size(n), a, leading(n), pivots,
                                                           work, workLength(workSize));
}

template <class T> int Lapack<T>::sytri(std::size_t n, T* a, const int* pivots, T* work) {
    return of<T>(LAPACKE_ssytri_work, LAPACKE_dsytri_work)(columns, lower, size(n), a, leading(n), pivots,
                                                           work);
}

template <class T> int Lapack<T>::potrf(std::size_t n, T* a) {
    return of<T>(LAPACKE_spotrf_work, LAPACKE_dpotrf_work)(columns, lower, size(n), a, leading(n));
}

template <class T>
int Lapack<T>::syev(bool vectors, std::size_t n, T* a, T* values, T* work, std::size_t workSize) {
    return of<T>(LAPACKE_ssyev_work, LAPACKE_dsyev_work)(columns, job(vectors), lower, size(n), a, leading(n),
                                                         values, work, workLength(workSize));
}

template <class T>
int Lapack<T>::syevr(bool vectors, std::size_t n, T* a, std::size_t first, std::size_t last, int& found,
                     T* values, T* z, int* support, T* work, std::size_t workSize, int* integerWork,
                     std::size_t integerWorkSize) {
    return of<T>(LAPACKE_ssyevr_work, LAPACKE_dsyevr_work)(
        columns, job(vectors), 'I', lower, size(n), a, leading(n), 0, 0, size(first), size(last), 0, &found,
        values, z, leading(n), support, work, workLength(workSize), integerWork, workLength(integerWorkSize));
}

template <class T>
int Lapack<T>::sygv(bool vectors, std::size_t n, T* a, T* b, T* values, T* work, std::size_t workSize) {
    return of<T>(LAPACKE_ssygv_work, LAPACKE_dsygv_work)(columns, 1, job(vectors), lower, size(n), a,
                                                         leading(n), b, leading(n), values, work,
                                                         workLength(workSize));
}

template <class T>
int Lapack<T>::sygvx(bool vectors, std::size_t n, T* a, T* b, std::size_t first, std::size_t last, int& found,
                     T* values, T* z, T* work, std::size_t workSize, int* integerWork, int* failed) {
    return of<T>(LAPACKE_ssygvx_work, LAPACKE_dsygvx_work)(
        columns, 1, job(vectors), 'I', lower, size(n), a, leading(n), b, leading(n), 0, 0, size(first),
        size(last), 0, &found, values, z, leading(n), work, workLength(workSize), integerWork, failed);
}

template <class T>
int Lapack<T>::sytrd(std::size_t n, T* a, T* diagonal, T* offDiagonal, T* tau, T* work,
                     std::size_t workSize) {
    return of<T>(LAPACKE_ssytrd_work, LAPACKE_dsytrd_work)(columns, lower, size(n), a, leading(n), diagonal,
                                                           offDiagonal, tau, work, workLength(workSize));
}

template <class T>
int Lapack<T>::stebz(std::size_t n, const T* diagonal, const T* offDiagonal, int& found, int& splits,
                     T* values, int* block, int* split, T* work, int* integerWork) {
    return of<T>(LAPACKE_sstebz_work, LAPACKE_dstebz_work)('A', 'B', size(n), 0, 0, 0, 0, 0, diagonal,
                                                           offDiagonal, &found, &splits, values, block, split,
                                                           work, integerWork);
}

template <class T>
int Lapack<T>::stein(std::size_t n, const T* diagonal, const T* offDiagonal, std::size_t count,
                     const T* values, const int* block, const int* split, T* z, T* work, int* integerWork,
                     int* failed) {
    return of<T>(LAPACKE_sstein_work, LAPACKE_dstein_work)(columns, size(n), diagonal, offDiagonal,
                                                           size(count), values, block, split, z, leading(n),
                                                           work, integerWork, failed);
}

template <class T>
int Lapack<T>::ormtr(std::size_t n, std::size_t cols, const T* a, const T* tau, T* c, T* work,
                     std::size_t workSize) {
    return of<T>(LAPACKE_sormtr_work, LAPACKE_dormtr_work)(columns, 'L', lower, 'N', size(n), size(cols), a,
                                                           leading(n), tau, c, leading(n), work,
                                                           workLength(workSize));
}

template struct Lapack<float>;
template struct Lapack<double>;

} // namespace Fn::Numeric

#include "fn/matrix_eigen.h"

#include "fn/matrix_text.h"
#include "fn/numeric/lapack.h"
#include "fn/numeric/work_space.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <utility>

namespace Fn {
namespace {

using MatrixText::check;
using Numeric::Lapack;
using Numeric::WorkSpace;

const std::string illegal = " had an illegal value";

template <class T> FNVector<T> firstOf(const FNVector<T>& values, std::size_t n) {
    return FNVector<T>(values.span().first(n));
}

/// How many eigenvalues of n to compute.
std::size_t wantedCount(int wanted, std::size_t n) {
    const std::size_t count = wanted < 0 ? n : static_cast<std::size_t>(wanted);
    if (count > n) FN_THROW(FNEBadArg, "eigenVectors(): number of requested EV's exceeds matrix size");
    return count;
}

/// Checks the matrix that is to receive `count` eigenvectors of n elements.
template <class T>
void requireRoom(const Matrix<T>& eigenVectors, std::size_t n, std::size_t count, const char* rowText) {
    if (eigenVectors.rows() != n) FN_THROW(FNEBadArg, rowText);
    if (eigenVectors.cols() < count) FN_THROW(FNEBadArg, "Too few columns in EV matrix");
}

constexpr const char* wrongRows = "Inappropriate row size of EV matrix";
constexpr const char* wrongInputRows = "Inappropriate row size of EV input matrix";

/// A tridiagonal matrix and the transformation that made it out of a symmetric one.
template <class T> struct Tridiagonal {
    std::vector<T> diagonal, offDiagonal, tau;

    explicit Tridiagonal(SymmMatrix<T>& m)
        : diagonal(m.size()), offDiagonal(m.size()), tau(std::max<std::size_t>(1, m.size())) {
        T* const a = m.getExclusive();
        const auto reduce = [&](T* work, std::size_t size) {
            return Lapack<T>::sytrd(m.size(), a, diagonal.data(), offDiagonal.data(), tau.data(), work, size);
        };
        WorkSpace<T> work;
        check(work.query(reduce), "mkl_sytrd: the ", "-th argument" + illegal, "");
        check(work.run(reduce), "mkl_sytrd: the ", "-th argument" + illegal, "");
    }
};

/// All eigenvalues of a tridiagonal matrix, by the blocks into which it falls apart, ascending in each.
template <class T> struct BlockEigenValues {
    FNVector<T> values;
    std::vector<int> block, split;

    explicit BlockEigenValues(const Tridiagonal<T>& t)
        : values(t.diagonal.size()), block(values.size()), split(values.size()) {
        const std::size_t n = values.size();
        std::vector<T> work(4 * n);
        std::vector<int> integerWork(3 * n);
        int found = 0, splits = 0;
        check(Lapack<T>::stebz(n, t.diagonal.data(), t.offDiagonal.data(), found, splits,
                               values.getExclusive(), block.data(), split.data(), work.data(),
                               integerWork.data()),
              "mkl_stebz: the ", "-th argument" + illegal,
              "MKL:?stebzn: some eigenvalues could not be computed (%d)");
    }
};

/// Eigenvectors of a symmetric matrix for some of its eigenvalues, given by ascending indices.
template <class T>
Matrix<T> eigenVectorsOf(const SymmMatrix<T>& reduced, const Tridiagonal<T>& t,
                         const BlockEigenValues<T>& all, const std::vector<std::size_t>& indices) {
    const std::size_t n = reduced.size(), count = indices.size();
    std::vector<T> values(count);
    std::vector<int> block(count), integerWork(n), failed(count);
    for (std::size_t i = 0; i < count; ++i) {
        values[i] = all.values.get()[indices[i]];
        block[i] = all.block[indices[i]];
    }
    Matrix<T> result(n, count);
    T* const z = result.getExclusive();
    std::vector<T> work(5 * n);
    check(Lapack<T>::stein(n, t.diagonal.data(), t.offDiagonal.data(), count, values.data(), block.data(),
                           all.split.data(), z, work.data(), integerWork.data(), failed.data()),
          "mkl_stein: the ", "-th argument" + illegal, "MKL:?stein: %d eigenvectors faile to converge");

    const auto transform = [&](T* workArray, std::size_t size) {
        return Lapack<T>::ormtr(n, count, reduced.get(), t.tau.data(), z, workArray, size);
    };
    WorkSpace<T> space;
    check(space.query(transform), "mkl_ormtr: the ", "-th argument" + illegal, "");
    check(space.run(transform), "mkl_ormtr: the ", "-th argument" + illegal, "");
    return result;
}

template <class T>
void checkGeneralized(int info, std::size_t n, const std::string& routine, const std::string& failure) {
    const std::string name = "MKL::generalizedEigenVectors()";
    const int size = static_cast<int>(n);
    if (info > size)
        FN_THROW(FNEBadArg, name + "(" + routine + "): Found leading minor " + std::to_string(info - size) +
                                " of B not positive definite");
    check(info, "MKL::generalizedEigenVectors(): the ", "-th argument of " + routine + illegal,
          name + "(" + routine + "): %d " + failure);
}

/// A matrix of 2 or 3 rows, where single precision saves nothing.
FNVector<float> smallEigenVectors(const SymmMatrix<float>& m, Matrix<float>& eigenVectors, bool vectors,
                                  std::size_t count) {
    SymmMatrix<double> wide(m.size());
    for (std::size_t c = 0; c < m.size(); ++c)
        for (std::size_t r = c; r < m.size(); ++r) wide(r, c) = static_cast<double>(m(r, c));
    Matrix<double> wideVectors(m.size(), vectors ? count : 0);
    const FNVector<double> wideValues =
        eigenVectorsLowMem(wide, wideVectors, vectors, static_cast<int>(count));
    FNVector<float> values(count);
    std::copy(wideValues.begin(), wideValues.end(), values.getExclusive());
    if (vectors) std::copy_n(wideVectors.get(), wideVectors.size(), eigenVectors.getExclusive());
    return values;
}

} // namespace

template <class T> Matrix<T> cholesky(const SymmMatrix<T>& m) {
    const std::size_t n = m.size();
    Matrix<T> result(n, n);
    result.fill(0);
    T* const out = result.getExclusive();
    for (std::size_t c = 0; c < n; ++c) std::copy_n(m.get() + c * n + c, n - c, out + c * n + c);
    if (n != 0)
        check(Lapack<T>::potrf(n, out), "CholeskyL: the ", "-th argument" + illegal,
              "MKL Cholesky: the leading minor of order ST of A is not positive definite");
    return result;
}

template <class T> DiagonalMatrix<T> ldlDecomposition(const SymmMatrix<T>& m, Matrix<T>& lower) {
    const std::size_t n = m.size();
    lower = Matrix<T>::identity(n);
    DiagonalMatrix<T> diagonal(n);
    T* const l = lower.getExclusive();
    for (std::size_t c = 0; c < n; ++c) {
        for (std::size_t r = c; r < n; ++r) {
            double rest = static_cast<double>(m(r, c));
            for (std::size_t k = 0; k < c; ++k)
                rest -= static_cast<double>(l[k * n + r]) * static_cast<double>(l[k * n + c]) *
                        static_cast<double>(std::as_const(diagonal)(k));
            if (r == c) {
                diagonal(c) = static_cast<T>(rest);
                if (rest == 0 && c + 1 < n) FN_THROW(FNEBadArg, "ldlDecomposition(): diagonal element is 0");
            } else {
                l[c * n + r] = static_cast<T>(rest / static_cast<double>(std::as_const(diagonal)(c)));
            }
        }
    }
    return diagonal;
}

template <class T> FNVector<T> eigenVectorsInPlace(Matrix<T>& m, bool vectors) {
    const std::size_t n = m.rows();
    if (n != m.cols()) FN_THROW(FNEBadArg, wrongInputRows);
    FNVector<T> values(n);
    if (n == 0) return values;
    T *const a = m.getExclusive(), *const w = values.getExclusive();
    const auto decompose = [&](T* work, std::size_t size) {
        return Lapack<T>::syev(vectors, n, a, w, work, size);
    };
    const std::string start = "MKL::eigenVectors(): the ", syev = "-th argument of ?syev" + illegal;
    const std::string failure = "MKL::eigenVectors(): MKL:?syev error: %d elements did not converge to zero";
    WorkSpace<T> work;
    check(work.query(decompose), start, syev, failure);
    check(work.run(decompose), start, syev, failure);
    return values;
}

template <class T>
FNVector<T> eigenVectorsLowMem(SymmMatrix<T>& m, Matrix<T>& eigenVectors, bool vectors, int wanted) {
    const std::size_t n = m.size(), count = wantedCount(wanted, n);
    if (vectors) requireRoom(eigenVectors, n, count, wrongRows);
    if (count == 0) return FNVector<T>();
    if constexpr (std::is_same_v<T, float>)
        if (n == 2 || n == 3) return smallEigenVectors(m, eigenVectors, vectors, count);

    FNVector<T> values(n);
    std::vector<int> support(2 * n), integerWork(1);
    int found = 0;
    T *const a = m.getExclusive(), *const w = values.getExclusive();
    T* const z = vectors ? eigenVectors.getExclusive() : nullptr;
    const auto call = [&](T* work, std::size_t size) {
        return Lapack<T>::syevr(vectors, n, a, n - count + 1, n, found, w, z, support.data(), work, size,
                                integerWork.data(), size == 0 ? 0 : integerWork.size());
    };
    const std::string start = "MKL::eigenVectors(): the ", syevr = "-th argument of ?syevr" + illegal;
    const std::string failure = "MKL::eigenVectors(): MKL:?syevr fatal error %d";
    WorkSpace<T> work;
    check(work.query(call), start, syevr, failure);
    integerWork.resize(static_cast<std::size_t>(std::max(1, integerWork[0])));
    check(work.run(call), start, syevr, failure);
    return firstOf(values, count);
}

template <class T> std::vector<std::size_t> absOrdered(const FNVector<T>& values, std::size_t n) {
    if (n > values.size()) FN_THROW(FNEBadArg, "requested more abs-ordered eigenvalues than available");
    std::vector<std::size_t> indices(values.size());
    std::iota(indices.begin(), indices.end(), std::size_t{0});
    std::stable_sort(indices.begin(), indices.end(), [&](std::size_t i, std::size_t j) {
        return std::abs(values.get()[i]) > std::abs(values.get()[j]);
    });
    indices.resize(n);
    return indices;
}

template <class T>
FNVector<T> dominantEigenVectors(SymmMatrix<T>& m, Matrix<T>& eigenVectors, bool vectors,
                                 unsigned int wanted) {
    const std::size_t n = m.size();
    if (wanted > n)
        FN_THROW(FNEBadArg, "getDominantEigenVectors(): number of requested EV's exceeds matrix size");
    if (vectors) requireRoom(eigenVectors, n, wanted, wrongRows);
    if (wanted == 0) return FNVector<T>();

    const Tridiagonal<T> tridiagonal(m);
    const BlockEigenValues<T> all(tridiagonal);
    const std::vector<std::size_t> dominant = absOrdered(all.values, wanted);
    FNVector<T> values(wanted);
    T* const out = values.getExclusive();
    for (std::size_t i = 0; i < wanted; ++i) out[i] = all.values.get()[dominant[i]];
    if (!vectors) return values;

    std::vector<std::size_t> ascending(dominant);
    std::sort(ascending.begin(), ascending.end());
    const Matrix<T> byBlock(eigenVectorsOf(m, tridiagonal, all, ascending));
    for (std::size_t i = 0; i < wanted; ++i) {
        const auto place = std::lower_bound(ascending.begin(), ascending.end(), dominant[i]);
        eigenVectors.column(i, byBlock.column(static_cast<std::size_t>(place - ascending.begin())));
    }
    return values;
}

template <class T> FNVector<T> generalizedEigenVectors(Matrix<T>& a, SymmMatrix<T>& b, bool vectors) {
    const std::size_t n = a.rows();
    if (n != a.cols() || n != b.size()) FN_THROW(FNEBadArg, wrongInputRows);
    FNVector<T> values(n);
    if (n == 0) return values;
    T *const left = a.getExclusive(), *const right = b.getExclusive(), *const w = values.getExclusive();
    const auto call = [&](T* work, std::size_t size) {
        return Lapack<T>::sygv(vectors, n, left, right, w, work, size);
    };
    const std::string failure = "off-diagonal elements did not converge";
    WorkSpace<T> work;
    checkGeneralized<T>(work.query(call), n, "?sygv", failure);
    checkGeneralized<T>(work.run(call), n, "?sygv", failure);
    return values;
}

template <class T>
FNVector<T> generalizedEigenVectorsLowMem(SymmMatrix<T>& a, SymmMatrix<T>& b, Matrix<T>& eigenVectors,
                                          bool vectors, int wanted) {
    const std::size_t n = a.size(), count = wantedCount(wanted, n);
    if (n != b.size()) FN_THROW(FNEBadArg, wrongInputRows);
    if (vectors) requireRoom(eigenVectors, n, count, wrongRows);
    if (count == 0) return FNVector<T>();

    FNVector<T> values(n);
    std::vector<int> integerWork(5 * n), failed(n);
    int found = 0;
    T *const left = a.getExclusive(), *const right = b.getExclusive(), *const w = values.getExclusive();
    T* const z = vectors ? eigenVectors.getExclusive() : nullptr;
    const auto call = [&](T* work, std::size_t size) {
        return Lapack<T>::sygvx(vectors, n, left, right, n - count + 1, n, found, w, z, work, size,
                                integerWork.data(), failed.data());
    };
    const std::string failure = "eigenvectors failed to converge";
    WorkSpace<T> work;
    checkGeneralized<T>(work.query(call), n, "?sygvx", failure);
    checkGeneralized<T>(work.run(call), n, "?sygvx", failure);
    return firstOf(values, count);
}

template Matrix<float> cholesky(const SymmMatrix<float>&);
template DiagonalMatrix<float> ldlDecomposition(const SymmMatrix<float>&, Matrix<float>&);
template FNVector<float> eigenVectorsInPlace(Matrix<float>&, bool);
template FNVector<float> eigenVectorsLowMem(SymmMatrix<float>&, Matrix<float>&, bool, int);
template FNVector<float> dominantEigenVectors(SymmMatrix<float>&, Matrix<float>&, bool, unsigned int);
template std::vector<std::size_t> absOrdered(const FNVector<float>&, std::size_t);
template FNVector<float> generalizedEigenVectors(Matrix<float>&, SymmMatrix<float>&, bool);
template FNVector<float> generalizedEigenVectorsLowMem(SymmMatrix<float>&, SymmMatrix<float>&, Matrix<float>&,
                                                       bool, int);

template Matrix<double> cholesky(const SymmMatrix<double>&);
template DiagonalMatrix<double> ldlDecomposition(const SymmMatrix<double>&, Matrix<double>&);
template FNVector<double> eigenVectorsInPlace(Matrix<double>&, bool);
template FNVector<double> eigenVectorsLowMem(SymmMatrix<double>&, Matrix<double>&, bool, int);
template FNVector<double> dominantEigenVectors(SymmMatrix<double>&, Matrix<double>&, bool, unsigned int);
template std::vector<std::size_t> absOrdered(const FNVector<double>&, std::size_t);
template FNVector<double> generalizedEigenVectors(Matrix<double>&, SymmMatrix<double>&, bool);
template FNVector<double> generalizedEigenVectorsLowMem(SymmMatrix<double>&, SymmMatrix<double>&,
                                                        Matrix<double>&, bool, int);

} // namespace Fn

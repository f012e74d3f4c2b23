#include "fn/matrix_decomposition.h"
#include "fn/matrix_eigen.h"

#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace {

using Fn::Matrix;
using Fn::SymmMatrix;

template <class T> class DecompositionOf : public testing::Test {
protected:
    static constexpr double tolerance = std::is_same_v<T, float> ? 2e-4 : 1e-11;

    static Matrix<T> random(std::size_t rows, std::size_t cols, unsigned seed) {
        std::mt19937 generator(seed);
        Matrix<T> m(rows, cols);
        for (std::size_t i = 0; i < m.size(); ++i)
            m.getExclusive()[i] = std::uniform_real_distribution<T>(-1, 1)(generator);
        return m;
    }
    static SymmMatrix<T> positiveDefinite(std::size_t n, unsigned seed) {
        SymmMatrix<T> s(FNVector<T>(n, T(0.5)));
        s.addOuterProducts(random(n, n, seed));
        return s;
    }
    static void expectNear(const Matrix<T>& a, const Matrix<T>& b) {
        ASSERT_EQ(a.rows(), b.rows());
        ASSERT_EQ(a.cols(), b.cols());
        for (std::size_t i = 0; i < a.size(); ++i) EXPECT_NEAR(a.get()[i], b.get()[i], tolerance) << i;
    }
    static void expectOrthonormalColumns(const Matrix<T>& m) {
        expectNear(m.transposedMultWith(m), Matrix<T>::identity(m.cols()));
    }
    /// a * v = b * v * diag(values).
    static void expectEigen(const SymmMatrix<T>& a, const Matrix<T>& b, const Matrix<T>& v,
                            const FNVector<T>& values) {
        expectNear(a * v, b * v * Fn::DiagonalMatrix<T>(values));
    }
};

using Reals = testing::Types<float, double>;
TYPED_TEST_SUITE(DecompositionOf, Reals);

TYPED_TEST(DecompositionOf, SquareSystemsAreSolved) {
    using T = TypeParam;
    const auto a = this->random(5, 5, 1), x = this->random(5, 2, 2);
    auto b = a * x;
    Matrix<T>::linearSolve(a, b);
    this->expectNear(b, x);
    this->expectNear(Matrix<T>::invert(a) * a, Matrix<T>::identity(5));
    const auto one = this->random(1, 1, 3), y = this->random(1, 2, 4);
    auto c = one * y;
    Matrix<T>::linearSolve(one, c);
    this->expectNear(c, y);
}

TYPED_TEST(DecompositionOf, LeastSquaresSolutionsSolveTheNormalEquations) {
    using T = TypeParam;
    const auto tall = this->random(7, 3, 3), wide = this->random(3, 7, 4), target = this->random(7, 2, 5);
    for (const bool bySVD : {false, true}) {
        auto x = target;
        bySVD ? Matrix<T>::linearSolveLS_SVD(tall, x) : Matrix<T>::linearSolveLS(tall, x);
        ASSERT_EQ(x.rows(), 3u);
        this->expectNear(tall.transposedMultWith(tall * x), tall.transposedMultWith(target));

        auto y = Matrix<T>(target, 0, 0, 2, 1);
        const auto wanted = y;
        bySVD ? Matrix<T>::linearSolveLS_SVD(wide, y) : Matrix<T>::linearSolveLS(wide, y);
        ASSERT_EQ(y.rows(), 7u);
        this->expectNear(wide * y, wanted);
        this->expectNear(y, Matrix<T>::pseudoInverse(wide) * wanted); // of least norm
    }
}

TYPED_TEST(DecompositionOf, FactorsMultiplyToTheMatrix) {
    using T = TypeParam;
    for (const auto& [rows, cols] : {std::pair{6, 4}, {4, 6}, {5, 5}, {1, 3}}) {
        const auto m = this->random(rows, cols, 6);
        const auto qr = Matrix<T>::createQRDecomposition(m);
        this->expectOrthonormalColumns(qr.Q);
        this->expectNear(qr.Q * qr.R, m);
        for (std::size_t c = 0; c < qr.R.cols(); ++c)
            for (std::size_t r = c + 1; r < qr.R.rows(); ++r) EXPECT_EQ(qr.R(r, c), 0);

        const auto svd = Matrix<T>::createSVD(m);
        this->expectNear(svd.U * Fn::DiagonalMatrix<T>(svd.singularValues) * svd.Vt, m);
        this->expectOrthonormalColumns(svd.U);
        EXPECT_TRUE(std::is_sorted(svd.singularValues.begin(), svd.singularValues.end(), std::greater<T>()));
        this->expectNear(m * Matrix<T>::pseudoInverse(m) * m, m);
    }
    const auto m = this->random(4, 4, 7);
    const auto lu = Matrix<T>::createLUDecomposition(m);
    Matrix<T> l(Matrix<T>::identity(4)), u(4, 4);
    u.fill(0);
    for (std::size_t c = 0; c < 4; ++c)
        for (std::size_t r = 0; r < 4; ++r) (r > c ? l : u)(r, c) = lu.factors(r, c);
    this->expectNear(l * u, Matrix<T>::permuteRows(m, lu.pivots));
    EXPECT_FALSE(lu.singular);
}

TYPED_TEST(DecompositionOf, DeterminantsFollowTheirSignAndRange) {
    using T = TypeParam;
    Matrix<T> swapped(3, 3);
    swapped.fill(0);
    swapped(0, 1) = 2, swapped(1, 0) = 3, swapped(2, 2) = -4; // one row exchange and one negative element
    EXPECT_NEAR(swapped.determinant(), 24, 1e-4);
    swapped(2, 2) = 4;
    EXPECT_NEAR(swapped.determinant(), -24, 1e-4);
    swapped(2, 2) = 0;
    EXPECT_EQ(swapped.determinant(), 0);
    EXPECT_EQ(this->random(2, 3, 8).determinant(), 0);
    const T tiny = std::is_same_v<T, float> ? T(1e-20) : T(1e-160);
    EXPECT_EQ(Matrix<T>(Matrix<T>::identity(2) * tiny).determinant(), 0);
}

TYPED_TEST(DecompositionOf, PseudoInverseOfRankOneHasRankOne) {
    using T = TypeParam;
    const FNVector<T> a(3, T(2)), b(4, T(1));
    // The inverse of s * u * v^T is v * u^T / s; here s = |a| * |b|.
    this->expectNear(Matrix<T>::pseudoInverse(Matrix<T>(a, b)), Matrix<T>(b, a) / ((a * a) * (b * b)));
}

TYPED_TEST(DecompositionOf, EigenvectorsOfAllFormsSatisfyTheirEquation) {
    using T = TypeParam;
    for (const std::size_t n : {1u, 2u, 3u, 8u}) {
        const auto a = this->positiveDefinite(n, 9);
        auto all = a.toMatrix();
        const auto values = Fn::eigenVectorsInPlace(all, true);
        this->expectEigen(a, Matrix<T>::identity(n), all, values);
        this->expectOrthonormalColumns(all);
        EXPECT_TRUE(std::is_sorted(values.begin(), values.end()));

        const std::size_t wanted = (n + 1) / 2;
        auto destroyed = a;
        Matrix<T> largest(n, wanted);
        const auto largestValues = Fn::eigenVectorsLowMem(destroyed, largest, true, static_cast<int>(wanted));
        ASSERT_EQ(largestValues.size(), wanted);
        EXPECT_NEAR(largestValues[wanted - 1], values[n - 1], this->tolerance);
        EXPECT_NEAR(largestValues[0], values[n - wanted], this->tolerance);
        this->expectEigen(a, Matrix<T>::identity(n), largest, largestValues);
    }
}

TYPED_TEST(DecompositionOf, DominantEigenvectorsAreOrderedByAbsoluteValue) {
    using T = TypeParam;
    // Blocks of its own on the diagonal, so that the tridiagonal form falls apart.
    SymmMatrix<T> a(FNVector<T>(std::vector<T>{1, -9, 4, 2, 0, 7}));
    a(5, 4) = 3;
    a(3, 2) = 1;
    auto destroyed = a;
    Matrix<T> vectors(6, 3);
    const auto values = Fn::dominantEigenVectors(destroyed, vectors, true, 3u);
    const double larger = (7 + std::sqrt(85.0)) / 2; // of the block 0 3, 3 7
    EXPECT_NEAR(values[0], -9, this->tolerance);
    EXPECT_NEAR(values[1], larger, this->tolerance);
    EXPECT_NEAR(values[2], 3 + std::sqrt(2.0), this->tolerance); // of the block 4 1, 1 2
    this->expectEigen(a, Matrix<T>::identity(6), vectors, values);
    this->expectOrthonormalColumns(vectors);
}

TYPED_TEST(DecompositionOf, GeneralizedEigenvectorsSatisfyTheirEquation) {
    using T = TypeParam;
    const auto a = this->positiveDefinite(5, 10), b = this->positiveDefinite(5, 11);
    auto vectors = a.toMatrix();
    auto destroyedB = b;
    const auto values = Fn::generalizedEigenVectors(vectors, destroyedB, true);
    this->expectEigen(a, b.toMatrix(), vectors, values);
    this->expectNear(vectors.transposedMultWith(b * vectors), Matrix<T>::identity(5));

    auto destroyedA = a;
    destroyedB = b;
    Matrix<T> two(5, 2);
    const auto twoValues = Fn::generalizedEigenVectorsLowMem(destroyedA, destroyedB, two, true, 2);
    EXPECT_NEAR(twoValues[1], values[4], this->tolerance);
    this->expectEigen(a, b.toMatrix(), two, twoValues);

    auto indefinite = b;
    indefinite(2, 2) = -100;
    auto again = a.toMatrix();
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Fn::generalizedEigenVectors(again, indefinite, true); }),
              "MKL::generalizedEigenVectors()(?sygv): Found leading minor 3 of B not positive definite");
}

TYPED_TEST(DecompositionOf, TriangularFactorsMultiplyToTheMatrix) {
    using T = TypeParam;
    const auto a = this->positiveDefinite(5, 12);
    const auto l = Fn::cholesky(a);
    this->expectNear(l.multWithTransposed(l), a.toMatrix());
    EXPECT_EQ(l(0, 4), 0);

    Matrix<T> lower(5, 5);
    auto indefinite = a;
    indefinite(3, 3) = -2;
    const auto d = Fn::ldlDecomposition(indefinite, lower);
    this->expectNear((lower * d).multWithTransposed(lower), indefinite.toMatrix());
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Fn::cholesky(indefinite); }),
              "MKL Cholesky: the leading minor of order ST of A is not positive definite");
}

TEST(Decomposition, NamesWhyItFails) {
    const auto text = [](auto call) { return thrownText<FNEBadArg>(call); };
    Matrix<double> singular(2, 2), wide(2, 3), b(2, 1), b3(3, 1);
    singular.fill(1);
    wide.fill(1);
    b.fill(1);
    EXPECT_EQ(text([&] { Matrix<double>::linearSolve(singular, b); }),
              "Cannot solve for singular coefficient matrix");
    EXPECT_EQ(text([&] { Matrix<double>::linearSolve(wide, b); }),
              "Cannot exactly solve for non-square coefficient matrix");
    EXPECT_EQ(text([&] { Matrix<double>::linearSolve(singular, b3); }),
              "Row sizes of coefficient and target matrix do not match");
    EXPECT_EQ(text([&] { Matrix<double>::linearSolveLS(wide, b3); }),
              "Row sizes of matrices for linearSolveLS do not match");
    EXPECT_EQ(text([&] { Matrix<double>::linearSolveLS_SVD(wide, b3); }),
              "Row sizes of matrices for linearSolveLS_SVD do not match");
    EXPECT_EQ(text([&] { Matrix<double>::invert(singular); }), "Attempt to invert singular matrix");
    EXPECT_EQ(text([&] { Matrix<double>::invert(wide); }), "Cannot invert non-square matrix");
    SymmMatrix<double> s(2);
    s = 1.0;
    Matrix<double> one(2, 1), three(3, 3);
    EXPECT_EQ(text([&] { Fn::eigenVectorsLowMem(s, one, true, 3); }),
              "eigenVectors(): number of requested EV's exceeds matrix size");
    EXPECT_EQ(text([&] { Fn::eigenVectorsLowMem(s, one, true, 2); }), "Too few columns in EV matrix");
    EXPECT_EQ(text([&] { Fn::eigenVectorsLowMem(s, three, true, 2); }),
              "Inappropriate row size of EV matrix");
    EXPECT_EQ(text([&] { Fn::dominantEigenVectors(s, one, true, 3); }),
              "getDominantEigenVectors(): number of requested EV's exceeds matrix size");
    EXPECT_EQ(text([&] { Fn::absOrdered(FNVector<double>(2), 3); }),
              "requested more abs-ordered eigenvalues than available");
}

} // namespace

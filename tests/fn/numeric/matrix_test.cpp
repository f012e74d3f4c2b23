#include "fn/byte_order.h"
#include "fn/matrix_diagonal.h"
#include "fn/matrix_product.h"
#include "fn/matrix_symmetric.h"
#include "fn/numeric/blas_size.h"

#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <limits>
#include <random>
#include <sstream>

namespace {

using Fn::Matrix;
using Fn::SymmMatrix;

/// From the elements row after row.
template <class T> Matrix<T> matrixOf(std::size_t rows, std::size_t cols, const std::vector<T>& rowByRow) {
    Matrix<T> m(rows, cols);
    for (std::size_t r = 0; r < rows; ++r)
        for (std::size_t c = 0; c < cols; ++c) m(r, c) = rowByRow[r * cols + c];
    return m;
}

Matrix<double> randomMatrix(std::size_t rows, std::size_t cols, unsigned seed) {
    std::mt19937 random(seed);
    Matrix<double> m(rows, cols);
    for (std::size_t i = 0; i < m.size(); ++i)
        m.getExclusive()[i] = std::uniform_real_distribution<double>(-1, 1)(random);
    return m;
}

Matrix<double> transposed(Matrix<double> m) {
    return m.transpose();
}

void expectNear(const Matrix<double>& a, const Matrix<double>& b, double tolerance = 1e-12) {
    ASSERT_EQ(a.rows(), b.rows());
    ASSERT_EQ(a.cols(), b.cols());
    for (std::size_t i = 0; i < a.size(); ++i) EXPECT_NEAR(a.get()[i], b.get()[i], tolerance) << i;
}

/// The definition of a product.
Matrix<double> product(const Matrix<double>& a, const Matrix<double>& b) {
    Matrix<double> result(a.rows(), b.cols());
    for (std::size_t r = 0; r < a.rows(); ++r)
        for (std::size_t c = 0; c < b.cols(); ++c) {
            double sum = 0;
            for (std::size_t k = 0; k < a.cols(); ++k) sum += a(r, k) * b(k, c);
            result(r, c) = sum;
        }
    return result;
}

TEST(Matrix, PacksItsDimensionsAndThenColumnAfterColumn) {
    const Fn::Package package(matrixOf<float>(2, 3, {1, 2, 3, 4, 5, 6}));
    const unsigned char dimensions[] = {0, 0, 0, 2, 0, 0, 0, 3};
    const unsigned char firstColumn[] = {0x3F, 0x80, 0, 0, 0x40, 0x80, 0, 0}; // 1 and 4
    ASSERT_EQ(package.cores().size(), 2u);
    EXPECT_TRUE(std::equal(package.cores().front().begin(), package.cores().front().end(), dimensions));
    EXPECT_TRUE(std::equal(firstColumn, firstColumn + 8, package.cores().back().begin()));
    EXPECT_EQ(Matrix<float>(package), matrixOf<float>(2, 3, {1, 2, 3, 4, 5, 6}));
}

TEST(Matrix, PacksEightBitElementsAsTheyAre) {
    Matrix<signed char> m(1, 2);
    m(0, 0) = -128;
    m(0, 1) = 5;
    const Fn::Package package(m);
    EXPECT_EQ(package.cores().back().size(), 2u);
    const Matrix<signed char> read(package);
    EXPECT_EQ(read, m);
    EXPECT_EQ(static_cast<const void*>(read.get()),
              package.cores().back().data()); // large ones are not copied
}

TEST(Matrix, RefusesPackagesThatContradictThemselves) {
    const auto package = [](std::uint32_t rows, std::uint32_t cols, std::size_t bytes) {
        Fn::Package::Core dimensions(8);
        Fn::storeUInt32(rows, dimensions.getExclusive());
        Fn::storeUInt32(cols, dimensions.getExclusive() + 4);
        return Fn::Package(std::list<Fn::Package::Core>{dimensions, Fn::Package::Core(bytes)});
    };
    const auto text = [](const Fn::Package& p) { return thrownText<FNEBadArg>([&] { Matrix<double>{p}; }); };
    const std::string contradiction = "Matrix dimensions contradicts packages dimension";
    EXPECT_EQ(text(package(2, 3, 7 * 8)), contradiction);
    EXPECT_EQ(text(package(2, 3, 6 * 8 + 1)), contradiction);
    EXPECT_EQ(text(package(0xFFFFFFFF, 0xFFFFFFFF, 8)), contradiction);
    EXPECT_EQ(text(package(0x80000000, 0x40000000, 0)), contradiction); // 2^64 bytes
    EXPECT_EQ(text(Fn::Package(1)), "Creating a Matrix from an invalid package");
    EXPECT_EQ(Matrix<double>(package(0, 7, 0)).size(), 0u);
}

TEST(Matrix, AssignmentDoesNotReshape) {
    Matrix<double> a(2, 3), b(3, 2);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { a = b; }),
              "Matrix<T>::operator=( const Matrix<T>&): Wrong dimensions: [2 x 3] = [3 x 2]");
    const auto c = randomMatrix(2, 3, 1);
    a = c;
    EXPECT_EQ(a.get(), c.get());
    a(1, 2) = 7;
    EXPECT_NE(a, c);
}

TEST(Matrix, WritingBeyondTheEndThrows) {
    Matrix<float> a(2, 3);
    EXPECT_THROW(a(2, 0) = 1, FNEOutOfRange);
    EXPECT_THROW(a(0, 3) = 1, FNEOutOfRange);
}

TEST(Matrix, NaNIsUnequalToItself) {
    auto a = matrixOf<double>(1, 2, {1, 2});
    EXPECT_TRUE(a == a);
    a(0, 1) = std::numeric_limits<double>::quiet_NaN();
    EXPECT_FALSE(a == a);
    EXPECT_TRUE(a != a);
}

TEST(Matrix, TransposesInPlaceForAnyShape) {
    for (const auto& [rows, cols] :
         {std::pair{1, 1}, {1, 5}, {5, 1}, {2, 3}, {4, 6}, {7, 7}, {13, 5}, {0, 3}}) {
        auto m = randomMatrix(rows, cols, 2);
        const auto original = m;
        const double* const before = m.getExclusive();
        m.transposeInPlace();
        EXPECT_EQ(m.get(), before);
        ASSERT_EQ(m.rows(), original.cols());
        for (std::size_t r = 0; r < m.rows(); ++r)
            for (std::size_t c = 0; c < m.cols(); ++c) EXPECT_EQ(m(r, c), original(c, r));
    }
}

TEST(Matrix, ReordersColumnsAndRows) {
    auto m = matrixOf<double>(2, 5, {0, 1, 2, 3, 4, 10, 11, 12, 13, 14});
    m.mirror(4);
    EXPECT_EQ(m, matrixOf<double>(2, 5, {3, 2, 1, 0, 4, 13, 12, 11, 10, 14}));
    m.mirror();
    EXPECT_EQ(m, matrixOf<double>(2, 5, {4, 0, 1, 2, 3, 14, 10, 11, 12, 13}));
    m.swapColumns(0, 4);
    EXPECT_EQ(m.column(0), FNVector<double>(std::vector<double>{3, 13}));
    // Exchanges are made in order: 0 with 1, then 1 with 2.
    auto p = matrixOf<double>(3, 1, {0, 1, 2});
    p.permuteRows(FNVector<unsigned long>(std::vector<unsigned long>{1, 2}));
    EXPECT_EQ(p, matrixOf<double>(3, 1, {1, 2, 0}));
    EXPECT_THROW(m.mirror(6), FNEBadArg);
    EXPECT_THROW(m.swapColumns(0, 5), FNEBadArg);
    EXPECT_THROW(p.permuteRows(FNVector<unsigned long>(1, 3ul)), FNEBadArg);
    EXPECT_THROW(p.permuteRows(FNVector<unsigned long>(4, 0ul)), FNEBadArg);
}

TEST(Matrix, CopiesBlocksRowsAndColumns) {
    const auto m = matrixOf<double>(3, 3, {1, 2, 3, 4, 5, 6, 7, 8, 9});
    EXPECT_EQ(Matrix<double>(m, 1, 0, 2, 1), matrixOf<double>(2, 2, {4, 5, 7, 8}));
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Matrix<double>(m, 0, 0, 3, 0); }),
              "Matrix::Matrix( const Matrix&, idx, idx, idx, idx): Wrong indexes: ([0, 0], [3, 0])");
    auto written = m;
    written.row(0, m.column(2));
    EXPECT_EQ(written.row(0), FNVector<double>(std::vector<double>{3, 6, 9}));
    written.column(1, m.row(0));
    EXPECT_EQ(written, matrixOf<double>(3, 3, {3, 1, 9, 4, 2, 6, 7, 3, 9}));
    EXPECT_EQ(m(0, 0), 1);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { m.column(3); }),
              "Matrix<T>::column(size_t): argument outside of column range");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { written.row(0, FNVector<double>(2)); }),
              "Matrix<T>::row(): incompatible sizes in vector and column");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Matrix<double>(FNRMem<double>(5), 2, 3); }),
              "Matrix ctor from FNRMem: size too small");
}

TEST(Matrix, ProductsOfAllKindsAgreeWithTheDefinition) {
    const auto a = randomMatrix(4, 3, 3), b = randomMatrix(3, 5, 4), square = randomMatrix(3, 3, 5);
    const auto ab = product(a, b);
    expectNear(a * b, ab);
    expectNear(a.multWithTransposed(transposed(b)), ab);
    expectNear(transposed(a).transposedMultWith(b), ab);
    expectNear(Fn::MKL::mmmult(transposed(a), transposed(b), true, true), ab);

    for (std::size_t c = 0; c < 5; ++c)
        expectNear(Matrix<double>(a * b.column(c)), Matrix<double>(ab.column(c)));
    expectNear(Matrix<double>(a.row(1) * b), Matrix<double>(ab.row(1)));

    auto sum = ab;
    sum.addMultWith(a, b, 2);
    sum.addMultWithTransposed(a, transposed(b), -1);
    sum.addTransposedMultWith(transposed(a), b, 0.5);
    expectNear(sum, ab * 2.5);

    SymmMatrix<double> s(3);
    s = 0.0;
    s.addOuterProducts(square);
    expectNear(a * s, product(a, product(square, transposed(square))));
    expectNear(s * b, product(product(square, transposed(square)), b));
    expectNear(s.getSquare().toMatrix(), product(s.toMatrix(), s.toMatrix()));

    const Fn::DiagonalMatrix<double> d(FNVector<double>(std::vector<double>{1, -2, 3}));
    expectNear(a * d, product(a, Matrix<double>(d)));
    auto rows = b;
    d.mult(rows);
    expectNear(rows, product(Matrix<double>(d), b));

    auto outer = a;
    outer.addOuterProduct(ab.column(0), b.column(1));
    expectNear(outer, a + Matrix<double>(ab.column(0), b.column(1)));
    EXPECT_EQ(Matrix<double>(0, 3) * b, Matrix<double>(0, 5));
    EXPECT_EQ((Matrix<double>(2, 0) * Matrix<double>(0, 2)).sum(), 0);
}

TEST(Matrix, MeasuresItself) {
    const auto m = matrixOf<double>(2, 2, {1, 2, 3, 4});
    EXPECT_DOUBLE_EQ(m.norm_sq(), 30);
    EXPECT_DOUBLE_EQ(m.sum(), 10);
    EXPECT_FALSE(m.symmetric());
    EXPECT_TRUE(matrixOf<float>(2, 2, {1, 2, 2.0001f, 4}).symmetric());
    EXPECT_FALSE(matrixOf<float>(2, 2, {1, 2, 2.0002f, 4}).symmetric());
    EXPECT_FALSE(Matrix<double>(2, 3).symmetric());
    EXPECT_TRUE(Matrix<double>::identity(3).unit());
    EXPECT_FALSE(matrixOf<double>(2, 2, {1, 0, 1e-12, 1}).unit());
}

TEST(Matrix, NamesBothDimensionsOfWhatDoesNotFit) {
    Matrix<double> a(2, 3), b(4, 5);
    const Fn::SymmMatrix<double> s(4);
    const auto text = [](auto call) { return thrownText<FNEBadArg>(call); };
    EXPECT_EQ(text([&] { a* b; }), "MKL matrix mult: Wrong dimensions: [2 x 3]*[4 x 5]");
    EXPECT_EQ(text([&] { a.multWithTransposed(b); }), "MKL matrix mult: Wrong dimensions: [2 x 3]*[5 x 4]");
    EXPECT_EQ(text([&] { a* s; }), "MKL matrix * symm : Wrong dimensions: [2 x 3]*[4 x 4]");
    EXPECT_EQ(text([&] { s* a; }), "MKL symm * matrix : Wrong dimensions: [4 x 4]*[2 x 3]");
    EXPECT_EQ(text([&] { a.addMultWith(a, b, 1); }),
              "MKL add matrix mult*: Wrong dimensions: [2 x 3]*[4 x 5]");
    EXPECT_EQ(text([&] { b.addMultWithTransposed(a, a, 1); }),
              "MKL add matrix mult*: Wrong dimensions: [4 x 5] != [2 x 3]*[3 x 2]");
    EXPECT_EQ(text([&] { a* FNVector<double>(2); }), "Matrix operator*: Wrong dimensions: [2 x 3]*[2 x 1]");
    EXPECT_EQ(
        text([&] { a + b; }),
        "Matrix operator+( const Matrix& a, const Matrix& b): Wrong dimensions: a = [2 x 3] b = [4 x 5]");
    EXPECT_EQ(text([&] { a -= b; }),
              "Matrix<T>::operator-=( const Matrix<T>&): Wrong dimensions: [2 x 3] -= [4 x 5]");
    EXPECT_EQ(text([&] { a /= 0; }), "Matrix<T>::operator/=(): Dividing by 0\n");
    EXPECT_EQ(text([&] { a *= Fn::DiagonalMatrix<double>(2); }),
              "Matrix::*=(DiagonalMatrix): #matrix colums != #diagonal matrix rows");
}

TEST(Matrix, ReadsWhatItPrints) {
    const auto m = matrixOf<double>(2, 3, {1, 2.5, -3, 4, 5, 6});
    std::stringstream text;
    m.print(text);
    EXPECT_EQ(text.str(), "2 3\n 1 2.5 -3\n 4 5 6\n");
    EXPECT_EQ(Matrix<double>(text), m);
}

std::string binaryForm(const std::string& firstLine, const Matrix<float>& m) {
    return firstLine + "\n" + std::string(reinterpret_cast<const char*>(m.get()), m.size() * sizeof(float));
}

TEST(Matrix, ReadsTheBinaryStreamForm) {
    const auto m = matrixOf<float>(2, 3, {1, 2, 3, 4, 5, 6});
    std::istringstream stream(binaryForm("Fn::Matrix<float> Little Endian v2.0 2 3 and a comment", m) +
                              "rest");
    EXPECT_EQ(Matrix<float>(stream), m);
    EXPECT_EQ(stream.get(), 'r');
}

TEST(Matrix, RefusesStreamsWithTheirReason) {
    const auto text = [](const std::string& bytes) {
        return thrownText<FNEBadArg>([&] {
            std::istringstream stream(bytes);
            Matrix<float>{stream};
        });
    };
    const std::string header = "Fn::Matrix<float> Little Endian",
                      reading = header + " reading from istream: ";
    EXPECT_EQ(text(header + " v1.0 2 3\n"), reading + "unknown version identifier 'v1.0'");
    EXPECT_EQ(text("0 3\n"), reading + "unsupported format");
    EXPECT_EQ(text("3 0\n"), reading + "unsupported format");
    for (const std::string truncated :
         {"", "Fn::Matrix", "Fn::Matrix<float> Little Endian v2.0 2",
          "Fn::Matrix<float> Little Endian v2.0 2 3\nab",
          "Fn::Matrix<float> Little Endian v2.0 4000000000 4000000000\nabcd", "2 2\n 1 2 3", "2 2\n 1 2 3 x",
          "4000000000 4000000000\n 1 2 3", "Fn::Matrix<double> Little Endian v2.0 1 1\n12345678"})
        EXPECT_EQ(text(truncated).rfind(reading, 0), 0u) << truncated;
}

TEST(SymmMatrix, HoldsTheLowerTriangle) {
    testing::internal::CaptureStderr();
    SymmMatrix<double> s(matrixOf<double>(3, 3, {1, 99, 99, 2, 4, 99, 3, 5, 6}));
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "Warning: converting Matrix into symmetric where Matrix it's not!\n");
    const auto full = matrixOf<double>(3, 3, {1, 2, 3, 2, 4, 5, 3, 5, 6});
    EXPECT_EQ(s.toMatrix(), full);
    EXPECT_EQ(s.column(2), full.column(2));
    std::size_t length = 0;
    EXPECT_EQ(s.colidx(1, length), 4u);
    EXPECT_EQ(length, 2u);
    s.updatecol(2);
    EXPECT_EQ(FNVector<double>(std::span(s.get() + 6, 3)), full.column(2));
    s(0, 2) = 7;
    EXPECT_EQ(s.toMatrix()(2, 0), 7);
    EXPECT_THROW(SymmMatrix<double>(Matrix<double>(2, 3)), FNEBadArg);
}

TEST(SymmMatrix, ReadsColumnsFromTheDiagonalDown) {
    std::istringstream stream("3  1 2 3  4 5  6");
    EXPECT_EQ(SymmMatrix<double>(stream).toMatrix(), matrixOf<double>(3, 3, {1, 2, 3, 2, 4, 5, 3, 5, 6}));
    for (const char* bad : {"", "x", "2 1 2", "99999999999 1 2", "4000000000 1 2"}) {
        std::istringstream badStream(bad);
        EXPECT_THROW(SymmMatrix<double>{badStream}, FNEBadArg) << bad;
    }
}

TEST(BlasSize, HasToFitInto32Bits) {
    EXPECT_EQ(Fn::Numeric::blasSize(0x7FFFFFFF), 0x7FFFFFFF);
    EXPECT_EQ(thrownText<FNEBadArg>([] { Fn::Numeric::blasSize(0x80000000); }),
              "Size 2147483648 is too large for the numeric kernels");
}

TEST(SymmMatrix, ComputesLikeItsFullSquare) {
    const auto a = randomMatrix(4, 4, 6), b = randomMatrix(4, 4, 7);
    SymmMatrix<double> s(4), t(4);
    s = 0.0;
    s.addOuterProducts(a);
    t = 0.0;
    t.addOuterProducts(a, b);
    expectNear(t.toMatrix(), a.multWithTransposed(b) + b.multWithTransposed(a));
    auto both = s;
    both.addOuterProducts(a, b);
    both.addOuterProducts(a);
    both.addOuterProduct(a.column(0));
    const Matrix<double> first(a.column(0));
    expectNear(both.toMatrix(), s.toMatrix() * 2 + t.toMatrix() + first.multWithTransposed(first));
    expectNear((s + t).toMatrix(), s.toMatrix() + t.toMatrix());
    expectNear((s - t).toMatrix(), s.toMatrix() - t.toMatrix());
    EXPECT_NEAR(s.norm_sq(), s.toMatrix().norm_sq(), 1e-12);
    EXPECT_NEAR(s.determinant(), s.toMatrix().determinant(), 1e-12);
    expectNear(Matrix<double>(s * a.column(0)), Matrix<double>(s.toMatrix() * a.column(0)));
    auto shifted = s;
    shifted.linear_add(2, FNVector<double>(4, 1.0));
    expectNear(shifted.toMatrix(), s.toMatrix() + Matrix<double>::identity(4) * 2);
    auto inverse = t;
    inverse.invert();
    EXPECT_TRUE((inverse.toMatrix() * t.toMatrix()).unit());
    const SymmMatrix<double> part(s, {0, 3});
    EXPECT_EQ(part(1, 0), s(3, 0));
    EXPECT_EQ(thrownText<FNEGeneric>([&] {
                  SymmMatrix<double>(s, {1, 4});
              }),
              "The largest given index 4 is larger or equal to the given matrix width 4");
    SymmMatrix<double> zero(2);
    zero = 0.0;
    EXPECT_EQ(thrownText<FNEBadArg>([&] { zero.invert(); }), "Attempt to invert singular matrix");
}

} // namespace

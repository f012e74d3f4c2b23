#include "img/eigenvectors.h"

#include "random_images.h"

#include <gtest/gtest.h>

namespace {

using Vector = FN3Vector<double>;
using Matrix = FN3Matrix<double>;

void expectNear(const Matrix& a, const Matrix& b, double tolerance) {
    for (int i = 0; i < 3; ++i)
        for (int j = 0; j < 3; ++j) EXPECT_NEAR(a(i, j), b(i, j), tolerance) << i << " " << j;
}

Matrix diagonal(const Vector& v) {
    return {{{v.x, 0, 0}, {0, v.y, 0}, {0, 0, v.z}}};
}

Matrix randomRotation(RandomImages& random) {
    const auto vector = [&] { return Vector{random.real(-1, 1), random.real(-1, 1), random.real(-1, 1)}; };
    Vector a = vector(), b = vector();
    a = a / length(a);
    b = cross(a, b);
    b = b / length(b);
    return {{a, b, cross(a, b)}};
}

TEST(Eigenvectors, RebuildTheMatrix) {
    RandomImages random(1);
    const Vector spectra[] = {{3, 2, 1},   {5, -1, -7},       {2, 2, 1},          {2, 1, 1},      {4, 4, 4},
                              {1, 0, 0},   {1, 1e-9, -1e-9},  {1, 1 - 1e-9, 0.5}, {1e6, 3, 1e-6}, {0, 0, 0},
                              {0, -1, -2}, {1, 1 - 1e-15, 0}, {2e-6, 1e-6, 0},    {1e12, 1, 0.5}};
    for (const Vector& values : spectra)
        for (int round = 0; round < 6; ++round) {
            SCOPED_TRACE(testing::Message()
                         << values.x << " " << values.y << " " << values.z << " " << round);
            const Matrix q = round == 0 ? Matrix::identity() : randomRotation(random);
            const Matrix m = q.transposed() * diagonal(values) * q;
            const double scale = std::max(std::abs(values.x), std::abs(values.z));
            Matrix vectors;
            const Vector found = symmetricDouble3MatrixEigenVectors(m, vectors, false);
            for (int i = 0; i < 3; ++i) EXPECT_NEAR(found[i], values[i], 2e-14 * scale);
            expectNear(vectors.transposed() * vectors, Matrix::identity(), 1e-14);
            expectNear(vectors * diagonal(found) * vectors.transposed(), m, 5e-14 * scale);
        }
}

TEST(Eigenvectors, OfZeroAreMovedToTheEnd) {
    Matrix vectors = Matrix::identity();
    Vector values{1e-15, 5, -1e-14};
    orderEigenVectors(values, vectors);
    EXPECT_EQ(values, (Vector{5, -1e-14, 0}));
    EXPECT_EQ(vectors.column(0), (Vector{0, 1, 0}));
    EXPECT_EQ(vectors.column(1), (Vector{0, 0, 1}));
    EXPECT_EQ(vectors.column(2), Vector());

    EXPECT_EQ(symmetricDouble3MatrixEigenVectors(diagonal({0, 0, -3}), vectors, true), (Vector{-3, 0, 0}));
    EXPECT_EQ(std::abs(vectors(2, 0)), 1);
    EXPECT_EQ(vectors.column(1), Vector());
}

TEST(SingularValues, RebuildTheMatrix) {
    RandomImages random(2);
    for (const Vector& values :
         {Vector{3, 2, 1}, {2, 2, 1}, {5, 1, 0}, {1, 0, 0}, {0, 0, 0}, {4, 4, 4}, {1, 1e-3, 1e-6}})
        for (int round = 0; round < 5; ++round) {
            const Matrix m = randomRotation(random).transposed() * diagonal(values) * randomRotation(random);
            Matrix u, v;
            const Vector found = FN3MatrixSVD(m, u, v);
            for (int i = 0; i < 3; ++i) EXPECT_NEAR(found[i], values[i], 1e-9);
            expectNear(u.transposed() * u, Matrix::identity(), 1e-14);
            expectNear(v.transposed() * v, Matrix::identity(), 1e-14);
            expectNear(u * diagonal(found) * v.transposed(), m, 1e-9);
        }
}

} // namespace

#include "img/eigenvectors.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <utility>

namespace {

using Vector = FN3Vector<double>;
using Matrix = FN3Matrix<double>;

constexpr double zeroElement = 2.220446049250313e-16;
constexpr double equalRoots = 2.220446049250313e-14; // of a matrix whose greatest element is 1
constexpr double zeroEigenvalue = 1e-14;

double greatestElement(const Matrix& m) {
    double greatest = 0;
    for (const Vector& row : m.rows)
        for (const double element : {row.x, row.y, row.z}) greatest = std::max(greatest, std::abs(element));
    return greatest;
}

/// Roots of the characteristic polynomial, descending. With the mean subtracted it is t^3 - 3 p t - 2 q = 0.
/// Of a symmetric matrix, only rounding makes the discriminant q^2 - p^3 positive, and then two roots are
/// equal: Cardano's cube roots of q + sqrt(..) and q - sqrt(..) give what the cosines do at their end.
Vector eigenvalues(const Matrix& m) {
    const double mean = (m(0, 0) + m(1, 1) + m(2, 2)) / 3;
    Matrix k = m;
    for (int i = 0; i < 3; ++i) k(i, i) -= mean;
    double squares = 0;
    for (const Vector& row : k.rows) squares += dot(row, row);
    const double p = squares / 6, q = k.determinant() / 2, root = std::sqrt(p);
    if (root <= equalRoots) return {mean, mean, mean};

    const double third = std::acos(std::clamp(q / (p * root), -1.0, 1.0)) / 3;
    const double greatest = mean + 2 * root * std::cos(third);
    const double least = mean + 2 * root * std::cos(third + 2 * std::numbers::pi / 3);
    return {greatest, 3 * mean - greatest - least, least};
}

/// A unit vector at right angles to a unit vector.
Vector perpendicular(const Vector& v) {
    const Vector axis = std::abs(v.x) <= std::abs(v.y) && std::abs(v.x) <= std::abs(v.z) ? Vector{1, 0, 0}
                        : std::abs(v.y) <= std::abs(v.z)                                 ? Vector{0, 1, 0}
                                                                                         : Vector{0, 0, 1};
    const Vector w = cross(v, axis);
    return w / length(w);
}

/// The eigenvector of a simple eigenvalue: every row of the cofactors of m - value * 1 is a multiple of it.
Vector eigenvectorOf(Matrix m, double value) {
    for (int i = 0; i < 3; ++i) m(i, i) -= value;
    Vector best;
    for (int i = 0; i < 3; ++i) {
        const Vector cofactors = cross(m.rows[i], m.rows[(i + 1) % 3]);
        if (dot(cofactors, cofactors) > dot(best, best)) best = cofactors;
    }
    const double norm = length(best);
    return norm > 0 ? best / norm : Vector{1, 0, 0};
}

/// Eigenvalues and vectors of the symmetric matrix m in the plane at right angles to `axis`, the greater
/// first.
void planeEigenvectors(const Matrix& m, const Vector& axis, double values[2], Vector vectors[2]) {
    const Vector e = perpendicular(axis), f = cross(axis, e);
    const double ee = dot(e, m * e), ef = dot(e, m * f), ff = dot(f, m * f);
    const double middle = (ee + ff) / 2, radius = std::hypot((ee - ff) / 2, ef);
    values[0] = middle + radius;
    values[1] = middle - radius;
    if (radius <= equalRoots) {
        vectors[0] = e;
    } else {
        // Half the angle of the vector ((ee - ff) / 2, ef).
        const double angle = std::atan2(ef, (ee - ff) / 2) / 2;
        vectors[0] = std::cos(angle) * e + std::sin(angle) * f;
    }
    vectors[1] = cross(axis, vectors[0]);
}

} // namespace

FN3Vector<double> symmetricDouble3MatrixEigenVectors(FN3Matrix<double> const& matrix,
                                                     FN3Matrix<double>& vectors, bool order) {
    const double scale = greatestElement(matrix);
    Vector values;
    vectors = Matrix::identity();
    if (scale > zeroElement) {
        Matrix m;
        for (int i = 0; i < 3; ++i) m.rows[i] = matrix.rows[i] / scale;
        for (int i = 0; i < 3; ++i)
            for (int j = 0; j < i; ++j)
                if (std::abs(m(i, j)) < zeroElement || std::abs(matrix(i, j)) < zeroElement)
                    m(i, j) = m(j, i) = 0;

        values = eigenvalues(m);
        if (values.x - values.z > equalRoots) {
            // First the root that lies apart from the others; theirs lie in the plane at right angles to its
            // vector.
            const bool greatestFirst = values.x - values.y >= values.y - values.z;
            const Vector axis = eigenvectorOf(m, greatestFirst ? values.x : values.z);
            double planeValues[2];
            Vector plane[2];
            planeEigenvectors(m, axis, planeValues, plane);
            const double axisValue = dot(axis, m * axis);
            values = greatestFirst ? Vector{axisValue, planeValues[0], planeValues[1]}
                                   : Vector{planeValues[0], planeValues[1], axisValue};
            vectors.setColumn(greatestFirst ? 0 : 2, axis);
            vectors.setColumn(greatestFirst ? 1 : 0, plane[0]);
            vectors.setColumn(greatestFirst ? 2 : 1, plane[1]);
        }
        values = values * scale;
    }
    if (order) orderEigenVectors(values, vectors);
    return values;
}

void orderEigenVectors(FN3Vector<double>& values, FN3Matrix<double>& vectors) {
    Vector kept;
    Matrix keptVectors;
    for (int i = 0, next = 0; i < 3; ++i)
        if (std::abs(values[i]) >= zeroEigenvalue) {
            kept[next] = values[i];
            keptVectors.setColumn(next++, vectors.column(i));
        }
    values = kept;
    vectors = keptVectors;
}

template <>
FN3Vector<double> FN3MatrixSVD(FN3Matrix<double> const& matrix, FN3Matrix<double>& u, FN3Matrix<double>& v) {
    symmetricDouble3MatrixEigenVectors(matrix * matrix.transposed(), u, false);
    // The rows of uT * matrix are the singular values times the right vectors; those of no length are
    // replaced by what is at right angles to the others.
    Vector values;
    Vector right[3];
    const double none = zeroEigenvalue * greatestElement(matrix);
    for (int i = 0; i < 3; ++i) {
        Vector row = u.column(i) * matrix;
        for (int j = 0; j < i; ++j) row -= dot(row, right[j]) * right[j];
        values[i] = length(row);
        if (values[i] > none)
            right[i] = row / values[i];
        else
            right[i] = i == 0   ? Vector{1, 0, 0}
                       : i == 1 ? perpendicular(right[0])
                                : cross(right[0], right[1]);
        v.setColumn(i, right[i]);
    }
    return values;
}

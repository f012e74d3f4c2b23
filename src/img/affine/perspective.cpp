#include "img/affine/perspective.h"

#include <array>
#include <cmath>

namespace {

using Matrix = FN3Matrix<double>;

struct Map {
    Matrix matrix;
    MapMode mode;

    MapMode store(FN3Matrix<float>& T) const {
        for (int i = 0; i < 3; ++i)
            for (int j = 0; j < 3; ++j) T(i, j) = static_cast<float>(matrix(i, j));
        return mode;
    }
};

Map squareQuad(const FNPos (&p)[4]) {
    const auto [x0, x1, x2, x3] = std::array{double{p[0].x}, double{p[1].x}, double{p[2].x}, double{p[3].x}};
    const auto [y0, y1, y2, y3] = std::array{double{p[0].y}, double{p[1].y}, double{p[2].y}, double{p[3].y}};
    const double sx = x0 - x1 + x2 - x3, sy = y0 - y1 + y2 - y3;
    constexpr double tolerance = 1e-60;
    if (std::abs(sx) < tolerance && std::abs(sy) < tolerance)
        return {{{{x1 - x0, y1 - y0, 0}, {x2 - x1, y2 - y1, 0}, {x0, y0, 1}}}, MapAffine};

    const double dx1 = x1 - x2, dx2 = x3 - x2, dy1 = y1 - y2, dy2 = y3 - y2;
    const double determinant = dx1 * dy2 - dx2 * dy1;
    if (determinant == 0) FN_THROW(FNEBadArg, "MapSquareQuad: Bad Mapping!");
    const double g = (sx * dy2 - sy * dx2) / determinant, h = (sy * dx1 - sx * dy1) / determinant;
    return {{{{x1 - x0 + g * x1, y1 - y0 + g * y1, g}, {x3 - x0 + h * x3, y3 - y0 + h * y3, h}, {x0, y0, 1}}},
            MapProjective};
}

Map rectQuad(FNPos r0, FNPos r1, const FNPos (&p)[4]) {
    const double w = double{r1.x} - r0.x, h = double{r1.y} - r0.y;
    if (w == 0 || h == 0) FN_THROW(FNEBadArg, "MapRectQuad: Bad Mapping! Null Rectangle.");
    const Matrix toSquare{{{1 / w, 0, 0}, {0, 1 / h, 0}, {-r0.x / w, -r0.y / h, 1}}};
    const Map quad = squareQuad(p);
    return {toSquare * quad.matrix, quad.mode};
}

Matrix inverse(const Matrix& m) {
    const double determinant = m.determinant();
    if (determinant == 0 || !std::isfinite(determinant))
        FN_THROW(FNEBadArg, "MapQuadQuad: Bad Mapping! The points lie on a line.");
    Matrix result;
    for (int i = 0; i < 3; ++i)
        result.setColumn(i, cross(m.rows[(i + 1) % 3], m.rows[(i + 2) % 3]) / determinant);
    return result;
}

template <class T> FNPos farCorner(const FNImage<T>& image) {
    return {static_cast<float>(image.w()), static_cast<float>(image.h())};
}

} // namespace

MapMode MapSquareQuad(FNPos p0, FNPos p1, FNPos p2, FNPos p3, FN3Matrix<float>& T) {
    return squareQuad({p0, p1, p2, p3}).store(T);
}

MapMode MapRectQuad(FNPos r0, FNPos r1, FNPos p0, FNPos p1, FNPos p2, FNPos p3, FN3Matrix<float>& T) {
    return rectQuad(r0, r1, {p0, p1, p2, p3}).store(T);
}

MapMode MapQuadQuad(const FNPos (&p)[4], const FNPos (&q)[4], FN3Matrix<float>& T) {
    const Map from = squareQuad(p), to = squareQuad(q);
    const bool affine = from.mode == MapAffine && to.mode == MapAffine;
    return Map{inverse(from.matrix) * to.matrix, affine ? MapAffine : MapProjective}.store(T);
}

template <class T>
void imgMapWithTransform(const FNImage<T>& src, FNImage<T>& dst, const FN3Matrix<float>& transform) {
    T* out = dst.getExclusive();
    // The right and the lower neighbour are inside as well.
    const float lastX = static_cast<float>(src.w()) - 1, lastY = static_cast<float>(src.h()) - 1;
    for (std::uint32_t j = 0; j < dst.h(); ++j) {
        FN3Vector<float> point = FN3Vector<float>{0.5f, static_cast<float>(j) + 0.5f, 1} * transform;
        for (std::uint32_t i = 0; i < dst.w(); ++i, point += transform.rows[0]) {
            const float x = point.x / point.z - 0.5f, y = point.y / point.z - 0.5f;
            const float x0 = std::floor(x), y0 = std::floor(y);
            if (!(x0 >= 0 && y0 >= 0 && x0 < lastX && y0 < lastY)) {
                *out++ = 0;
                continue;
            }
            const float a = x - x0, b = y - y0;
            const T* const p = src.row(static_cast<std::uint32_t>(y0)) + static_cast<std::uint32_t>(x0);
            const T* const q = p + src.w();
            *out++ =
                static_cast<T>((1 - b) * ((1 - a) * static_cast<float>(p[0]) + a * static_cast<float>(p[1])) +
                               b * ((1 - a) * static_cast<float>(q[0]) + a * static_cast<float>(q[1])));
        }
    }
}

template <class T>
MapMode imgMapQuadToQuad(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&p)[4], const FNPos (&q)[4]) {
    FN3Matrix<float> transform;
    const MapMode mode = MapQuadQuad(q, p, transform);
    imgMapWithTransform(src, dst, transform);
    return mode;
}

template <class T>
MapMode imgMapRectToQuad(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&corners)[4]) {
    const Map map = rectQuad({}, farCorner(src), corners);
    FN3Matrix<float> transform;
    Map{inverse(map.matrix), map.mode}.store(transform);
    imgMapWithTransform(src, dst, transform);
    return map.mode;
}

MapMode imgMapQuadToRect(std::uint32_t width, std::uint32_t height, const FNPos (&corners)[4],
                         FN3Matrix<float>& T) {
    return rectQuad({}, {static_cast<float>(width), static_cast<float>(height)}, corners).store(T);
}

template <class T>
MapMode imgMapQuadToRect(const FNImage<T>& src, FNImage<T>& dst, const FNPos (&corners)[4]) {
    FN3Matrix<float> transform;
    const MapMode mode = imgMapQuadToRect(dst.w(), dst.h(), corners, transform);
    imgMapWithTransform(src, dst, transform);
    return mode;
}

using Corners = const FNPos (&)[4];
template void imgMapWithTransform(const FNImage<float>&, FNImage<float>&, const FN3Matrix<float>&);
template void imgMapWithTransform(const FNImage<unsigned char>&, FNImage<unsigned char>&,
                                  const FN3Matrix<float>&);
template MapMode imgMapQuadToQuad(const FNImage<float>&, FNImage<float>&, Corners, Corners);
template MapMode imgMapQuadToQuad(const FNImage<unsigned char>&, FNImage<unsigned char>&, Corners, Corners);
template MapMode imgMapRectToQuad(const FNImage<float>&, FNImage<float>&, Corners);
template MapMode imgMapRectToQuad(const FNImage<unsigned char>&, FNImage<unsigned char>&, Corners);
template MapMode imgMapQuadToRect(const FNImage<float>&, FNImage<float>&, Corners);
template MapMode imgMapQuadToRect(const FNImage<unsigned char>&, FNImage<unsigned char>&, Corners);

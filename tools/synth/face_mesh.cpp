#include "synth/face_mesh.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <numbers>

namespace Synth {
namespace {

constexpr std::size_t jawCount = 17, foreheadCount = 7;

FNPos mean(std::span<const FNPos> points) {
    FNPos sum;
    for (const FNPos p : points) sum += p;
    return sum / static_cast<float>(points.size());
}

double cross(FNPos a, FNPos b) {
    return double{a.x} * b.y - double{a.y} * b.x;
}

/// Whether `p` lies in the circle through the corners of a triangle, whatever their order.
bool inCircle(FNPos a, FNPos b, FNPos c, FNPos p) {
    const double ax = a.x - p.x, ay = a.y - p.y, bx = b.x - p.x, by = b.y - p.y, cx = c.x - p.x,
                 cy = c.y - p.y;
    const double a2 = ax * ax + ay * ay, b2 = bx * bx + by * by, c2 = cx * cx + cy * cy;
    const double determinant = a2 * (bx * cy - cx * by) - b2 * (ax * cy - cx * ay) + c2 * (ax * by - bx * ay);
    return determinant * cross(b - a, c - a) > 0;
}

} // namespace

FNPos leftEye(std::span<const FNPos> landmarks) {
    return mean(landmarks.subspan(36, 6));
}

FNPos rightEye(std::span<const FNPos> landmarks) {
    return mean(landmarks.subspan(42, 6));
}

FNPos mouth(std::span<const FNPos> landmarks) {
    return mean(landmarks.subspan(48, 12));
}

HeadAxes::HeadAxes(std::span<const FNPos> landmarks) {
    const FNPos left = leftEye(landmarks), right = rightEye(landmarks);
    origin_ = (left + right) / 2.0f;
    unit_ = length(right - left);
    right_ = (right - left) / unit_;
    up_ = {right_.y, -right_.x};
}

FNPos HeadAxes::local(FNPos picture) const {
    const FNPos offset = (picture - origin_) / unit_;
    return {dot(offset, right_), dot(offset, up_)};
}

Points withForehead(std::span<const FNPos> landmarks) {
    constexpr float heightOfChinDepth = 0.62f; // the forehead's above the eyes, of the chin's below them
    const HeadAxes head(landmarks);
    const FNPos left = head.local(landmarks[0]), right = head.local(landmarks[16]);
    const FNPos centre = (left + right) / 2.0f;
    const float halfWidth = (right.x - left.x) / 2;
    const float height = -head.local(landmarks[8]).y * heightOfChinDepth - centre.y;
    Points points(landmarks.begin(), landmarks.end());
    for (std::size_t i = 1; i <= foreheadCount; ++i) {
        const float angle =
            std::numbers::pi_v<float> * (1 - static_cast<float>(i) / static_cast<float>(foreheadCount + 1));
        points.push_back(head.picture(centre + FNPos{std::cos(angle) * halfWidth, std::sin(angle) * height}));
    }
    return points;
}

Points outline(std::span<const FNPos> meshPoints) {
    Points points(meshPoints.begin(), meshPoints.begin() + jawCount);
    points.insert(points.end(), meshPoints.rbegin(),
                  meshPoints.rbegin() + static_cast<std::ptrdiff_t>(meshPoints.size() - landmarkCount));
    return points;
}

std::vector<Triangle> delaunay(std::span<const FNPos> points) {
    constexpr float far = 1e5f; // pixels
    const auto n = static_cast<std::uint16_t>(points.size());
    Points all(points.begin(), points.end());
    all.insert(all.end(), {{-far, -far}, {far, -far}, {0, far}});
    std::vector<Triangle> triangles{
        {n, static_cast<std::uint16_t>(n + 1), static_cast<std::uint16_t>(n + 2)}};
    for (std::uint16_t i = 0; i < n; ++i) {
        // Triangles whose circle holds the point give way to those from the point to the rim of their union.
        std::map<std::pair<std::uint16_t, std::uint16_t>, int> edges;
        std::erase_if(triangles, [&](const Triangle& t) {
            if (!inCircle(all[t[0]], all[t[1]], all[t[2]], all[i])) return false;
            for (std::size_t k = 0; k < 3; ++k) ++edges[std::minmax(t[k], t[(k + 1) % 3])];
            return true;
        });
        for (const auto& [edge, count] : edges)
            if (count == 1) triangles.push_back({edge.first, edge.second, i});
    }
    std::erase_if(triangles, [&](const Triangle& t) { return std::max({t[0], t[1], t[2]}) >= n; });
    return triangles;
}

void forEachPixel(std::span<const Triangle> triangles, std::span<const FNPos> target,
                  std::span<const FNPos> source, const FNBox& box,
                  const std::function<void(FNGridPos pixel, FNPos source)>& visit) {
    std::vector<char> seen(std::size_t{box.width()} * box.height());
    for (const Triangle& t : triangles) {
        const FNPos a = target[t[0]], ab = target[t[1]] - a, ac = target[t[2]] - a;
        const double area = cross(ab, ac);
        if (area == 0) continue;
        const auto [x0, x1] = std::minmax({a.x, target[t[1]].x, target[t[2]].x});
        const auto [y0, y1] = std::minmax({a.y, target[t[1]].y, target[t[2]].y});
        const FNGridPos first(FNPos{std::floor(x0), std::floor(y0)}),
            last(FNPos{std::ceil(x1), std::ceil(y1)});
        const FNBox part = FNBox{first.x, first.y, last.x, last.y} & box;
        for (int y = part.y0; y < part.y1; ++y)
            for (int x = part.x0; x < part.x1; ++x) {
                const FNPos p = FNPos{static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f} - a;
                const auto beta = static_cast<float>(cross(p, ac) / area);
                const auto gamma = static_cast<float>(cross(ab, p) / area);
                if (beta < 0 || gamma < 0 || beta + gamma > 1) continue;
                char& done = seen[static_cast<std::size_t>(y - box.y0) * box.width() +
                                  static_cast<std::size_t>(x - box.x0)];
                if (done) continue; // on an edge of two triangles, or where the mesh folds
                done = 1;
                visit({x, y}, source[t[0]] * (1 - beta - gamma) + source[t[1]] * beta + source[t[2]] * gamma);
            }
    }
}

Similarity::Similarity(std::span<const FNPos> from, std::span<const FNPos> to) {
    const FNPos fromMean = mean(from), toMean = mean(to);
    double square = 0, along = 0, across = 0;
    for (std::size_t i = 0; i < from.size(); ++i) {
        const FNPos p = from[i] - fromMean, q = to[i] - toMean;
        square += dot(p, p);
        along += dot(p, q);
        across += cross(p, q);
    }
    cos_ = static_cast<float>(along / square);
    sin_ = static_cast<float>(across / square);
    shift_ = {};
    shift_ = toMean - (*this)(fromMean);
}

FNPos Similarity::inverse(FNPos p) const {
    const FNPos q = p - shift_;
    const float square = cos_ * cos_ + sin_ * sin_;
    return {(cos_ * q.x + sin_ * q.y) / square, (cos_ * q.y - sin_ * q.x) / square};
}

} // namespace Synth

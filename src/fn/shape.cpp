#include "fn/shape.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <ostream>

namespace Fn {

namespace {

using Segments = std::vector<Shape::Segment>;
using Limits = std::numeric_limits<std::int32_t>;

/// The segments of one line whose columns `combine(in a, in b)` chooses.
template <class Combine> Segments combinedLine(const Segments& a, const Segments& b, Combine combine) {
    std::vector<std::int32_t> borders;
    for (const Segments* line : {&a, &b})
        for (const Shape::Segment& s : *line) borders.insert(borders.end(), {s.x0, s.x1});
    std::sort(borders.begin(), borders.end());
    borders.erase(std::unique(borders.begin(), borders.end()), borders.end());

    Segments result;
    auto inA = a.begin(), inB = b.begin();
    for (std::size_t i = 0; i + 1 < borders.size(); ++i) {
        const std::int32_t x0 = borders[i], x1 = borders[i + 1];
        while (inA != a.end() && inA->x1 <= x0) ++inA;
        while (inB != b.end() && inB->x1 <= x0) ++inB;
        if (!combine(inA != a.end() && inA->x0 <= x0, inB != b.end() && inB->x0 <= x0)) continue;
        if (!result.empty() && result.back().x1 == x0)
            result.back().x1 = x1;
        else
            result.push_back({x0, x1});
    }
    return result;
}

std::int32_t saturated(std::int64_t v) {
    return static_cast<std::int32_t>(std::clamp<std::int64_t>(v, Limits::min(), Limits::max()));
}

/// Moves a bound outward; the bounds at infinity stay there.
std::int32_t lowered(std::int32_t v, std::int64_t n) {
    return saturated(v - n);
}
std::int32_t raised(std::int32_t v, std::int64_t n) {
    return saturated(v + n);
}

std::int32_t scaledAround(std::int32_t v, float center, float factor) {
    if (v == Limits::min() || v == Limits::max()) return v;
    const double scaled = center + (static_cast<double>(v) - center) * factor;
    return saturated(static_cast<std::int64_t>(
        std::clamp(std::floor(scaled + 0.5), double{Limits::min()}, double{Limits::max()})));
}

/// The interval that line `y` cuts out of a convex polygon; empty (from above to) if it misses it.
struct Cut {
    double from = std::numeric_limits<double>::max();
    double to = std::numeric_limits<double>::lowest();
};
template <class Corners> Cut cutAt(const Corners& corners, double y) {
    Cut cut;
    for (std::size_t i = 0; i < corners.size(); ++i) {
        const FNPos a = corners[i], b = corners[(i + 1) % corners.size()];
        if ((a.y <= y) == (b.y <= y)) continue;
        const double x =
            a.x + (y - a.y) * (static_cast<double>(b.x) - a.x) / (static_cast<double>(b.y) - a.y);
        cut.from = std::min(cut.from, x);
        cut.to = std::max(cut.to, x);
    }
    return cut;
}

} // namespace

Shape::Shape(const FNBox& box) {
    if (!box.empty()) spans_.push_back({box.y0, box.y1, {{box.x0, box.x1}}});
}

Shape Shape::parallelogram(FNPos corner, FNPos first, FNPos second) {
    constexpr float farthest = 1 << 24;
    std::array<FNPos, 4> corners{corner, first, first + (second - corner), second};
    for (FNPos& c : corners) {
        if (std::isnan(c.x) || std::isnan(c.y)) return {};
        c = {std::clamp(c.x, -farthest, farthest), std::clamp(c.y, -farthest, farthest)};
    }
    const auto [top, bottom] =
        std::minmax_element(corners.begin(), corners.end(), [](FNPos a, FNPos b) { return a.y < b.y; });
    const auto firstMiddleFrom = [](double v) { return static_cast<std::int32_t>(std::ceil(v - 0.5)); };
    Shape shape;
    for (std::int32_t y = firstMiddleFrom(top->y), end = firstMiddleFrom(bottom->y); y < end; ++y) {
        const Cut cut = cutAt(corners, y + 0.5);
        if (cut.from > cut.to) continue;
        const std::int32_t x0 = firstMiddleFrom(cut.from), x1 = firstMiddleFrom(cut.to);
        if (x0 < x1) shape.append(y, y + 1, {{x0, x1}});
    }
    return shape;
}

bool Shape::contains(FNGridPos pos) const {
    for (ShapeLineIter it(*this, pos.y); !it.atEnd(); ++it)
        if (it->x0 <= pos.x && pos.x < it->x1) return true;
    return false;
}

std::uint64_t Shape::area() const {
    std::uint64_t sum = 0;
    for (ShapeIter it(*this); !it.atEnd(); ++it) sum += std::uint64_t{(*it).width()} * (*it).height();
    return sum;
}

FNBox Shape::enclosing() const {
    if (empty()) return {};
    FNBox box{Limits::max(), spans_.front().y0, Limits::min(), spans_.back().y1};
    for (const Span& span : spans_) {
        box.x0 = std::min(box.x0, span.segments.front().x0);
        box.x1 = std::max(box.x1, span.segments.back().x1);
    }
    return box;
}

/// Adds a span below all others.
void Shape::append(std::int32_t y0, std::int32_t y1, std::vector<Segment> segments) {
    if (segments.empty()) return;
    if (!spans_.empty() && spans_.back().y1 == y0 && spans_.back().segments == segments)
        spans_.back().y1 = y1;
    else
        spans_.push_back({y0, y1, std::move(segments)});
}

template <class Combine> Shape Shape::combined(const Shape& a, const Shape& b, Combine combine) {
    std::vector<std::int32_t> borders;
    for (const Shape* shape : {&a, &b})
        for (const Span& span : shape->spans_) borders.insert(borders.end(), {span.y0, span.y1});
    std::sort(borders.begin(), borders.end());
    borders.erase(std::unique(borders.begin(), borders.end()), borders.end());

    static const Segments none;
    Shape result;
    auto inA = a.spans_.begin(), inB = b.spans_.begin();
    for (std::size_t i = 0; i + 1 < borders.size(); ++i) {
        const std::int32_t y0 = borders[i];
        while (inA != a.spans_.end() && inA->y1 <= y0) ++inA;
        while (inB != b.spans_.end() && inB->y1 <= y0) ++inB;
        result.append(y0, borders[i + 1],
                      combinedLine(inA != a.spans_.end() && inA->y0 <= y0 ? inA->segments : none,
                                   inB != b.spans_.end() && inB->y0 <= y0 ? inB->segments : none, combine));
    }
    return result;
}

Shape operator+(const Shape& a, const Shape& b) {
    return Shape::combined(a, b, [](bool inA, bool inB) { return inA || inB; });
}

Shape operator*(const Shape& a, const Shape& b) {
    return Shape::combined(a, b, [](bool inA, bool inB) { return inA && inB; });
}

Shape operator-(const Shape& a, const Shape& b) {
    return Shape::combined(a, b, [](bool inA, bool inB) { return inA && !inB; });
}

template <class Change> Shape Shape::changed(Change change) const {
    // Halves are joined, so that each rectangle takes part in few unions.
    std::vector<Shape> shapes;
    for (ShapeIter it(*this); !it.atEnd(); ++it) shapes.emplace_back(change(*it));
    if (shapes.empty()) return {};
    for (std::size_t step = 1; step < shapes.size(); step *= 2)
        for (std::size_t i = 0; i + step < shapes.size(); i += 2 * step) shapes[i] += shapes[i + step];
    return shapes.front();
}

Shape Shape::inflation(FNPos pos, float x, float y) const {
    return changed([&](const FNBox& box) {
        const std::int32_t x0 = scaledAround(box.x0, pos.x, x), x1 = scaledAround(box.x1, pos.x, x);
        const std::int32_t y0 = scaledAround(box.y0, pos.y, y), y1 = scaledAround(box.y1, pos.y, y);
        return FNBox{std::min(x0, x1), std::min(y0, y1), std::max(x0, x1),
                     std::max(y0, y1)}; // a factor may mirror
    });
}

Shape Shape::dilation(std::uint32_t n) const {
    return changed([n](const FNBox& box) {
        return FNBox{lowered(box.x0, n), lowered(box.y0, n), raised(box.x1, n), raised(box.y1, n)};
    });
}

Shape Shape::erosion(std::uint32_t n) const {
    const Shape surroundings = Shape(enclosing()).dilation(1) - *this;
    return *this - surroundings.dilation(n);
}

Shape Shape::expandXToInfinity() const {
    Shape result;
    for (const Span& span : spans_) result.append(span.y0, span.y1, {{Limits::min(), Limits::max()}});
    return result;
}

std::ostream& operator<<(std::ostream& stream, const Shape& shape) {
    if (shape.empty()) return stream << "Shape = {}\n";
    stream << "Shape = {\n";
    for (ShapeIter it(shape); !it.atEnd(); ++it) {
        const FNBox box = *it;
        stream << "  (" << box.x0 << ", " << box.y0 << ") - (" << box.x1 << ", " << box.y1 << ")\n";
    }
    return stream << "}\n";
}

std::list<FNBox> ShapeIter2::rectangles() const {
    std::list<FNBox> boxes;
    for (const Shape::Segment& s : span_->segments) boxes.push_back({s.x0, span_->y0, s.x1, span_->y1});
    return boxes;
}

ShapeLineIter::ShapeLineIter(const Shape& shape, std::int32_t y) {
    const auto span = std::upper_bound(shape.spans().begin(), shape.spans().end(), y,
                                       [](std::int32_t line, const Shape::Span& s) { return line < s.y1; });
    if (span == shape.spans().end() || span->y0 > y) return;
    next_ = span->segments.data();
    end_ = next_ + span->segments.size();
}

} // namespace Fn

#pragma once

#include "fn/geometry.h"

#include <cstdint>
#include <iosfwd>
#include <list>
#include <string>
#include <vector>

namespace Fn {

namespace Deployment {
class Component;
class Type;
} // namespace Deployment

/// A set of pixels of any form, with the operations of sets.
///
///     const Fn::Shape frame = Fn::Shape(image.box()) - Fn::Shape(FNBox{10, 10, 90, 90});
///     for (Fn::ShapeIter it(frame); !it.atEnd(); ++it) fill(*it);
///
/// It is kept as spans of rows, top to bottom, each with the segments that all of its rows consist of, left
/// to right. Neither spans nor segments touch without need, so that equal sets have equal forms.
class Shape {
public:
    /// The columns x0 <= x < x1.
    struct Segment {
        std::int32_t x0;
        std::int32_t x1;
        friend bool operator==(const Segment&, const Segment&) = default;
    };
    /// The rows y0 <= y < y1.
    struct Span {
        std::int32_t y0;
        std::int32_t y1;
        std::vector<Segment> segments;
        friend bool operator==(const Span&, const Span&) = default;
    };

    /// One rectangle of the configuration.
    struct Rectangle {
        static std::string typeId() { return "Shape::Rectangle"; }
        static Deployment::Type define();
    };

    Shape() = default;
    explicit Shape(const FNBox& box);
    /// The pixels whose middle lies in the parallelogram with these neighbours of a corner, in positions
    /// where pixel (x, y) is the square from (x, y) to (x + 1, y + 1). Positions beyond 2^24 are cut off.
    static Shape parallelogram(FNPos corner, FNPos first, FNPos second);

    /// A configuration type: a container of rectangles.
    static std::string typeId();
    static Deployment::Type define();
    /// The union of the configured rectangles.
    static Shape get(const Deployment::Component& component);

    const std::vector<Span>& spans() const noexcept { return spans_; }
    bool empty() const noexcept { return spans_.empty(); }
    bool contains(FNGridPos pos) const;
    /// Number of pixels.
    std::uint64_t area() const;
    /// The smallest box around all pixels; all bounds are 0 for an empty shape.
    FNBox enclosing() const;

    friend Shape operator+(const Shape& a, const Shape& b);
    friend Shape operator*(const Shape& a, const Shape& b);
    friend Shape operator-(const Shape& a, const Shape& b);
    Shape& operator+=(const Shape& other) { return *this = *this + other; }
    Shape& operator*=(const Shape& other) { return *this = *this * other; }
    Shape& operator-=(const Shape& other) { return *this = *this - other; }
    friend bool operator==(const Shape&, const Shape&) = default;

    /// All coordinates multiplied and rounded to the nearest integer.
    Shape scale(float x, float y) const { return inflation({}, x, y); }
    Shape scale(float factor) const { return scale(factor, factor); }
    /// Scaled around `pos` in place of the origin.
    Shape inflation(FNPos pos, float factor) const { return inflation(pos, factor, factor); }
    /// The pixels whose neighbours up to `n` columns and rows away all belong to the shape.
    Shape erosion(std::uint32_t n) const;
    /// The pixels with a neighbour up to `n` columns and rows away in the shape.
    Shape dilation(std::uint32_t n) const;
    /// Each row that has pixels becomes a full one, from the least to the greatest column there is.
    Shape expandXToInfinity() const;

private:
    Shape inflation(FNPos pos, float x, float y) const;
    /// The union of the rectangles after each has been changed by `change`.
    template <class Change> Shape changed(Change change) const;
    template <class Combine> static Shape combined(const Shape& a, const Shape& b, Combine combine);
    void append(std::int32_t y0, std::int32_t y1, std::vector<Segment> segments);

    std::vector<Span> spans_;
};

/// "Shape = {", a line for each rectangle, and "}"; just "Shape = {}" for an empty one.
std::ostream& operator<<(std::ostream& stream, const Shape& shape);

/// Walks the spans of a shape, which must outlive it, and gives the rectangles of each.
class ShapeIter2 {
public:
    explicit ShapeIter2(const Shape& shape) : span_(shape.spans().begin()), end_(shape.spans().end()) {}
    bool atEnd() const { return span_ == end_; }
    const Shape::Span& operator*() const { return *span_; }
    const Shape::Span* operator->() const { return &*span_; }
    ShapeIter2& operator++() {
        ++span_;
        return *this;
    }
    std::list<FNBox> rectangles() const;

private:
    std::vector<Shape::Span>::const_iterator span_, end_;
};

/// Walks the rectangles of a shape, which must outlive it: row ranges top to bottom, in each left to right.
class ShapeIter {
public:
    explicit ShapeIter(const Shape& shape) : span_(shape) {}
    bool atEnd() const { return span_.atEnd(); }
    FNBox operator*() const {
        const Shape::Segment& segment = span_->segments[segment_];
        return {segment.x0, span_->y0, segment.x1, span_->y1};
    }
    ShapeIter& operator++() {
        if (++segment_ == span_->segments.size()) {
            segment_ = 0;
            ++span_;
        }
        return *this;
    }

private:
    ShapeIter2 span_;
    std::size_t segment_ = 0;
};

/// Walks the segments of one line of a shape, which must outlive it.
class ShapeLineIter {
public:
    ShapeLineIter(const Shape& shape, std::int32_t y);
    bool atEnd() const { return next_ == end_; }
    const Shape::Segment& operator*() const { return *next_; }
    const Shape::Segment* operator->() const { return next_; }
    ShapeLineIter& operator++() {
        ++next_;
        return *this;
    }

private:
    const Shape::Segment* next_ = nullptr;
    const Shape::Segment* end_ = nullptr;
};

} // namespace Fn

#include "fn/shape.h"
#include "orbek/image_operations.h"
#include "orbek/implementation/adapt.h"

#include <cmath>
#include <span>
#include <vector>

namespace Orbek {
namespace {

using Fn::Bgra32;
using Fn::Shape;

/// All boxes together. By halves, since joining takes time in proportion to the sum of what is joined.
Shape unionOf(std::span<const FNBox> boxes) {
    if (boxes.empty()) return {};
    if (boxes.size() == 1) return Shape(boxes.front());
    const std::size_t half = boxes.size() / 2;
    return unionOf(boxes.first(half)) + unionOf(boxes.subspan(half));
}

/// What lies outside of a circle of that radius in each corner of the box.
Shape cornersOf(const FNBox& box, int radius) {
    std::vector<FNBox> corners;
    const std::int64_t r = radius;
    const std::int64_t rows = std::min<std::int64_t>(r, box.height()), width = box.width();
    for (std::int64_t row = 0; row < rows; ++row) {
        const std::int64_t fromCentre = r - row;
        const auto halfChord =
            static_cast<std::int64_t>(std::sqrt(static_cast<double>(r * r - fromCentre * fromCentre)) + 0.5);
        const auto cut = static_cast<std::int32_t>(std::min(r - halfChord, width));
        const auto top = static_cast<std::int32_t>(box.y0 + row),
                   bottom = static_cast<std::int32_t>(box.y1 - 1 - row);
        for (const std::int32_t y : {top, bottom}) {
            corners.push_back({box.x0, y, box.x0 + cut, y + 1});
            corners.push_back({box.x1 - cut, y, box.x1, y + 1});
        }
    }
    return unionOf(corners);
}

void fill(FNImage<Bgra32>& image, const Shape& shape, const Bgra32& color) {
    for (Fn::ShapeIter box(shape); !box.atEnd(); ++box)
        for (FNImIter<Bgra32> pixel(image, *box); !pixel.atEnd(); ++pixel) *pixel = color;
}

/// Where the outline of a shape lies, seen along the rows or the columns of the image: for each line the
/// outermost place before the middle and behind it.
class Outline {
public:
    /// @param lines,length number of lines, and of places on one
    Outline(std::int32_t lines, std::int32_t length)
        : middleLine_(lines / 2), middle_(length / 2), before_(static_cast<std::size_t>(lines), none),
          behind_(static_cast<std::size_t>(lines), none) {}

    void add(std::int32_t line, std::int32_t place) {
        const auto i = static_cast<std::size_t>(line);
        if (place <= middle_)
            before_[i] = before_[i] == none ? place : std::min(before_[i], place);
        else
            behind_[i] = std::max(behind_[i], place);
    }
    /// A line without a place takes that of the next one toward the middle.
    void close() {
        for (std::vector<std::int32_t>* side : {&before_, &behind_}) {
            const auto middle = static_cast<std::size_t>(middleLine_);
            for (std::size_t i = middle; i-- > 0;)
                if ((*side)[i] == none) (*side)[i] = (*side)[i + 1];
            for (std::size_t i = middle + 1; i < side->size(); ++i)
                if ((*side)[i] == none) (*side)[i] = (*side)[i - 1];
        }
    }
    /// From a place to the outline on its side of the line; 0 if there is none.
    std::int32_t distance(std::int32_t line, std::int32_t place) const {
        const std::int32_t border = (place <= middle_ ? before_ : behind_)[static_cast<std::size_t>(line)];
        return border == none ? 0 : std::abs(place - border);
    }

private:
    static constexpr std::int32_t none = -1;
    std::int32_t middleLine_, middle_;
    std::vector<std::int32_t> before_, behind_;
};

unsigned char mixed(unsigned char color, unsigned char pixel, double share) {
    return static_cast<unsigned char>(color + (pixel - color) * share + 0.5);
}

void fade(Bgra32& pixel, const Bgra32& color, double t, SmoothingFunction smoothing) {
    if (smoothing == SmoothingFunction::Hard) {
        pixel = color;
        return;
    }
    const double share = smoothing == SmoothingFunction::Linear ? t : std::exp(-3 * (t - 1) * (t - 1));
    pixel.b = mixed(color.b, pixel.b, share);
    pixel.g = mixed(color.g, pixel.g, share);
    pixel.r = mixed(color.r, pixel.r, share);
}

} // namespace

Image vignetting(const Image& image, Rgb rgb, int borderWidth, int cornerRadius,
                 SmoothingFunction smoothing) {
    FNImage<Bgra32> result = adapt(image).toBgra32();
    result.demandExclusiveUse(); // it may lie on pixels of the application
    const Bgra32 color(rgb.red, rgb.green, rgb.blue, rgb.alpha);
    const FNBox box = result.box();
    const Shape full(box);

    Shape outer = full;
    if (cornerRadius > 0) {
        const Shape corners = cornersOf(box, cornerRadius);
        fill(result, corners, color);
        outer -= corners;
    }
    const auto inset = static_cast<std::int32_t>(std::min<std::uint32_t>(
        static_cast<std::uint32_t>(std::max(borderWidth, 0)), std::max(box.width(), box.height())));
    const FNBox innerBox{inset, inset, box.x1 - inset, box.y1 - inset};
    Shape inner(innerBox);
    if (cornerRadius > 0 && !innerBox.empty()) inner -= cornersOf(innerBox, cornerRadius);

    Outline rows(box.y1, box.x1), columns(box.x1, box.y1);
    const Shape outlinePixels = outer - outer.erosion(1), border = full - inner;
    for (Fn::ShapeIter part(outlinePixels); !part.atEnd(); ++part)
        for (std::int32_t y = (*part).y0; y < (*part).y1; ++y)
            for (std::int32_t x = (*part).x0; x < (*part).x1; ++x) {
                rows.add(y, x);
                columns.add(x, y);
            }
    rows.close();
    columns.close();

    for (Fn::ShapeIter part(border); !part.atEnd(); ++part)
        for (FNImIter<Bgra32> pixel(result, *part); !pixel.atEnd(); ++pixel) {
            const std::int32_t x = (*part).x0 + static_cast<std::int32_t>(pixel.x()),
                               y = (*part).y0 + static_cast<std::int32_t>(pixel.y());
            const std::int32_t toOutline = std::min(rows.distance(y, x), columns.distance(x, y));
            const double t = inset > 0 ? std::min(static_cast<double>(toOutline) / borderWidth, 1.0) : 1.0;
            fade(*pixel, color, t, smoothing);
        }
    return adapt(FNImageReferenceFactory::create(result), "");
}

} // namespace Orbek

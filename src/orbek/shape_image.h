#pragma once

#include "orbek/counted_ptr.h"
#include "orbek/geometry.h"

#include <iosfwd>
#include <string>

namespace Orbek {

/// What a ShapeImage refers to: a 3D scan as a grid of points. An application that has a grid already may
/// derive a body of its own; both arrays lie row by row from top to bottom, without padding, and stay valid
/// and unchanged as long as the body.
class [[gnu::visibility("default")]] ShapeImageBody {
public:
    ShapeImageBody();
    ShapeImageBody(const ShapeImageBody&) = delete;
    ShapeImageBody& operator=(const ShapeImageBody&) = delete;
    virtual ~ShapeImageBody();

    virtual unsigned int width() const = 0;
    virtual unsigned int height() const = 0;
    /// width() * height() points in millimetres: x points right, y up and z toward the scanner.
    virtual const Vertex* vertices() const = 0;
    /// width() * height() times whether there is a point.
    virtual const bool* mask() const = 0;
};

/// Handle on a 3D scan.
using ShapeImage = CountedPtr<ShapeImageBody>;

/// A scan that the library keeps in its own memory.
class [[gnu::visibility("default")]] MemoryShapeImageBody : public ShapeImageBody {
public:
    /// Copies `width` * `height` points and their mask.
    /// @param transpose whether rows become columns, and columns rows
    /// @throws std::exception if an array is null
    MemoryShapeImageBody(const Vertex* vertices, const bool* mask, unsigned int width, unsigned int height,
                         bool transpose);
    ~MemoryShapeImageBody() override;

    unsigned int width() const override;
    unsigned int height() const override;
    const Vertex* vertices() const override;
    const bool* mask() const override;

    class [[gnu::visibility("hidden")]] Implementation;
    [[gnu::visibility("hidden")]] const Implementation& implementation() const {
        return *implementation_;
    }

private:
    CountedPtr<Implementation> implementation_;
};

/// A MemoryShapeImageBody with the same arguments.
[[gnu::visibility("default")]] CountedPtr<ShapeImageBody>
createImageBody(const Vertex* vertices, const bool* mask, unsigned int width, unsigned int height,
                bool transpose);

/// Reads a scan of any format that the library knows. @throws std::exception naming what is wrong
[[gnu::visibility("default")]] ShapeImage loadShapeImage(const std::string& fileName);
[[gnu::visibility("default")]] ShapeImage loadShapeImage(std::istream& stream);

} // namespace Orbek

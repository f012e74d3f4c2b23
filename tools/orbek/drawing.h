#pragma once

#include "fn/image_reference.h"
#include "orbek/eyes_finder.h"
#include "orbek/face_finder.h"

namespace Orbek::Tool {

/// A colour picture that is drawn into. Coordinates are image pixels; what lies outside is left out.
class Drawing {
public:
    explicit Drawing(const FNImageReference& image) : image_(image.toBgra32()) {}

    /// @param thickness of the line, pixels
    void line(FNPos from, FNPos to, float thickness, const Fn::Bgra32& color);
    /// A filled disc.
    void disc(FNPos center, float radius, const Fn::Bgra32& color);
    /// A number in digits, on a dark plate.
    /// @param corner its upper left one
    /// @param height of the digits, pixels
    void number(FNPos corner, unsigned int number, float height, const Fn::Bgra32& color);

    /// A face: a box that is turned with it, and its number at the box's upper left corner.
    void face(const Face::Location& face, unsigned int number);
    void eyes(const Eyes::Location& eyes);
    /// The mouth or the bridge of the nose. @param eyeDistance gives its size
    void feature(FNPos pos, float eyeDistance);

    FNImageReference picture() const { return FNImageReferenceFactory::create(image_); }

private:
    void fill(const FNBox& box, const Fn::Bgra32& color);

    FNImage<Fn::Bgra32> image_;
};

} // namespace Orbek::Tool

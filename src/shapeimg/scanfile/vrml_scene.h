#pragma once

#include "shapeimg/scanfile/mesh.h"

#include <iosfwd>
#include <list>
#include <string>

namespace ShapeImage {

/// A shape of a VRML scene: its indexed face set, and the first picture that its material names.
struct VrmlShape {
    Mesh mesh;
    std::string picture; ///< empty if there is none
};

/// Reads the shapes of a VRML 2.0 text. Nodes are read where they are defined (DEF); references to them (USE)
/// are not followed. @throws FNEBadArg for a damaged text.
std::list<VrmlShape> readVrmlScene(std::istream& stream);

} // namespace ShapeImage

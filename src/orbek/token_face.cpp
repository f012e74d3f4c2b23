#include "orbek/token_face.h"

#include "kx/cbeff.h"
#include "orbek/implementation/adapt.h"

namespace Orbek::ISO_19794_5::TokenFace {

void write(std::ostream& stream, const std::list<std::pair<Image, Eyes::Location>>& faces) {
    Kx::CBEFF::TokenFace::write(stream, adapt(faces.begin(), faces.end(), [](const Image&) {}));
}

std::list<std::pair<Image, Eyes::Location>> read(std::istream& stream) {
    std::list<std::pair<Image, Eyes::Location>> faces;
    for (const Cmp::Face& face : Kx::CBEFF::read(stream)) {
        // A record has no finder's eyes: they follow from the face's location.
        const FacialFeatureLocation left{face.leftEye()}, right{face.rightEye()};
        faces.push_back(adapt(Cmp::Face(face.image(), left, right)));
    }
    return faces;
}

} // namespace Orbek::ISO_19794_5::TokenFace

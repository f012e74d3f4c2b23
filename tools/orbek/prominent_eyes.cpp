#include "prominent_eyes.h"

namespace Orbek::Tool {
namespace {

/// Eye distances to look for, in widths of the image: those by which portraits are searched for faces.
constexpr float minRelEyeDist = 0.05f, maxRelEyeDist = 0.45f;

} // namespace

std::optional<Eyes::Location> ProminentEyes::find(const Image& image) const {
    const std::list<Face::Location> faces =
        faces_.find(image, minRelEyeDist, maxRelEyeDist, 0, 0, static_cast<int>(image->width()),
                    static_cast<int>(image->height()));
    if (faces.empty()) return {};
    const std::list<Eyes::Location> eyes = eyes_.find(image, faces.front());
    return eyes.empty() ? std::nullopt : std::optional(eyes.front());
}

} // namespace Orbek::Tool

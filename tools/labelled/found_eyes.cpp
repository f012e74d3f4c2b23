#include "labelled/found_eyes.h"

#include "labelled/finder_access.h"
#include "labelled/pictures.h"

namespace Labelled {

EyesAsFound::EyesAsFound(const std::filesystem::path& etc)
    : face_(makeFaceFinder(etc)), eyes_(makeEyesFinder(etc, "Tolerant")) {}

EyesAsFound::Eyes EyesAsFound::operator()(const FNImageReference& image, FNPos left, FNPos right) const {
    constexpr double least = 0.05, most = 0.65; // widths of the picture
    constexpr float mostOff = 0.25f;            // of what is taken for the labelled eye, eye distances
    std::list<FaceFinder::Location> locations;
    face_.find(image, locations, least, most, FaceFinder::everywhere);
    const FaceTruth truth{left, right, {}, {}, "", true};
    const float limit = mostOff * truth.eyeDistance();
    for (const FaceFinder::Location& location : locations) {
        if (!truth.meantBy(location)) continue;
        bool foundFirst = false, foundSecond = false;
        FacialFeatureLocation first, second;
        eyes_.find(location, image, foundFirst, first, foundSecond, second);
        if (foundFirst && foundSecond && length(first.pos - left) < limit &&
            length(second.pos - right) < limit && first.pos.x < second.pos.x)
            return {first.pos, second.pos, true};
    }
    return {left, right, false};
}

} // namespace Labelled

#pragma once

#include "orbek/eyes_finder.h"

#include <optional>

namespace Orbek::Tool {

/// Finds the eyes of the face that is most surely one.
class ProminentEyes {
public:
    explicit ProminentEyes(const Configuration& configuration)
        : faces_(configuration), eyes_(configuration) {}

    /// None if there is no face, or if not both of its eyes were found.
    std::optional<Eyes::Location> find(const Image& image) const;

private:
    Face::Finder faces_;
    Eyes::Finder eyes_;
};

} // namespace Orbek::Tool

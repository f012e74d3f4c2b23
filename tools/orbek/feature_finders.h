#pragma once

#include "eye/bridge_finder.h"
#include "eye/mouth_finder.h"
#include "orbek/configuration.h"

namespace Orbek::Tool {

/// The configuration's INSTALLDIR, below whose etc/ the models lie.
std::string installationFolder(const Configuration& configuration);

/// The finders that the public classes do not show, with the models below the configuration's INSTALLDIR.
struct FeatureFinders {
    /// @throws std::exception that names the model file and what is wrong with it
    explicit FeatureFinders(const Configuration& configuration);

    MouthFinder mouth;
    BridgeFinder bridge;
};

} // namespace Orbek::Tool

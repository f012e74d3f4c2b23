#pragma once

#include "eye/feature_finder.h"

/// Handle on an engine that finds the bridge of the nose, its top between the eyes.
class BridgeFinder : public FeatureFinder<BridgeFinder> {
public:
    using FeatureFinder::FeatureFinder;
};

#pragma once

#include "eye/feature_finder.h"

/// Handle on an engine that finds the middle of the mouth.
class MouthFinder : public FeatureFinder<MouthFinder> {
public:
    using FeatureFinder::FeatureFinder;
};

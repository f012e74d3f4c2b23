#pragma once

#include "cmp/strategy.h"
#include "kx/sensor_sample.h"

namespace Kx::Implementation {

/// Compares samples, each for itself, with populations.
class Identifier {
public:
    /// @param maxMatches to list at most
    Identifier(const Cmp::Strategy& strategy, const Fn::View<Cmp::Population>& populations,
               Cmp::Score threshold, unsigned int maxMatches)
        : strategy_(strategy), populations_(populations), threshold_(threshold), maxMatches_(maxMatches) {}

    /// One attempt. @return whether there are matches
    bool compare(const SensorSample& sample);

    /// Of the last attempt that had a record to compare, best first.
    const Cmp::Matches& matches() const { return matches_; }

private:
    Cmp::Strategy strategy_;
    Fn::View<Cmp::Population> populations_;
    Cmp::Score threshold_;
    unsigned int maxMatches_;
    Cmp::Matches matches_;
};

} // namespace Kx::Implementation

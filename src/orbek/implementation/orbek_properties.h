#pragma once

#include "fn/deployment/type.h"

namespace Orbek {

/// The comparison algorithms that a configuration can choose from.
struct ComparisonAlgorithms {
    static std::string typeId() { return "ComparisonAlgorithms"; }
    static Fn::Deployment::Type define();
};

/// The root type of the configuration tree: every setting of the library lies below it.
struct ORBEKProperties {
    static std::string typeId() { return "ORBEKResources"; }
    static Fn::Deployment::Type define();
};

} // namespace Orbek

#pragma once

#include "fn/deployment/type.h"

namespace Orbek {

/// The root type of the configuration tree: every setting of the library lies below it.
struct ORBEKProperties {
    static std::string typeId() { return "ORBEKResources"; }
    static Fn::Deployment::Type define();
};

} // namespace Orbek

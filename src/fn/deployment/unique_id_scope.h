#pragma once

#include "fn/callback/unique_id.h"
#include "fn/deployment/component.h"

namespace Fn::Deployment {

/// The configuration of a UniqueId::Scope.
struct UniqueIdScope {
    static std::string typeId() { return "Fn::UniqueId::Scope"; }
    static Type define();
    static UniqueId::Scope make(const Component& component);
};

} // namespace Fn::Deployment

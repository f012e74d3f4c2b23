#include "fn/deployment/unique_id_scope.h"

#include "fn/deployment/composite_values.h"

#include <algorithm>

namespace Fn::Deployment {
namespace {

struct Kinds {
    static std::list<std::string> enumeration() {
        return {std::begin(UniqueId::Scope::kindNames), std::end(UniqueId::Scope::kindNames)};
    }
};

} // namespace

Type UniqueIdScope::define() {
    return Type(typeId(), "The scope for generation of unique ids",
                properties(property<Enum<Kinds>>::create("Type", "The scope for the unique ID generation."),
                           property<String>::create(
                               "HostPrefix",
                               "This setting is only used if Type is NETWORKWIDE.If empty the canonical "
                               "hostname will be used. If a shorter string is needed use this careful. "
                               "The strings must be unique in its context.")),
                "", false);
}

UniqueId::Scope UniqueIdScope::make(const Component& component) {
    const std::list<std::string> names = Kinds::enumeration();
    const std::string chosen = Value<Enum<Kinds>>::get(component.subComponent("Type"));
    const auto index = std::distance(names.begin(), std::find(names.begin(), names.end(), chosen));
    return UniqueId::Scope(static_cast<UniqueId::Scope::Kind>(index),
                           Value<String>::get(component.subComponent("HostPrefix")));
}

} // namespace Fn::Deployment

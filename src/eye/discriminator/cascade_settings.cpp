#include "eye/discriminator/cascade_settings.h"

#include "fn/deployment/component.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/leaf_values.h"

namespace Eye::Implementation {

using namespace Fn::Deployment;

std::list<Property> CascadeSettings::members() {
    return properties(
        property<String>::create("File", "Filename of discriminator template, relative to template path"),
        property<Container<Float>>::create("Cascade", "Mapping of number of steps to threshold"));
}

Type CascadeSettings::define() {
    return Type(typeId(), "Cascaded SVM discriminator", members(), "", false);
}

CascadeSettings CascadeSettings::read(const Component& component) {
    CascadeSettings settings;
    settings.file = Value<String>::get(component.subComponent("File"));
    const Component cascade = component.subComponent("Cascade");
    for (const std::string& steps : Value<Container<Float>>::get(cascade))
        settings.cascade.push_back({steps, Value<Float>::get(cascade.subComponent(steps))});
    return settings;
}

} // namespace Eye::Implementation

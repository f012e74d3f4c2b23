#include "fn/deployment/component.h"

#include "fn/deployment/application_component.h"
#include "fn/deployment/composite_values.h"

#include <algorithm>

namespace Fn::Deployment {

Component::Component(const FNCountedPtr<AppConfigDB>& primary, const Property& root,
                     const FNCountedPtr<AppConfigDB>& secondary, const Variables& given)
    : body_(ApplicationComponent::makeRoot(primary, root, secondary, given)) {}

std::list<Component> Component::subComponents() const {
    const Type ownType = type();
    std::list<Component> children;
    if (isContainer(ownType)) {
        for (const std::string& child : ContainerBase::stringToValue(read(false)))
            children.push_back(subComponent(child));
    } else if (isAlternative(ownType) || isOldAlternative(ownType)) {
        children.push_back(subComponent(read(false)));
    } else {
        for (const Property& member : ownType.properties()) children.push_back(subComponent(member.name()));
    }
    return children;
}

void Component::copy(const Component& source, bool expand) {
    if (source.type() != type())
        FN_THROW(FNEBadArg, "Cannot copy Component of type " + source.type().id() + " to Component of type " +
                                type().id() + ".");
    write(source.read(expand));
    // Only now: the elements of a container are those that were just written.
    std::list<Component> targets = subComponents();
    const std::list<Component> sources = source.subComponents();
    auto from = sources.begin();
    for (auto to = targets.begin(); to != targets.end() && from != sources.end(); ++to, ++from)
        to->copy(*from, false);
}

void typeCheck(const Component& component, const Type& type, const std::string& operation) {
    if (component.type() != type)
        FN_THROW(FNESysError, "Type Error: Value[" + type.id() + "]::" + operation +
                                  " does not allow the use of component " + component.name() + "[" +
                                  component.type().id() + "] !");
}

void typeCheck(const Property& property, const Type& type, const std::string& operation) {
    if (property.type() != type)
        FN_THROW(FNESysError, "Type Error: DefaultValue[" + type.id() + "]::" + operation +
                                  " does not allow the use of property " + property.name() + "[" +
                                  property.type().id() + "] !");
}

} // namespace Fn::Deployment

#include "fn/deployment/configurator_machine.h"

#include "fn/deployment/composite_values.h"
#include "fn/deployment/configurator_component.h"
#include "fn/deployment/tree_tools.h"
#include "fn/text_forms.h"

#include <algorithm>

namespace Fn::Deployment {
namespace {

template <class Observable, class... A> void send(const Observable& event, const A&... args) {
    try {
        event->broadcast(args...);
    } catch (const ObserverFailure& failure) {
        std::rethrow_exception(failure.cause);
    }
}

/// Whether the child of that name is present below a node.
bool isPresent(const Component& parent, const std::string& child) {
    const Type type = parent.type();
    if (isContainer(type)) {
        const std::list<std::string> names = ContainerBase::stringToValue(parent.read(true));
        return std::find(names.begin(), names.end(), child) != names.end();
    }
    if (isAlternative(type) || isOldAlternative(type)) return parent.read(true) == child;
    return true;
}

/// Resets what is stored at a node and below. @return whether there was anything
bool resetAll(Component component) {
    bool any = false;
    if (!component.isDefault()) {
        component.reset();
        any = true;
    }
    for (const Component& child : component.subComponents()) any = resetAll(child) || any;
    return any;
}

template <class Visit> void walk(const Component& component, const Visit& visit) {
    visit(component);
    for (const Component& child : component.subComponents()) walk(child, visit);
}

} // namespace

std::list<Component> ConfiguratorMachine::roots() const {
    const FNMutexLock lock(mutex_);
    return roots_;
}

const Component* ConfiguratorMachine::findRoot(const std::list<Component>& roots,
                                               const std::string& name) const {
    const auto root = std::find_if(roots.begin(), roots.end(),
                                   [&](const Component& candidate) { return candidate.name() == name; });
    return root == roots.end() ? nullptr : &*root;
}

std::pair<Component, bool> ConfiguratorMachine::getComponent(const std::string& name) const {
    std::list<std::string> parts = splitText(name, '.');
    if (parts.empty()) parts.push_back(name);
    const std::list<Component> all = roots();
    const Component* const root = findRoot(all, parts.front());
    if (!root)
        FN_THROW(FNEBadArg, "Could not generate Component with name '" + name +
                                "': Does not found matching root component.");
    parts.pop_front();

    std::pair<Component, bool> found{*root, true};
    for (const std::string& part : parts) {
        found.second = found.second && isPresent(found.first, part);
        found.first = found.first.subComponent(part);
    }
    return found;
}

void ConfiguratorMachine::addRootComponent(const Component& root) {
    bool replaced = false;
    {
        const FNMutexLock lock(mutex_);
        for (Component& present : roots_)
            if (present.name() == root.name()) {
                present = root;
                replaced = true;
            }
        if (!replaced) roots_.push_back(root);
    }
    if (replaced) send(removed_, root);
    send(added_, root.name());
}

void ConfiguratorMachine::removeRootComponent(const std::string& name) {
    FNMutexLock lock(mutex_);
    const Component* const present = findRoot(roots_, name);
    if (!present) return;
    const Component root = *present;
    roots_.remove_if([&](const Component& candidate) { return candidate.name() == name; });
    lock.release();
    send(removed_, root);
}

std::list<std::string> ConfiguratorMachine::subComponents(const std::string& name) const {
    std::list<std::string> names;
    for (const Component& child : name.empty() ? roots() : node(name).subComponents())
        names.push_back(child.name());
    return names;
}

Property ConfiguratorMachine::property(const std::string& name) const {
    return node(name).ownType();
}
std::string ConfiguratorMachine::value(const std::string& name, bool expand) const {
    return node(name).read(expand);
}
std::string ConfiguratorMachine::defaultValue(const std::string& name) const {
    return node(name).readDefault();
}
bool ConfiguratorMachine::isDefault(const std::string& name) const {
    return node(name).isDefault();
}
bool ConfiguratorMachine::readOnly(const std::string& name) const {
    return node(name).readOnly();
}

void ConfiguratorMachine::setValue(const std::string& name, const std::string& value) {
    auto [component, exists] = getComponent(name);
    if (component.isDefault() && component.read(false) == value) return;
    component.write(value);
    send(changed_, name, exists);
}

void ConfiguratorMachine::setDefaultValue(const std::string& name, const std::string& value) {
    auto [component, exists] = getComponent(name);
    if (component.readDefault() == value) return;
    component.writeDefault(value);
    send(changed_, name, exists);
}

void ConfiguratorMachine::copy(const std::string& source, const std::string& target) {
    const Component from = node(source);
    auto [to, exists] = getComponent(target);
    if (from.type() != to.type()) return;
    to.copy(from, false);
    send(changed_, target, exists);
}

void ConfiguratorMachine::reset(const std::string& name, bool recursive) {
    auto [component, exists] = getComponent(name);
    if (recursive) {
        if (!resetAll(component)) return;
    } else {
        if (component.isDefault()) return;
        component.reset();
    }
    send(changed_, name, exists);
}

bool ConfiguratorMachine::isExternConfigurable(const std::string& name) const {
    const std::string typeId = property(name).type().id();
    const FNMutexLock lock(mutex_);
    return externalHooks_.contains(typeId);
}

bool ConfiguratorMachine::externalConfiguration(const std::string& name) {
    const std::string typeId = property(name).type().id();
    FNMutexLock lock(mutex_);
    const auto entry = externalHooks_.find(typeId);
    if (entry == externalHooks_.end()) return false;
    const Functor1<Component> hook = entry->second;
    lock.release();
    hook(Component(new ConfiguratorComponent(*this, name)));
    return true;
}

void ConfiguratorMachine::addExternalConfigurationHook(const std::string& typeId,
                                                       const Functor1<Component>& hook) {
    const FNMutexLock lock(mutex_);
    externalHooks_.insert_or_assign(typeId, hook);
}

std::list<std::string> ConfiguratorMachine::findComponents(const std::string& typeFilter,
                                                           const std::string& nameFilter,
                                                           const std::string& valueFilter,
                                                           bool onlyChanged) const {
    std::list<std::string> names;
    for (const Component& root : roots())
        walk(root, [&](const Component& component) {
            if (matchString(component.type().id(), typeFilter) && matchString(component.name(), nameFilter) &&
                matchString(component.read(false), valueFilter) && !(onlyChanged && component.isDefault()))
                names.push_back(component.name());
        });
    return names;
}

std::list<Type> ConfiguratorMachine::listAllTypes() const {
    TreeTools::TypeSet types;
    for (const Component& root : roots()) types.merge(TreeTools::getTypes(root.type()));
    return {types.begin(), types.end()};
}

bool ConfiguratorMachine::componentExists(const std::string& name) const {
    const std::list<std::string> parts = splitText(name, '.');
    if (parts.empty()) return false;
    const std::list<Component> all = roots();
    const Component* const root = findRoot(all, parts.front());
    if (!root) return false;
    try {
        Component component = *root;
        for (auto part = std::next(parts.begin()); part != parts.end(); ++part) {
            if (isAlternative(component.type()) && component.read(true) != *part) return false;
            component = component.subComponent(*part);
        }
        return true;
    } catch (const FNException&) {
        return false;
    }
}

} // namespace Fn::Deployment

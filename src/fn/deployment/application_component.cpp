#include "fn/deployment/application_component.h"

#include "fn/deployment/composite_values.h"
#include "fn/message/dialog.h"
#include "fn/text_forms.h"

#include <memory>

namespace Fn::Deployment {
namespace {

constexpr const char* substitutionsName = "Substitutions";
constexpr const char* defaultSuffix = ".default";

} // namespace

ApplicationComponent::RuntimeResources::RuntimeResources(const FNCountedPtr<AppConfigDB>& primaryDb,
                                                         const FNCountedPtr<AppConfigDB>& secondaryDb)
    : primary(primaryDb), secondary(secondaryDb) {
    if (!primary) FN_THROW(FNEBadFunCall, "No primary configuration passed (mandatory).");
}

ApplicationComponent::ApplicationComponent(int depth, const FNCountedPtr<RuntimeResources>& resources,
                                           const Property& property, const std::string& name,
                                           const std::list<std::string>& aliases, bool readOnly)
    : depth_(depth), resources_(resources), property_(property), name_(name), aliases_(aliases),
      readOnly_(readOnly) {
    expandDefaults();
}

ApplicationComponent* ApplicationComponent::makeRoot(const FNCountedPtr<AppConfigDB>& primary,
                                                     const Property& root,
                                                     const FNCountedPtr<AppConfigDB>& secondary,
                                                     const Component::Variables& given) {
    const FNCountedPtr<RuntimeResources> resources(new RuntimeResources(primary, secondary));
    for (const auto& [name, value] : given) resources->substitutions["$" + name] = value;
    auto component = std::unique_ptr<ApplicationComponent>(
        new ApplicationComponent(0, resources, root, root.name(), {"*"}, root.readOnly()));
    component->readSubstitutions();
    return component.release();
}

void ApplicationComponent::readSubstitutions() {
    if (!findProperty(property_.type().properties(), substitutionsName)) return;
    const Component container = subComponent(substitutionsName);
    for (const std::string& variable : ContainerBase::stringToValue(container.read(true)))
        resources_->substitutions["$" + variable] = Value<String>::get(container.subComponent(variable));
}

/// Enters the defaults that this node's type imposes, unless an outer node has done so for the same key.
void ApplicationComponent::expandDefaults() {
    const Type& type = property_.type();
    const FNMutexLock lock(resources_->defaultsMutex);
    for (const Default& imposed : (isAlternative(type) ? delegateType(type) : type).defaults())
        resources_->typeDefaults.emplace(name_ + "." + imposed.path(), TypeDefault{imposed.value(), depth_});
}

/// Of the defaults that outer types impose on this node, the one from farthest out.
const ApplicationComponent::TypeDefault* ApplicationComponent::outermostTypeDefault() const {
    const TypeDefault* best = nullptr;
    const auto consider = [&](const std::string& key) {
        const auto entry = resources_->typeDefaults.find(key);
        if (entry == resources_->typeDefaults.end() || entry->second.depth > depth_) return;
        if (!best || entry->second.depth < best->depth) best = &entry->second;
    };
    consider(name_);
    for (const std::string& alias : aliases_) consider(alias);
    return best;
}

/// The first default that is stored in `db` under the name or an alias.
bool ApplicationComponent::findStoredDefault(const AppConfigDB& db, std::string& value) const {
    const auto look = [&](const std::string& key) {
        if (!db.exists(key + defaultSuffix)) return false;
        value = db.get(key + defaultSuffix);
        return true;
    };
    if (look(name_)) return true;
    for (const std::string& alias : aliases_)
        if (look(alias)) return true;
    return false;
}

std::string ApplicationComponent::readDefault() const {
    std::string value =
        property_.defaultValue().empty() ? property_.type().defaultValue() : property_.defaultValue();
    {
        const FNMutexLock lock(resources_->defaultsMutex);
        if (const TypeDefault* const imposed = outermostTypeDefault()) value = imposed->value;
    }
    if (findStoredDefault(*resources_->primary, value) || !resources_->secondary) return value;
    const AppConfigDB& secondary = *resources_->secondary;
    if (secondary.exists(name_)) return secondary.get(name_);
    findStoredDefault(secondary, value);
    return value;
}

std::string ApplicationComponent::read(bool expand) const {
    std::string value = readDefault();
    if (!callReadHook(value) && resources_->primary->exists(name_)) value = resources_->primary->get(name_);
    return expand ? expanded(value) : value;
}

std::string ApplicationComponent::expanded(std::string text) const {
    if (text.find('$') != std::string::npos)
        for (const auto& [variable, value] : resources_->substitutions) replaceAll(text, variable, value);
    return text;
}

/// @return whether there is a hook; `value` is then its result, or as before if it failed.
bool ApplicationComponent::callReadHook(std::string& value) const {
    FNMutexLock lock(resources_->readMutex);
    const auto entry = resources_->readHooks.find(name_);
    if (entry == resources_->readHooks.end()) return false;
    const Functor0Ret<std::string> hook = entry->second;
    lock.release();
    try {
        value = hook();
    } catch (const std::exception& e) {
        FNDialog::warn("Error on read hook of component " + name_ + ": " + e.what());
    }
    return true;
}

void ApplicationComponent::callWriteHook(const std::string& value) const {
    FNMutexLock lock(resources_->writeMutex);
    const auto entry = resources_->writeHooks.find(name_);
    if (entry == resources_->writeHooks.end()) return;
    const Functor1<std::string> hook = entry->second;
    lock.release();
    try {
        hook(value);
    } catch (const std::exception& e) {
        FNDialog::warn("Error on write hook of component " + name_ + ": " + e.what());
    }
}

void ApplicationComponent::write(const std::string& text) {
    if (readOnly_) FN_THROW(FNEBadFunCall, "Cannot change readonly component " + name_);
    callWriteHook(text);
    resources_->primary->set(name_, text);
}

void ApplicationComponent::reset() {
    if (readOnly_) FN_THROW(FNEBadFunCall, "Cannot reset readonly component " + name_);
    resources_->primary->remove(name_);
    callWriteHook(readDefault());
}

void ApplicationComponent::writeDefault(const std::string& text) {
    resources_->primary->set(name_ + defaultSuffix, text);
}

bool ApplicationComponent::isDefault() const {
    {
        const FNMutexLock lock(resources_->readMutex);
        if (resources_->readHooks.contains(name_)) return false;
    }
    return !resources_->primary->exists(name_);
}

ApplicationComponent* ApplicationComponent::makeChild(const Property& property, bool isElement) const {
    std::list<std::string> aliases;
    for (const std::string& alias : aliases_) aliases.push_back(alias + "." + property.name());
    if (isElement) {
        aliases.push_back(name_ + ".*");
        for (const std::string& alias : aliases_) aliases.push_back(alias + ".*");
    }
    return new ApplicationComponent(depth_ + 1, resources_, property, name_ + "." + property.name(), aliases,
                                    readOnly_ || property.readOnly());
}

Component ApplicationComponent::subComponent(const std::string& name) const {
    const Type& type = property_.type();
    if (isContainer(type)) {
        const Type& contained = containedType(type);
        return Component(makeChild(Property(contained, name, contained.defaultValue(), "", false), true));
    }
    const Property* const member = findProperty(membersOf(type), name);
    if (!member)
        FN_THROW(FNEBadArg, "subComponent(" + name + "): property not found in component " + name_ + "[" +
                                type.id() + "]");
    return Component(makeChild(*member, false));
}

void ApplicationComponent::setReadHook(const Functor0Ret<std::string>& hook) {
    const FNMutexLock lock(resources_->readMutex);
    resources_->readHooks.insert_or_assign(name_, hook);
}

void ApplicationComponent::removeReadHook() {
    const FNMutexLock lock(resources_->readMutex);
    resources_->readHooks.erase(name_);
}

void ApplicationComponent::setWriteHook(const Functor1<std::string>& hook) {
    const FNMutexLock lock(resources_->writeMutex);
    resources_->writeHooks.insert_or_assign(name_, hook);
}

void ApplicationComponent::removeWriteHook() {
    const FNMutexLock lock(resources_->writeMutex);
    resources_->writeHooks.erase(name_);
}

} // namespace Fn::Deployment

#pragma once

#include "fn/deployment/configurator.h"
#include "fn/thread/mutex.h"

#include <exception>
#include <map>
#include <utility>

namespace Fn::Deployment {

/// An observer throws one of these to let a failure reach whoever made the change; any other failure costs it
/// its place and is not seen. (Not a std::exception, so that it leaves the broadcast.)
struct ObserverFailure {
    std::exception_ptr cause;
};

/// The configurator over trees of this process. Its mutex guards the list of roots only; events go out
/// without it.
class ConfiguratorMachine final : public Configurator {
public:
    Event<std::string> rootComponentAddedEvent() const override { return added_; }
    Event<Component> rootComponentRemovedEvent() const override { return removed_; }
    Event<std::string, bool> componentChangedEvent() const override { return changed_; }

    void addRootComponent(const Component& root) override;
    void removeRootComponent(const std::string& name) override;
    std::list<std::string> subComponents(const std::string& name) const override;
    Property property(const std::string& name) const override;
    std::string value(const std::string& name, bool expand) const override;
    std::string defaultValue(const std::string& name) const override;
    void setValue(const std::string& name, const std::string& value) override;
    void copy(const std::string& source, const std::string& target) override;
    void setDefaultValue(const std::string& name, const std::string& value) override;
    void reset(const std::string& name, bool recursive) override;
    bool isDefault(const std::string& name) const override;
    bool readOnly(const std::string& name) const override;
    bool isExternConfigurable(const std::string& name) const override;
    bool externalConfiguration(const std::string& name) override;
    void addExternalConfigurationHook(const std::string& typeId, const Functor1<Component>& hook) override;
    std::list<std::string> findComponents(const std::string& typeFilter, const std::string& nameFilter,
                                          const std::string& valueFilter, bool onlyChanged) const override;
    std::list<Type> listAllTypes() const override;
    bool componentExists(const std::string& name) const override;

private:
    std::pair<Component, bool> getComponent(const std::string& name) const;
    Component node(const std::string& name) const { return getComponent(name).first; }
    const Component* findRoot(const std::list<Component>& roots, const std::string& name) const;
    std::list<Component> roots() const;

    FNCountedPtr<FNObservableBody1<std::string>> added_{new FNObservableBody1<std::string>};
    FNCountedPtr<FNObservableBody1<Component>> removed_{new FNObservableBody1<Component>};
    FNCountedPtr<FNObservableBody2<std::string, bool>> changed_{new FNObservableBody2<std::string, bool>};
    FNMutex mutex_{FNMutex::recursive};
    std::list<Component> roots_;
    std::map<std::string, Functor1<Component>> externalHooks_;
};

} // namespace Fn::Deployment

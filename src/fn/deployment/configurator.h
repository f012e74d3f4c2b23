#pragma once

#include "fn/callback/observable.h"
#include "fn/deployment/component.h"

#include <list>
#include <string>

namespace Fn::Deployment {

/// The view of several configuration trees at once: every node is addressed by its full dotted name, and each
/// change is reported. Any path through a container or an alternative that is not chosen can be read and
/// written; it merely does not "exist".
///
/// All operations with a name throw FNEBadArg for a name without a root and for a member that a type does not
/// have.
class Configurator {
public:
    template <class... A> using Event = FNCountedPtr<FNObservable<Functor<void, A...>>>;

    virtual Event<std::string> rootComponentAddedEvent() const = 0;
    virtual Event<Component> rootComponentRemovedEvent() const = 0;
    /// The name of the node, and whether it exists.
    virtual Event<std::string, bool> componentChangedEvent() const = 0;
    virtual ~Configurator() = default;

    /// Takes the place of a root of the same name.
    virtual void addRootComponent(const Component& root) = 0;
    /// Does nothing for an unknown name.
    virtual void removeRootComponent(const std::string& name) = 0;
    /// Full names of the present children, of the roots for the empty name.
    virtual std::list<std::string> subComponents(const std::string& name) const = 0;
    virtual Property property(const std::string& name) const = 0;
    virtual std::string value(const std::string& name, bool expand) const = 0;
    virtual std::string defaultValue(const std::string& name) const = 0;
    /// Does nothing if the node has that value by default.
    virtual void setValue(const std::string& name, const std::string& value) = 0;
    /// Does nothing if the nodes are of different types.
    virtual void copy(const std::string& source, const std::string& target) = 0;
    virtual void setDefaultValue(const std::string& name, const std::string& value) = 0;
    /// Forgets the stored value of a node, or of the node and all below it.
    virtual void reset(const std::string& name, bool recursive) = 0;
    virtual bool isDefault(const std::string& name) const = 0;
    virtual bool readOnly(const std::string& name) const = 0;
    /// Whether there is a hook for the node's type.
    virtual bool isExternConfigurable(const std::string& name) const = 0;
    /// Calls the hook for the node's type. @return whether there is one
    virtual bool externalConfiguration(const std::string& name) = 0;
    virtual void addExternalConfigurationHook(const std::string& typeId, const Functor1<Component>& hook) = 0;
    /// Full names of the nodes whose type id, name and unexpanded value match (see matchString).
    virtual std::list<std::string> findComponents(const std::string& typeFilter,
                                                  const std::string& nameFilter,
                                                  const std::string& valueFilter, bool onlyChanged) const = 0;
    virtual std::list<Type> listAllTypes() const = 0;
    /// Never throws; any element name of a container will do.
    virtual bool componentExists(const std::string& name) const = 0;
};

} // namespace Fn::Deployment

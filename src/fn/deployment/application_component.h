#pragma once

#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/thread/mutex.h"

#include <list>
#include <map>
#include <string>

namespace Fn::Deployment {

/// The plain node. It is cheap: two nodes of one name are different objects over the same key.
///
/// Beside its name a node has aliases, for the lookup of defaults only: the root is also "*", and an element
/// of a container is also "*" in its container. So ORBEK.Cont.x.Key is also *.Cont.x.Key, ORBEK.Cont.*.Key
/// and
/// *.Cont.*.Key.
class ApplicationComponent final : public Component::Body {
public:
    /// @throws FNEBadFunCall if `primary` is null
    static ApplicationComponent* makeRoot(const FNCountedPtr<AppConfigDB>& primary, const Property& root,
                                          const FNCountedPtr<AppConfigDB>& secondary,
                                          const Component::Variables& given);

    Property ownType() const override { return property_; }
    std::string name() const override { return name_; }
    std::string readDefault() const override;
    std::string read(bool expand) const override;
    void reset() override;
    bool isDefault() const override;
    bool readOnly() const override { return readOnly_; }
    void writeDefault(const std::string& text) override;
    void write(const std::string& text) override;
    Component subComponent(const std::string& name) const override;
    void setReadHook(const Functor0Ret<std::string>& hook) override;
    void removeReadHook() override;
    void setWriteHook(const Functor1<std::string>& hook) override;
    void removeWriteHook() override;

    /// The database that holds the values of the tree.
    const FNCountedPtr<AppConfigDB>& db() const { return resources_->primary; }

private:
    /// A value that a type imposes, and the depth of the node that has this type.
    struct TypeDefault {
        std::string value;
        int depth;
    };

    /// What all nodes of a tree share.
    class RuntimeResources {
    public:
        RuntimeResources(const FNCountedPtr<AppConfigDB>& primaryDb,
                         const FNCountedPtr<AppConfigDB>& secondaryDb);

        FNMutex readMutex{FNMutex::recursive};
        std::map<std::string, Functor0Ret<std::string>> readHooks;
        FNMutex writeMutex{FNMutex::recursive};
        std::map<std::string, Functor1<std::string>> writeHooks;
        FNCountedPtr<AppConfigDB> primary;
        FNCountedPtr<AppConfigDB> secondary;
        FNMutex defaultsMutex{FNMutex::recursive};
        std::map<std::string, TypeDefault> typeDefaults;
        std::map<std::string, std::string> substitutions; // "$" + name to value
    };

    ApplicationComponent(int depth, const FNCountedPtr<RuntimeResources>& resources, const Property& property,
                         const std::string& name, const std::list<std::string>& aliases, bool readOnly);
    ApplicationComponent* makeChild(const Property& property, bool isElement) const;

    void expandDefaults();
    void readSubstitutions();
    std::string expanded(std::string text) const;
    const TypeDefault* outermostTypeDefault() const;
    bool findStoredDefault(const AppConfigDB& db, std::string& value) const;
    bool callReadHook(std::string& value) const;
    void callWriteHook(const std::string& value) const;

    int depth_; // 0 at the root
    FNCountedPtr<RuntimeResources> resources_;
    Property property_;
    std::string name_;
    std::list<std::string> aliases_;
    bool readOnly_;
};

} // namespace Fn::Deployment

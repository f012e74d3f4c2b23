#pragma once

#include "fn/deployment/configurator.h"

namespace Fn::Deployment {

/// A node seen through a configurator, so that a write to it is observed and constrained, unlike one to a
/// plain node. Does not keep the configurator alive. Hooks have no effect here.
class ConfiguratorComponent final : public Component::Body {
public:
    ConfiguratorComponent(Configurator& configurator, const std::string& name)
        : configurator_(configurator), name_(name) {}

    Property ownType() const override { return configurator_.property(name_); }
    std::string name() const override { return name_; }
    std::string readDefault() const override { return configurator_.defaultValue(name_); }
    std::string read(bool expand) const override { return configurator_.value(name_, expand); }
    void reset() override { configurator_.reset(name_, false); }
    bool isDefault() const override { return configurator_.isDefault(name_); }
    bool readOnly() const override { return configurator_.readOnly(name_); }
    void writeDefault(const std::string& text) override { configurator_.setDefaultValue(name_, text); }
    void write(const std::string& text) override { configurator_.setValue(name_, text); }
    Component subComponent(const std::string& child) const override {
        return Component(new ConfiguratorComponent(configurator_, name_ + "." + child));
    }
    void setReadHook(const Functor0Ret<std::string>&) override {}
    void removeReadHook() override {}
    void setWriteHook(const Functor1<std::string>&) override {}
    void removeWriteHook() override {}

private:
    Configurator& configurator_;
    std::string name_;
};

} // namespace Fn::Deployment

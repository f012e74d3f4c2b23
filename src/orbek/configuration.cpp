#include "orbek/configuration.h"

#include "fn/deployment/app_file_config_db.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/configurator_machine.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek {

using namespace Fn::Deployment;

namespace {

constexpr const char* libraryVersion = "8.6.0.0";
constexpr bool createFile = false;

void collect(const Component& component, std::vector<Configuration::Setting>& settings) {
    const Property property = component.ownType();
    const Type& type = property.type();
    settings.push_back({component.name(), type.id(), component.readDefault(),
                        property.doc().empty() ? type.doc() : property.doc(), type.hasValue()});
    if (isContainer(type)) {
        for (const Component& element : component.subComponents()) collect(element, settings);
    } else {
        for (const Property& member : membersOf(type))
            collect(component.subComponent(member.name()), settings);
    }
}

} // namespace

Configurator& Configuration::Implementation::configurator() {
    const FNMutexLock lock(configuratorMutex_);
    if (!configurator_) {
        configurator_ = FNCountedPtr<Configurator>(new ConfiguratorMachine);
        configurator_->addRootComponent(resources_.rootComponent());
    }
    return *configurator_;
}

Configuration::Configuration(const std::string& fileName)
    : implementation_(
          new Implementation(FNCountedPtr<AppConfigDB>(new AppFileConfigDB(fileName.c_str(), createFile)))) {}

Configuration::Configuration(std::istream& text)
    : implementation_(new Implementation(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(text)))) {}

Configuration::Configuration(const Configuration&) = default;
Configuration& Configuration::operator=(const Configuration&) = default;
Configuration::~Configuration() = default;

std::string Configuration::version() const {
    return libraryVersion;
}

std::string Configuration::getValue(const std::string& key) const {
    return implementation_->configurator().value(key, false);
}

void Configuration::setValue(const std::string& key, const std::string& value) {
    implementation_->configurator().setValue(key, value);
}

void Configuration::resetToDefault(const std::string& key) {
    Configurator& configurator = implementation_->configurator();
    configurator.setValue(key, configurator.defaultValue(key));
}

std::vector<Configuration::Setting> Configuration::settings() const {
    std::vector<Setting> settings;
    collect(implementation_->resources().rootComponent(), settings);
    return settings;
}

} // namespace Orbek

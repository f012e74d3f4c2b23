#include "orbek/configuration.h"

#include "fn/deployment/app_file_config_db.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/configurator_machine.h"
#include "fn/deployment/value_check.h"
#include "fn/message/dialog.h"
#include "orbek/implementation/configuration_check.h"
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

Configuration::Implementation::Implementation(const FNCountedPtr<AppConfigDB>& db)
    : db_(db), resources_(db), faults_(configurationFaults(db->lines(), resources_.rootComponents())) {
    for (const Fault& fault : faults_)
        FNDialog::warn("AppConfigDB[" + db->name() + ",line:" + std::to_string(fault.line) +
                       "]: " + fault.key + ": " + fault.reason);
}

Configurator& Configuration::Implementation::configurator() {
    const FNMutexLock lock(configuratorMutex_);
    if (!configurator_) {
        configurator_ = FNCountedPtr<Configurator>(new ConfiguratorMachine);
        for (const Component& root : resources_.rootComponents()) configurator_->addRootComponent(root);
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

void Configuration::checkValue(const std::string& key, const std::string& value) const {
    const Type type = implementation_->configurator().property(key).type();
    const std::string fault =
        faultOfValue(type, withVariables(value, implementation_->resources().rootComponent()));
    if (!fault.empty()) FN_THROW(FNEBadArg, key + ": " + fault);
}

void Configuration::flush() {
    implementation_->db().flush();
}

std::vector<Configuration::Setting> Configuration::settings() const {
    std::vector<Setting> settings;
    for (const Component& root : implementation_->resources().rootComponents()) collect(root, settings);
    return settings;
}

const std::vector<Configuration::Fault>& Configuration::faults() const {
    return implementation_->faults();
}

} // namespace Orbek

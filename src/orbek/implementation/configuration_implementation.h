#pragma once

#include "fn/deployment/configurator.h"
#include "orbek/configuration.h"
#include "orbek/implementation/resources.h"

namespace Orbek {

/// What a configuration holds. Not part of the public headers: engines are reached from inside the library
/// only.
class Configuration::Implementation {
public:
    explicit Implementation(const FNCountedPtr<AppConfigDB>& db);

    static CountedPtr<Implementation> implementation(const Configuration& configuration) {
        return configuration.implementation_;
    }

    const Resources& resources() const { return resources_; }
    /// Made at first use.
    Fn::Deployment::Configurator& configurator();
    AppConfigDB& db() { return *db_; }
    const std::vector<Fault>& faults() const { return faults_; }

private:
    FNCountedPtr<AppConfigDB> db_;
    Resources resources_;
    std::vector<Fault> faults_;
    FNMutex configuratorMutex_{FNMutex::recursive};
    FNCountedPtr<Fn::Deployment::Configurator> configurator_;
};

} // namespace Orbek

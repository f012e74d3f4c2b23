#include "feature_finders.h"

#include "eye/boca/mouth_finder.h"
#include "eye/raiz/bridge_finder.h"
#include "fn/deployment/app_config_db.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::Tool {
namespace {

using namespace Fn::Deployment;

/// An engine with its default settings but for the folder of its models.
template <class Engine> FNCountedPtr<Engine> make(const Configuration& configuration, const char* folder) {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("Finder.TemplatePath", installationFolder(configuration) + "/etc/" + folder);
    return FNCountedPtr<Engine>(new Engine(Component(db, Property(type<Engine>(), "Finder", "", "", false))));
}

} // namespace

std::string installationFolder(const Configuration& configuration) {
    return Configuration::Implementation::implementation(configuration)
        ->resources()
        .rootComponent()
        .subComponent("Substitutions")
        .subComponent("INSTALLDIR")
        .read(true);
}

FeatureFinders::FeatureFinders(const Configuration& configuration)
    : mouth(
          MouthFinder(FNCountedPtr<MouthFinder::Body>(make<Eye::Boca::MouthFinder>(configuration, "boca")))),
      bridge(BridgeFinder(
          FNCountedPtr<BridgeFinder::Body>(make<Eye::Raiz::BridgeFinder>(configuration, "raiz")))) {}

} // namespace Orbek::Tool

#include "labelled/finder_access.h"

#include "eye/boca/mouth_finder.h"
#include "eye/cara/face_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/raiz/bridge_finder.h"
#include "fn/deployment/app_config_db.h"

namespace Labelled {
namespace {

using namespace Fn::Deployment;

template <class Handle, class Engine>
Handle make(const std::filesystem::path& folder, const std::string& choice = "") {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("Finder.TemplatePath", folder.string());
    if (!choice.empty()) db->set("Finder.DiscSettings", choice);
    return Handle(FNCountedPtr<typename Handle::Body>(
        new Engine(Component(db, Property(type<Engine>(), "Finder", "", "", false)))));
}

} // namespace

FaceFinder makeFaceFinder(const std::filesystem::path& etc) {
    return make<FaceFinder, Eye::Cara::T8::FaceFinder>(etc / "cara");
}

EyesFinder makeEyesFinder(const std::filesystem::path& etc, const std::string& settings) {
    return make<EyesFinder, Eye::Ojo::T8::EyesFinder>(etc / "ojo", settings);
}

MouthFinder makeMouthFinder(const std::filesystem::path& etc) {
    return make<MouthFinder, Eye::Boca::MouthFinder>(etc / "boca");
}

BridgeFinder makeBridgeFinder(const std::filesystem::path& etc) {
    return make<BridgeFinder, Eye::Raiz::BridgeFinder>(etc / "raiz");
}

} // namespace Labelled

#include "eval/finder_access.h"

#include "fn/deployment/app_config_db.h"

namespace Eval {

using namespace Fn::Deployment;

FaceFinder makeFaceFinder(const std::filesystem::path& etc) {
    using Engine = Eye::Cara::T8::FaceFinder;
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("FaceFinder.TemplatePath", (etc / "cara").string());
    return FaceFinder(FNCountedPtr<FaceFinder::Body>(
        new Engine(Component(db, Property(type<Engine>(), "FaceFinder", "", "", false)))));
}

} // namespace Eval

#include "eye/ojo/feature_search.h"

#include "fn/deployment/composite_values.h"

namespace Eye::Ojo::T8 {

using namespace Fn::Deployment;

Type finderType(const std::string& id, const std::string& doc, const std::string& templatePath,
                const Property& discriminator) {
    return Type(id, doc,
                properties(propertyWithDefault<String>::create(
                               "TemplatePath", templatePath, "Path where the eyes finder template resides."),
                           discriminator),
                "", false);
}

Type discriminatorType(const std::string& id, const std::string& doc,
                       const Implementation::CascadeSettings& defaults) {
    std::list<std::string> steps;
    std::list<Default> imposed{defaultValue<String>::create("File", defaults.file)};
    for (const auto& [step, threshold] : defaults.cascade) {
        steps.push_back(step);
        imposed.push_back(defaultValue<Float>::create("Cascade." + step, threshold));
    }
    imposed.push_back(defaultValue<Container<Float>>::create("Cascade", steps));
    return Type(id, doc, Implementation::CascadeSettings::members(), imposed, "", false);
}

} // namespace Eye::Ojo::T8

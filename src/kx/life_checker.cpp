#include "kx/life_checker.h"

#include "fn/deployment/application_component.h"
#include "fn/deployment/leaf_values.h"

namespace Kx::Implementation {

using namespace Fn::Deployment;

namespace {

constexpr const char *useKey = "UseLifeCheck", *prefix = "KxRecognitionLifeCheck";

/// Leaves a value alone that the database does not have.
template <class Kind, class T> void read(const AppConfigDB& db, const std::string& name, T& value) {
    const std::string key = prefix + name;
    if (db.exists(key)) value = static_cast<T>(Kind::stringToValue(db.get(key)));
}

} // namespace

std::list<Property> lifeCheckSettings() {
    const Cmp::LifeChecker::Settings defaults;
    const auto integer = [](const char* name, int value, const char* doc) {
        return propertyWithDefault<Int>::create(prefix + std::string(name), value, doc);
    };
    const auto real = [](const char* name, double value, const char* doc) {
        return propertyWithDefault<Float>::create(prefix + std::string(name), static_cast<float>(value), doc);
    };
    return {
        integer("Width", defaults.width, "Width of the standard face of the life check, in pixels."),
        integer("Height", defaults.height, "Height of the standard face of the life check, in pixels."),
        real("RelEyeDist", defaults.relEyeDist, "Eye distance in the standard face, in its widths."),
        real("RelUp", defaults.relUp,
             "Position of the eyes in the standard face from above, in its heights."),
        integer(
            "TemplateWidth", defaults.templateWidth,
            "Width of the window that is compared, in pixels. Not greater than that of the standard face."),
        integer(
            "TemplateHeight", defaults.templateHeight,
            "Height of the window that is compared, in pixels. Not greater than that of the standard face."),
        integer("Threshold", defaults.threshold,
                "Threshold (integer value) to be used for the life check discriminator (default: 50)."),
        integer("LossThreshold", defaults.lossThreshold,
                "Differing bits of the 8 of a pixel that do not count yet."),
        real("TranslationThreshold", defaults.translationThreshold,
             "Largest movement of a face between two images that are compared, in eye distances."),
        real("ScaleThreshold", defaults.scaleThreshold,
             "Largest ratio of the eye distances in two images that are compared."),
    };
}

FNCountedPtr<Cmp::LifeChecker> createLifeChecker(const AppConfigDB& db) {
    Cmp::LifeChecker::Settings settings;
    read<Int>(db, "Width", settings.width);
    read<Int>(db, "Height", settings.height);
    read<Float>(db, "RelEyeDist", settings.relEyeDist);
    read<Float>(db, "RelUp", settings.relUp);
    read<Int>(db, "TemplateWidth", settings.templateWidth);
    read<Int>(db, "TemplateHeight", settings.templateHeight);
    read<Int>(db, "Threshold", settings.threshold);
    read<Int>(db, "LossThreshold", settings.lossThreshold);
    read<Float>(db, "TranslationThreshold", settings.translationThreshold);
    read<Float>(db, "ScaleThreshold", settings.scaleThreshold);
    return FNCountedPtr<Cmp::LifeChecker>(new Cmp::LifeChecker(settings));
}

Property useLifeCheck(const std::string& doc) {
    return propertyWithDefault<Bool>::create(useKey, false, doc);
}

FNCountedPtr<Cmp::LifeChecker> configuredLifeChecker(const Component& operation) {
    if (!Value<Bool>::get(operation.subComponent(useKey))) return {};
    return createLifeChecker(*dynamic_cast<const ApplicationComponent&>(operation.body()).db());
}

bool LifeChecker::isAlive() {
    if (!checker_) return false;
    while (!alive_ && faces_.size() > 1) {
        alive_ = differsFromFirst(*std::next(faces_.begin()));
        faces_.erase(std::next(faces_.begin()));
    }
    return alive_;
}

bool LifeChecker::differsFromFirst(const Cmp::Face& face) const {
    const Cmp::Face& first = faces_.front();
    const FacialFeatureLocation &left = face.leftEyeLocation(), &right = face.rightEyeLocation();
    const FacialFeatureLocation &firstLeft = first.leftEyeLocation(), &firstRight = first.rightEyeLocation();
    return checker_->test(face.image().toMono8(), left, right, first.image().toMono8(), firstLeft,
                          firstRight);
}

} // namespace Kx::Implementation

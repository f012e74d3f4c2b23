#include "orbek/eyes_finder.h"

#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::Eyes {

class Finder::Implementation {
public:
    explicit Implementation(const Configuration& configuration) : configuration_(configuration) { engine(); }

    ::EyesFinder engine() const {
        return Configuration::Implementation::implementation(configuration_)->resources().eyesFinder();
    }

private:
    Configuration configuration_;
};

Finder::Finder(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Finder::Finder(const Finder&) = default;
Finder& Finder::operator=(const Finder&) = default;
Finder::~Finder() = default;

std::list<Location> Finder::find(const Image& image, const Face::Location& face) const {
    ::FaceFinder::Location location = adapt(face);
    location.confidence = 0;
    bool foundFirst = false, foundSecond = false;
    FacialFeatureLocation first, second;
    implementation_->engine().find(location, adapt(image), foundFirst, first, foundSecond, second);
    std::list<Location> eyes;
    if (foundFirst && foundSecond) eyes.push_back(adapt(first, second));
    return eyes;
}

} // namespace Orbek::Eyes

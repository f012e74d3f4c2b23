#include "orbek/face_finder.h"

#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::Face {

class Finder::Implementation {
public:
    explicit Implementation(const Configuration& configuration) : configuration_(configuration) { engine(); }

    ::FaceFinder engine() const {
        return Configuration::Implementation::implementation(configuration_)->resources().faceFinder();
    }

private:
    Configuration configuration_;
};

Finder::Finder(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Finder::Finder(const Finder&) = default;
Finder& Finder::operator=(const Finder&) = default;
Finder::~Finder() = default;

std::list<Location> Finder::find(const Image& image, float minRelEyeDist, float maxRelEyeDist, int x0, int y0,
                                 int x1, int y1) const {
    std::list<::FaceFinder::Location> found;
    implementation_->engine().find(adapt(image), found, minRelEyeDist, maxRelEyeDist,
                                   adapt(Box(x0, y0, x1, y1)));
    std::list<Location> faces;
    for (const ::FaceFinder::Location& location : found) faces.push_back(adapt(location));
    return faces;
}

} // namespace Orbek::Face

#include "orbek/full_frontal_creator.h"

#include "kx/full_frontal_creator.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::ISO_19794_5::FullFrontal {

class Creator::Implementation {
public:
    explicit Implementation(const Configuration& configuration)
        : engine(Configuration::Implementation::implementation(configuration)
                     ->resources()
                     .rootComponent()
                     .subComponent("CropFullFrontal")) {}

    const Kx::FullFrontal::Creator engine;
};

Creator::Creator(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Creator::Creator(const Creator&) = default;
Creator& Creator::operator=(const Creator&) = default;
Creator::~Creator() = default;

std::pair<Image, Eyes::Location>
Creator::extract(const std::pair<Image, Eyes::Location>& imageWithEyes) const {
    return adapt(implementation_->engine.extract(adapt(imageWithEyes)));
}

std::pair<Image, Eyes::Location> Creator::extract(const std::pair<Image, Eyes::Location>& imageWithEyes,
                                                  float lengthRatio, float position) const {
    return adapt(implementation_->engine.extract(adapt(imageWithEyes), lengthRatio, position));
}

} // namespace Orbek::ISO_19794_5::FullFrontal

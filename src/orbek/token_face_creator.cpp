#include "orbek/token_face_creator.h"

#include "kx/token_face.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::ISO_19794_5::TokenFace {

class Creator::Implementation {
public:
    explicit Implementation(const Configuration& configuration)
        : settings_(Configuration::Implementation::implementation(configuration)
                        ->resources()
                        .rootComponent()
                        .subComponent("CropTokenImage")) {}

    /// @param produce one of the functions of Kx::TokenFace
    template <class Produce>
    std::pair<Image, Eyes::Location> extract(const std::pair<Image, Eyes::Location>& imageWithEyes,
                                             Produce produce) const {
        return adapt(produce(adapt(imageWithEyes), settings_.ratio, settings_.color));
    }

private:
    const Kx::TokenFace::CropTokenImage settings_;
};

Creator::Creator(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Creator::Creator(const Creator&) = default;
Creator& Creator::operator=(const Creator&) = default;
Creator::~Creator() = default;

std::pair<Image, Eyes::Location>
Creator::extract(const std::pair<Image, Eyes::Location>& imageWithEyes) const {
    return implementation_->extract(
        imageWithEyes, [](const auto&... arguments) { return Kx::TokenFace::produceImage(arguments...); });
}

std::pair<Image, Eyes::Location>
Creator::extractMinimal(const std::pair<Image, Eyes::Location>& imageWithEyes) const {
    return implementation_->extract(imageWithEyes, [](const auto&... arguments) {
        return Kx::TokenFace::produceMinimalImage(arguments...);
    });
}

} // namespace Orbek::ISO_19794_5::TokenFace

#pragma once

#include "orbek/configuration.h"
#include "orbek/eyes_finder.h"
#include "orbek/image.h"

#include <utility>

namespace Orbek::ISO_19794_5::TokenFace {

/// Cuts a portrait to a token face image of ISO/IEC 19794-5: 3 wide to 4 high, with the eyes level, a quarter
/// of the width apart. What lies outside of the image gets the colour below ORBEK.CropTokenImage.
///
///     const Orbek::ISO_19794_5::TokenFace::Creator creator(configuration);
///     const auto [token, eyes] = creator.extractMinimal({image, eyesFinder.find(image, face).front()});
///
/// An image whose eyes coincide is returned as it is, with the eyes at the places of a token image. Copies
/// share everything; any number of threads may use one creator.
class [[gnu::visibility("default")]] Creator {
public:
    /// @throws std::exception that names the setting that is wrong
    explicit Creator(const Configuration& configuration);
    Creator(const Creator&);
    Creator& operator=(const Creator&);
    ~Creator();

    /// The picture at the scale of the image, with an empty name, and the eyes in it: 240 by 320 pixels for
    /// eyes that are 60 pixels apart.
    /// @throws std::exception for too much padding, and for eyes that are no places in an image
    std::pair<Image, Eyes::Location> extract(const std::pair<Image, Eyes::Location>& imageWithEyes) const;
    /// The same scaled to 240 by 320 pixels, the least that the standard allows.
    std::pair<Image, Eyes::Location> extractMinimal(const std::pair<Image, Eyes::Location>& imageWithEyes)
        const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::ISO_19794_5::TokenFace

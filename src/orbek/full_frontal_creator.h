#pragma once

#include "orbek/configuration.h"
#include "orbek/eyes_finder.h"
#include "orbek/image.h"

#include <utility>

namespace Orbek::ISO_19794_5::FullFrontal {

/// Cuts a portrait to a full frontal image of ISO/IEC 19794-5: upright, with head and eyes where the standard
/// has them. Settings, among them the size of the picture, lie below ORBEK.CropFullFrontal.
///
///     const Orbek::ISO_19794_5::FullFrontal::Creator creator(configuration);
///     const auto [portrait, eyes] = creator.extract({image, eyesFinder.find(image, face).front()});
///
/// Copies share everything; any number of threads may use one creator.
class [[gnu::visibility("default")]] Creator {
public:
    /// @throws std::exception that names the setting that is wrong
    explicit Creator(const Configuration& configuration);
    Creator(const Creator&);
    Creator& operator=(const Creator&);
    ~Creator();

    /// The picture, with an empty name, and the eyes in it. @throws std::exception for coinciding eyes or
    /// eyes of equal x, a head that leans too far, and too much padding
    std::pair<Image, Eyes::Location> extract(const std::pair<Image, Eyes::Location>& imageWithEyes) const;
    /// @param lengthRatio of the head to the picture's height, up to 0.8
    /// @param position of the eyes in heights of the picture above its lower edge, up to 0.7
    /// @throws std::exception, too, for greater ratios unless the configuration allows them
    std::pair<Image, Eyes::Location> extract(const std::pair<Image, Eyes::Location>& imageWithEyes,
                                             float lengthRatio, float position) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::ISO_19794_5::FullFrontal

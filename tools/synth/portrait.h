#pragma once

#include "synth/person.h"

namespace Synth {

/// A picture of somebody, with the landmarks that it was drawn from.
struct Portrait {
    FNImage<Fn::Bgra32> image;
    Points landmarks; ///< 68, pixels of the image
};

/// Draws head and shoulders before a plain background, the eyes a quarter of the width apart. The face comes
/// from the model; hair, ears, neck and clothes, which it does not hold, are painted.
/// @param width pixels; the height is 4/3 of it @throws FNEBadArg for a width below 90 or above 3000
Portrait drawPortrait(const PortraitModel& model, const Person& person, const View& view,
                      std::uint32_t width);

} // namespace Synth

#pragma once

#include "eye/face_finder.h"

#include <optional>
#include <string>
#include <vector>

/// Face detectors of other libraries behind this library's interface, to compare with. They are in the build
/// only with the option ORBEK_YARDSTICKS, and in nothing that is installed.

namespace Eval {

/// Their names; empty without the option.
std::vector<std::string> yardstickNames();

/// "haar": OpenCV's cascade haarcascade_frontalface_default.xml (Viola and Jones 2001), one neighbour needed,
/// with the weight of its last stage as confidence. "dlib": dlib's frontal detector (Dalal and Triggs 2005,
/// Felzenszwalb 2010). Pictures are scaled so that the smallest face asked for is the smallest that the
/// detector can find. Eye positions are the mean place in the detector's box.
/// @return nothing for a name that is none of yardstickNames()
std::optional<FaceFinder> makeYardstick(const std::string& name);

} // namespace Eval

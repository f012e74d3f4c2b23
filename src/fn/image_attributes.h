#pragma once

#include "fn/geometry.h"
#include "fn/optional.h"
#include "fn/time_stamp.h"

#include <map>
#include <string>

/// Texts that travel with an image, by key.
using FNImageAttributes = std::map<std::string, std::string>;

namespace Fn {

/// Where the eyes are, in pixels; left is the one at the smaller x.
struct EyePositions {
    FNPos left;
    FNPos right;
    friend bool operator==(const EyePositions&, const EyePositions&) = default;
};

/// Key "SRCNAME": the name of the image's source. Adding replaces the former value; so do the functions
/// below.
void addImageSrcNameAttribute(FNImageAttributes& attributes, const std::string& name);
Optional<std::string> getImageSrcNameAttribute(const FNImageAttributes& attributes);

/// Key "EYEPOS": four decimal numbers with one blank between them: left x, left y, right x, right y.
void addEyePosAttributes(FNImageAttributes& attributes, FNPos left, FNPos right);
/// @throws FNEBadFormat if the value is not four numbers.
Optional<EyePositions> getEyePosAttributes(const FNImageAttributes& attributes);

/// Key "CaptureTime": text of a time stamp.
void addImageCaptureTime(FNImageAttributes& attributes, const TimeStamp& time);
/// @throws FNEBadFormat if the value is not a time stamp.
Optional<TimeStamp> getImageCaptureTime(const FNImageAttributes& attributes);

/// Key "ExposureTime": a decimal number of microseconds.
void addImageExposureTime(FNImageAttributes& attributes, unsigned int microseconds);
/// @throws FNEBadFormat if the value is no such number.
Optional<unsigned int> getImageExposureTime(const FNImageAttributes& attributes);

} // namespace Fn

#pragma once

#include "orbek/enrollment.h"
#include "picture_lines.h"

#include <optional>

namespace Orbek::Tool {

/// A record of the person that pictures show; none if too few of them are usable.
/// @param tell of each picture that could be read, see PictureLines; prints it otherwise
std::optional<FIR> enrolPictures(const Enrollment::Processor& processor,
                                 const std::vector<std::filesystem::path>& files, Output& output,
                                 const TellPicture& tell = {});

} // namespace Orbek::Tool

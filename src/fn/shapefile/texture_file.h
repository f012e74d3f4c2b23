#pragma once

#include "fn/optional.h"

#include <string>

/// Pictures that belong to scan files.

namespace Fn {

/// A picture with the name of the scan but for the ending: bmp, png, ppm, pgm, jpg, jpeg or tif, in lower or
/// upper case; the first of these that is there.
Optional<std::string> textureBeside(const std::string& scanName);
/// The same for one ending in lower case, without the dot.
Optional<std::string> textureBeside(const std::string& scanName, const std::string& ending);

/// A file that a scan file refers to: relative to the scan's folder and below it. A name that leads elsewhere
/// stands for a file of that name in the scan's folder, since scans are moved between machines. Only plain
/// files count.
Optional<std::string> fileReferredTo(const std::string& scanName, const std::string& reference);

} // namespace Fn

#pragma once

#include "fn/imagefile/image_limits.h"
#include "fn/rmem.h"

#include <string>

namespace Fn {

/// The whole content of a gzip file (RFC 1952). @throws FNEIOError if it cannot be read or is damaged;
/// FNEBadFormat if it exceeds limits.maxBytes.
FNRMem<unsigned char> gunzip(const std::string& fileName, const ImageLimits& limits = {});

} // namespace Fn

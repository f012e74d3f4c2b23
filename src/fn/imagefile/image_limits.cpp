#include "fn/imagefile/image_limits.h"

#include "fn/exception.h"

namespace Fn {

void ImageLimits::check(std::uint64_t width, std::uint64_t height, std::uint64_t bytesPerPixel,
                        const char* reader) const {
    const auto refuse = [&](const char* what, std::uint64_t limit) {
        FN_THROW(FNEBadFormat, std::string(reader) + ": image of " + std::to_string(width) + " x " +
                                   std::to_string(height) + " pixels exceeds the limit of " +
                                   std::to_string(limit) + " " + what);
    };
    if (width > maxWidth) refuse("columns", maxWidth);
    if (height > maxHeight) refuse("rows", maxHeight);
    // Both factors have 32 bits from here on.
    if (width * height > maxPixels) refuse("pixels", maxPixels);
    if (bytesPerPixel != 0 && width * height > maxBytes / bytesPerPixel)
        refuse("bytes for decoding", maxBytes);
}

} // namespace Fn

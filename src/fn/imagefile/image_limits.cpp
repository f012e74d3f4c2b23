#include "fn/imagefile/image_limits.h"

#include "fn/exception.h"

#include <algorithm>
#include <mutex>

namespace Fn {

struct ImageLimits::Defaults {
    std::mutex mutex; ///< guards the limits
    ImageLimits limits{BuiltIn()};
};

ImageLimits::Defaults& ImageLimits::defaults() {
    static Defaults defaults;
    return defaults;
}

ImageLimits::ImageLimits() {
    Defaults& shared = defaults();
    const std::lock_guard lock(shared.mutex);
    *this = shared.limits;
}

ImageLimits ImageLimits::withRareVariants() {
    ImageLimits limits;
    limits.rareVariants = true;
    return limits;
}

void ImageLimits::setDefaults(const ImageLimits& limits) {
    Defaults& shared = defaults();
    const std::lock_guard lock(shared.mutex);
    shared.limits = limits;
    shared.limits.rareVariants = false;
}

ImageLimits ImageLimits::beside(std::uint64_t bytes) const {
    ImageLimits left = *this;
    left.maxBytes -= std::min(bytes, maxBytes);
    return left;
}

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

#include "orbek/implementation/image_fn.h"

#include <cstddef>

namespace Orbek {

static_assert(sizeof(Rgb) == sizeof(Fn::Bgra32) && offsetof(Rgb, blue) == offsetof(Fn::Bgra32, b) &&
              offsetof(Rgb, green) == offsetof(Fn::Bgra32, g) &&
              offsetof(Rgb, red) == offsetof(Fn::Bgra32, r) &&
              offsetof(Rgb, alpha) == offsetof(Fn::Bgra32, a));

const unsigned char* ImageFN::grayScaleRepresentation() const {
    const FNMutexLock lock(mutex_);
    if (!gray_) gray_ = reference_.toMono8();
    return gray_->data();
}

const Rgb* ImageFN::colorRepresentation() const {
    const FNMutexLock lock(mutex_);
    if (!color_) color_ = reference_.toBgra32();
    return reinterpret_cast<const Rgb*>(color_->data());
}

} // namespace Orbek

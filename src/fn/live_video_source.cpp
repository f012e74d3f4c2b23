#include "fn/live_video_source.h"

namespace Fn {

void LiveVideoSource::setExposure(unsigned int) {
    FN_THROW(FNEBadFunCall, "The exposure of this device cannot be set");
}

void LiveVideoSource::setSaturation(unsigned int) {
    FN_THROW(FNEBadFunCall, "The saturation of this device cannot be set");
}

void LiveVideoSource::setHue(unsigned int) {
    FN_THROW(FNEBadFunCall, "The hue of this device cannot be set");
}

} // namespace Fn

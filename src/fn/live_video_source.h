#pragma once

#include "fn/video_source.h"

namespace Fn {

/// A camera, or what behaves like one: delivers the image of the moment, and has settings. The units of the
/// settings are the device's own; one that a device does not have is 0 with the range 0 to 0.
class LiveVideoSource : public VideoSource::Body {
public:
    /// Least and greatest value of a setting.
    struct Range {
        unsigned int lower = 0;
        unsigned int upper = 0;
        bool operator==(const Range&) const = default;
    };

    FNImageReference get() override { return grab(); }
    std::string name() override { return id(); }
    /// The image of the moment; waits for it.
    virtual FNImageReference grab() = 0;
    /// The name under which the device is known.
    virtual std::string id() = 0;

    virtual unsigned int gain() = 0;
    virtual Range gainRange() = 0;
    virtual void setGain(unsigned int value) = 0;
    virtual unsigned int contrast() = 0;
    virtual Range contrastRange() = 0;
    virtual void setContrast(unsigned int value) = 0;

    // Settings that a device may lack: setting one of these throws FNEBadFunCall then.
    virtual unsigned int exposure() { return 0; }
    virtual Range exposureRange() { return {}; }
    virtual void setExposure(unsigned int value);
    virtual unsigned int saturation() { return 0; }
    virtual Range saturationRange() { return {}; }
    virtual void setSaturation(unsigned int value);
    virtual unsigned int hue() { return 0; }
    virtual Range hueRange() { return {}; }
    virtual void setHue(unsigned int value);

    /// Size of the images in pixels.
    virtual unsigned int w() = 0;
    virtual unsigned int h() = 0;

    /// Show the device's own dialogs, and tell how that ended; 0 where there is none.
    virtual int configure() { return 0; }
    virtual int videoFormat() { return 0; }
    /// The format that is set, in the device's own form; empty where there is none.
    virtual Package getVideoFormat() { return {}; }
    virtual void setVideoFormat(const Package&) {}
};

} // namespace Fn

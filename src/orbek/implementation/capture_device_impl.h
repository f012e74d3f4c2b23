#pragma once

#include "fg/dll_frame_grabber_factory.h"
#include "orbek/capture_device.h"

namespace Orbek {

/// A device of the configuration. Operations of a source that is missing throw FNEBadFunCall.
class CaptureDeviceImpl final : public CaptureDeviceBody {
public:
    /// @param key of the device in the configuration, for messages
    /// @param grabber either handle may be null
    /// @param reason why they are, for messages; empty if that is not known
    /// @param controlled whether the configuration has a camera controller for the device. There is none in
    /// the library yet: control() throws FNEBadFunCall then.
    CaptureDeviceImpl(const std::string& key, const FG::GrabberPair& grabber, const std::string& reason,
                      bool controlled)
        : key_(key), source_(grabber.first), stillSource_(grabber.second), reason_(reason),
          controlled_(controlled) {}

    Image capture() override;
    Image release() override;
    unsigned int gain() override { return source().gain(); }
    unsigned int exposure() override { return source().exposure(); }
    void control(const Image& image, const std::list<Face::Location>& faces) override;
    int configure() override { return source().configure(); }
    int videoFormatDialog() override { return source().videoFormat(); }
    VideoFormat getVideoFormat() override;
    void setVideoFormat(const VideoFormat& format) override;

private:
    Fn::LiveVideoSource& source() const;

    std::string key_;
    FNCountedPtr<Fn::LiveVideoSource> source_;
    FNCountedPtr<FG::StillImageSource> stillSource_;
    std::string reason_;
    bool controlled_;
};

} // namespace Orbek

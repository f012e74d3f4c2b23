#include "orbek/implementation/capture_device_impl.h"

#include "orbek/implementation/adapt.h"
#include "orbek/implementation/video_format_body.h"

namespace Orbek {

Fn::LiveVideoSource& CaptureDeviceImpl::source() const {
    if (!source_)
        FN_THROW(FNEBadFunCall, "The capture device " + key_ + " has no source of images" +
                                    (reason_.empty() ? "" : ": " + reason_));
    return *source_;
}

Image CaptureDeviceImpl::capture() {
    return adapt(source().grab(), source().name());
}

Image CaptureDeviceImpl::release() {
    if (!stillSource_)
        FN_THROW(FNEBadFunCall, "The capture device " + key_ + " takes no single pictures" +
                                    (reason_.empty() ? "" : ": " + reason_));
    const FNRMem<unsigned char> bytes = stillSource_->release();
    return adapt(stillSource_->extractImage(bytes, adapt(ImageIO::noFeedback())), stillSource_->name());
}

void CaptureDeviceImpl::control(const Image&, const std::list<Face::Location>&) {
    if (controlled_) FN_THROW(FNEBadFunCall, "The camera controller of " + key_ + " is not available");
}

VideoFormat CaptureDeviceImpl::getVideoFormat() {
    return VideoFormat(CountedPtr<VideoFormat::Body>(new VideoFormat::Body(source().getVideoFormat())));
}

void CaptureDeviceImpl::setVideoFormat(const VideoFormat& format) {
    source().setVideoFormat(format.body()->package());
}

} // namespace Orbek

#include "orbek/video_format.h"

#include "orbek/implementation/video_format_body.h"

namespace Orbek {

VideoFormat::VideoFormat(std::istream& stream) : body_(new Body(Fn::Package(stream))) {}
VideoFormat::VideoFormat(const CountedPtr<Body>& body) : body_(body) {}
VideoFormat::VideoFormat(const VideoFormat&) = default;
VideoFormat& VideoFormat::operator=(const VideoFormat&) = default;
VideoFormat::~VideoFormat() = default;

void VideoFormat::write(std::ostream& stream) const {
    body_->package().write(stream);
}

} // namespace Orbek

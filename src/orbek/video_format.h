#pragma once

#include "orbek/counted_ptr.h"

#include <iosfwd>

namespace Orbek {

/// The video format of a capture device: an application can store it, and give it back to the device later.
class [[gnu::visibility("default")]] VideoFormat {
public:
    /// Reads what write() has written. @throws std::exception if the stream ends too early or is damaged
    explicit VideoFormat(std::istream & stream);
    VideoFormat(const VideoFormat&);
    VideoFormat& operator=(const VideoFormat&);
    ~VideoFormat();

    void write(std::ostream & stream) const;

    class [[gnu::visibility("hidden")]] Body;
    /// For the capture device.
    [[gnu::visibility("hidden")]] explicit VideoFormat(const CountedPtr<Body>& body);
    [[gnu::visibility("hidden")]] const CountedPtr<Body>& body() const {
        return body_;
    }

private:
    CountedPtr<Body> body_;
};

} // namespace Orbek

#pragma once

#include "fn/image_reference.h"

#include <string>

namespace Fn {

/// A counted handle of something that delivers images, one after another.
class VideoSource {
public:
    class Body {
    public:
        virtual ~Body() = default;
        /// The next image; waits for it if the source has a pace of its own.
        virtual FNImageReference get() = 0;
        virtual std::string name() = 0;
    };

    explicit VideoSource(const FNCountedPtr<Body>& body) : body_(body) {}

    FNImageReference get() const { return body_->get(); }
    std::string name() const { return body_->name(); }
    const FNCountedPtr<Body>& body() const { return body_; }

private:
    FNCountedPtr<Body> body_;
};

} // namespace Fn

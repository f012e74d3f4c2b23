#pragma once

#include "fn/package.h"
#include "orbek/video_format.h"

namespace Orbek {

class VideoFormat::Body {
public:
    explicit Body(const Fn::Package& package) : package_(package) {}
    const Fn::Package& package() const { return package_; }

private:
    Fn::Package package_;
};

} // namespace Orbek

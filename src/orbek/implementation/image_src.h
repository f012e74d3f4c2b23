#pragma once

#include "fn/callback/functor.h"
#include "fn/video_source.h"
#include "orbek/implementation/adapt.h"

namespace Orbek {

/// What delivers an application's images, as the engines see it.
class ImageSrc final : public Fn::VideoSource::Body {
public:
    /// @param capture gives the next image
    explicit ImageSrc(const Fn::Functor0Ret<Image>& capture) : capture_(capture) {}

    FNImageReference get() override { return adapt(capture_()); }
    std::string name() override { return "ImageSrc"; }

private:
    Fn::Functor0Ret<Image> capture_;
};

} // namespace Orbek

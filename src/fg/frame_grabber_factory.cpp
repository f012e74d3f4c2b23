#include "fg/frame_grabber_factory.h"

#include "fg/multi_file.h"
#include "fn/message/dialog.h"

#include <algorithm>

namespace FG {

using Fn::Deployment::Component;

namespace {

GrabberPair makeMultiFile(const Component& settings, const std::string& name) {
    MultiFile* const grabber = new MultiFile(settings, name);
    const FNCountedPtr<Fn::LiveVideoSource> source(grabber);
    return {source, grabber->stillImageSource()};
}

} // namespace

GrabberPair FrameGrabberFactory<FrameGrabberFullSet>::create2(const Component& device,
                                                              const std::string& name,
                                                              const DllFrameGrabberFactoryCache&,
                                                              std::string* reason) {
    const std::string kind = device.read(true);
    if (!std::ranges::any_of(frameGrabberKinds, [&](const FrameGrabberKind& k) { return k.name == kind; }))
        FN_THROW(FNEBadArg, "could not create framegrabber for property " + kind);
    try {
        if (kind == "ImageFiles") return makeMultiFile(device.subComponent(kind), name);
    } catch (const std::exception& e) {
        if (reason) *reason = e.what();
        FNDialog::error("Could not initialize video capture device " + name + ": " + e.what());
    }
    return {};
}

} // namespace FG

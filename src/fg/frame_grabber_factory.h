#pragma once

#include "fg/capture_types.h"
#include "fg/dll_frame_grabber_factory.h"

namespace FG {

/// Makes the device that an entry of the configuration describes.
template <class Set> class FrameGrabberFactory;

template <> class FrameGrabberFactory<FrameGrabberFullSet> {
public:
    /// A device that cannot be made is reported to FNDialog, and gives null handles; so, without a report,
    /// does a kind whose driver is not part of this library.
    /// @param device of type FrameGrabberFactoryDef
    /// @param plugins for kinds that live in shared libraries
    /// @param reason if not null, tells afterwards why the device could not be made
    /// @throws FNEBadArg for a kind that is none
    static GrabberPair create2(const Fn::Deployment::Component& device, const std::string& name,
                               const DllFrameGrabberFactoryCache& plugins, std::string* reason = nullptr);
};

} // namespace FG

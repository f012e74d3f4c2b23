#pragma once

#include "fg/still_image_source.h"
#include "fn/deployment/component.h"
#include "fn/dll.h"
#include "fn/thread/mutex.h"

#include <map>
#include <utility>

/// Grabbers in shared libraries, for cameras that this library knows nothing of.
///
/// A plug-in is a shared library that is built with these headers and exports, with C linkage, "createFG" (of
/// type FG::CreateFG) and, if its device takes single pictures too, "createFG2" (of type FG::CreateFG2):
///
///     extern "C" __attribute__((visibility("default")))
///     FNCountedPtr<Fn::LiveVideoSource> createFG(Fn::Deployment::Component settings, std::string name) {
///         return FNCountedPtr<Fn::LiveVideoSource>(new MyCamera(settings, name));
///     }

namespace FG {

/// A device in both of its roles; handles are null for a device that could not be made.
using GrabberPair = std::pair<FNCountedPtr<Fn::LiveVideoSource>, FNCountedPtr<StillImageSource>>;

using CreateFG = FNCountedPtr<Fn::LiveVideoSource>(Fn::Deployment::Component settings, std::string name);
using CreateFG2 = GrabberPair(Fn::Deployment::Component settings, std::string name);

/// One plug-in. The library stays loaded as long as this, a grabber or an image from it is in use. What its
/// functions throw arrives as an exception of this library.
class DllFrameGrabberFactory {
public:
    /// @throws FNESysError if the library cannot be loaded or has no "createFG"
    explicit DllFrameGrabberFactory(const std::string& path);

    FNCountedPtr<Fn::LiveVideoSource> createFG(const Fn::Deployment::Component& settings,
                                               const std::string& name) const;
    /// Either handle may be null. @throws FNESysError if the library has no "createFG2"
    GrabberPair createFG2(const Fn::Deployment::Component& settings, const std::string& name) const;
    /// As createFG2(); the single pictures of a library that knows only "createFG" are those of its video.
    GrabberPair createBoth(const Fn::Deployment::Component& settings, const std::string& name) const;

private:
    Fn::Dll dll_;
    CreateFG* createFG_;
    mutable CreateFG2* createFG2_ = nullptr; ///< from the first use on
};

/// The plug-ins of a configuration by kind, each loaded at the first request. May be used by several threads.
class DllFrameGrabberFactoryCache {
public:
    /// @param component of type DllFrameGrabberFactoryCacheDef
    explicit DllFrameGrabberFactoryCache(const Fn::Deployment::Component& component)
        : component_(component) {}

    /// The library that is configured for the kind; empty if none is.
    std::string path(const std::string& kind) const;
    /// @throws FNEBadArg if no path is configured for the kind; FNESysError if the library cannot be used
    DllFrameGrabberFactory get(const std::string& kind);

private:
    Fn::Deployment::Component component_;
    FNMutex mutex_{FNMutex::recursive}; ///< guards the map
    std::map<std::string, DllFrameGrabberFactory> factories_;
};

} // namespace FG

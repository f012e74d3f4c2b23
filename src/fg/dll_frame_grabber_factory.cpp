#include "fg/dll_frame_grabber_factory.h"

#include "fg/capture_types.h"
#include "fg/dll_objects.h"

namespace FG {

using Fn::Deployment::Component;

DllFrameGrabberFactory::DllFrameGrabberFactory(const std::string& path)
    : dll_(path), createFG_(dll_.function<CreateFG>("createFG")) {}

FNCountedPtr<Fn::LiveVideoSource> DllFrameGrabberFactory::createFG(const Component& settings,
                                                                   const std::string& name) const {
    return keepLoaded(dll_, callLibrary([&] { return createFG_(settings, name); }));
}

GrabberPair DllFrameGrabberFactory::createFG2(const Component& settings, const std::string& name) const {
    if (!createFG2_) createFG2_ = dll_.function<CreateFG2>("createFG2");
    const GrabberPair made = callLibrary([&] { return createFG2_(settings, name); });
    return {keepLoaded(dll_, made.first), keepLoaded(dll_, made.second)};
}

GrabberPair DllFrameGrabberFactory::createBoth(const Component& settings, const std::string& name) const {
    if (dll_.exports("createFG2")) return createFG2(settings, name);
    const FNCountedPtr<Fn::LiveVideoSource> source = createFG(settings, name);
    if (!source) return {};
    return {source, FNCountedPtr<StillImageSource>(new StillImageSourceEmulator(source))};
}

std::string DllFrameGrabberFactoryCache::path(const std::string& kind) const {
    const Component paths = component_.subComponent("DllPaths");
    using Fn::Deployment::String;
    if (!Fn::Deployment::listsElement(paths, kind)) return {};
    return Fn::Deployment::Value<String>::get(paths.subComponent(kind));
}

DllFrameGrabberFactory DllFrameGrabberFactoryCache::get(const std::string& kind) {
    const FNMutexLock lock(mutex_);
    const auto known = factories_.find(kind);
    if (known != factories_.end()) return known->second;
    if (const std::string file = path(kind); !file.empty())
        return factories_.emplace(kind, DllFrameGrabberFactory(file)).first->second;
    std::string names;
    for (const Component& entry : component_.subComponent("DllPaths").subComponents())
        if (const std::string name = entry.ownType().name(); !path(name).empty())
            names += (names.empty() ? "" : ", ") + name;
    FN_THROW(FNEBadArg, "DllFrameGrabberFactoryCache: could not locate Path for Dlls of type " + kind +
                            ". Configured Types are: [" + names + "]");
}

} // namespace FG

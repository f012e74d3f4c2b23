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

bool DllFrameGrabberFactoryCache::has(const std::string& kind) const {
    return Fn::Deployment::listsElement(component_.subComponent("DllPaths"), kind);
}

DllFrameGrabberFactory DllFrameGrabberFactoryCache::get(const std::string& kind) {
    const FNMutexLock lock(mutex_);
    const auto known = factories_.find(kind);
    if (known != factories_.end()) return known->second;
    std::string names;
    for (const Component& path : component_.subComponent("DllPaths").subComponents()) {
        const std::string name = path.ownType().name();
        if (name == kind) {
            using Fn::Deployment::String;
            const std::string file = Fn::Deployment::Value<String>::get(path);
            return factories_.emplace(kind, DllFrameGrabberFactory(file)).first->second;
        }
        names += (names.empty() ? "" : ", ") + name;
    }
    FN_THROW(FNEBadArg, "DllFrameGrabberFactoryCache: could not locate Path for Dlls of type " + kind +
                            ". Configured Types are: [" + names + "]");
}

} // namespace FG

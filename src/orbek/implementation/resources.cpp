#include "orbek/implementation/resources.h"

#include "eye/cara/face_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "fn/message/translator.h"
#include "orbek/implementation/orbek_properties.h"

namespace Orbek {

using Fn::Deployment::Component;
using Fn::Deployment::Property;

Resources::Resources(const FNCountedPtr<AppConfigDB>& configDb)
    : configDb_(configDb),
      rootComponent_(configDb, Property(Fn::Deployment::type<ORBEKProperties>(), "ORBEK",
                                        Fn::Deployment::type<ORBEKProperties>().defaultValue(), "", false)) {}

Component Resources::rootComponent() const {
    const FNMutexLock lock(mutex_);
    return rootComponent_;
}

FaceFinder Resources::faceFinder() const {
    return FaceFinder(faceFinder_.get(mutex_, FNTrans("Face finder"), [&] {
        return new Eye::Cara::T8::FaceFinder(rootComponent_.subComponent("FaceFinder"));
    }));
}

EyesFinder Resources::eyesFinder() const {
    return EyesFinder(eyesFinder_.get(mutex_, FNTrans("Eyes finder"), [&] {
        return new Eye::Ojo::T8::EyesFinder(rootComponent_.subComponent("EyesFinder"));
    }));
}

FNCountedPtr<FG::DllFrameGrabberFactoryCache> Resources::dllFrameGrabberFactoryCache() const {
    const FNMutexLock lock(mutex_);
    if (!dllFrameGrabberFactoryCache_)
        dllFrameGrabberFactoryCache_ = FNCountedPtr<FG::DllFrameGrabberFactoryCache>(
            new FG::DllFrameGrabberFactoryCache(rootComponent_.subComponent("FgDllCache")));
    return dllFrameGrabberFactoryCache_;
}

} // namespace Orbek

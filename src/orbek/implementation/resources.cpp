#include "orbek/implementation/resources.h"

#include "cmp/b7/cmp_algorithm.h"
#include "eye/cara/face_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "fn/deployment/composite_values.h"
#include "fn/message/translator.h"
#include "kx/life_checker.h"
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

std::list<Component> Resources::rootComponents() const {
    std::list<Component> roots{rootComponent()};
    for (const Property& setting : Kx::Implementation::lifeCheckSettings())
        roots.emplace_back(configDb_, setting);
    return roots;
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

namespace {

Cmp::Strategy* makeStrategy(const Component& module) {
    const int threads =
        Fn::Deployment::Value<Fn::Deployment::Int>::get(module.subComponent("NumberOfThreads"));
    const Component choice = module.subComponent("AlgorithmVersion");
    const auto version =
        Fn::Deployment::Value<Fn::Deployment::Alternative<ComparisonAlgorithms>>::get(choice);
    if (version != "B7")
        FN_THROW(FNEBadArg, "Illegal value for Comparison Algorithm: " + version +
                                " is not part of this library, which has: B7");
    const FNCountedPtr<Cmp::B7::CmpAlgorithm> algorithm(
        new Cmp::B7::CmpAlgorithm(choice.subComponent(version)));
    return new Cmp::Strategy(algorithm, algorithm->scoreMapping(), algorithm->ratesMapping(),
                             static_cast<unsigned int>(std::max(threads, 1))); // 0 is the calling thread, too
}

} // namespace

Cmp::Strategy Resources::cmpStrategy() const {
    return *cmpStrategy_.get(mutex_, FNTrans("Comparison module"), [&] {
        return makeStrategy(rootComponent_.subComponent("ComparisonAlgorithm"));
    });
}

Cmp::Portrait::Analyzer Resources::portraitAnalyzer() const {
    return *portraitAnalyzer_.get(mutex_, FNTrans("Portrait Analyzer"), [&] {
        return new Cmp::Portrait::Analyzer(rootComponent_.subComponent("PortraitAnalyzer"));
    });
}

Kx::ISO_19794_5::FullFrontal::Test Resources::fullFrontalTest() const {
    return *fullFrontalTest_.get(mutex_, "ISO 19794-5 Full Frontal images assessment", [&] {
        return new Kx::ISO_19794_5::FullFrontal::Test(rootComponent_.subComponent("ISOFullFrontalTest"));
    });
}

Kx::Feature::Test Resources::featureTest() const {
    return *featureTest_.get(mutex_, "Feature assessment", [&] {
        return new Kx::Feature::Test(rootComponent_.subComponent("FeatureTest"));
    });
}

FNCountedPtr<FG::DllFrameGrabberFactoryCache> Resources::dllFrameGrabberFactoryCache() const {
    const FNMutexLock lock(mutex_);
    if (!dllFrameGrabberFactoryCache_)
        dllFrameGrabberFactoryCache_ = FNCountedPtr<FG::DllFrameGrabberFactoryCache>(
            new FG::DllFrameGrabberFactoryCache(rootComponent_.subComponent("FgDllCache")));
    return dllFrameGrabberFactoryCache_;
}

} // namespace Orbek

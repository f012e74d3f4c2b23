#pragma once

#include "cmp/portrait/analyzer.h"
#include "cmp/strategy.h"
#include "eye/eyes_finder.h"
#include "eye/face_finder.h"
#include "fg/dll_frame_grabber_factory.h"
#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/thread/mutex.h"
#include "kx/feature_test.h"
#include "kx/full_frontal_test.h"

namespace Orbek {

/// One shared engine: goes once from unmade to made.
template <class Engine> class MadeOnce {
public:
    /// The engine, made by `make()`, which returns a new one, at the first call. A failure leaves it unmade.
    /// @param title begins the text of a failure
    /// @throws FNEGeneric "<title> : <reason>" if it cannot be made
    template <class Make>
    const FNCountedPtr<Engine>& get(const FNMutex& mutex, const std::string& title, Make make) const {
        const FNMutexLock lock(mutex);
        if (engine_) return engine_;
        try {
            engine_ = FNCountedPtr<Engine>(make());
        } catch (const std::exception& e) {
            FN_THROW(FNEGeneric, title + " : " + e.what());
        }
        return engine_;
    }

private:
    mutable FNCountedPtr<Engine> engine_;
};

/// What all objects made from one configuration share: the tree of settings, and the heavy engines, each made
/// at the first request for it.
class Resources {
public:
    explicit Resources(const FNCountedPtr<AppConfigDB>& configDb);

    Fn::Deployment::Component rootComponent() const;
    /// That one, and the settings that stand beside the tree.
    std::list<Fn::Deployment::Component> rootComponents() const;
    FNCountedPtr<AppConfigDB> configDb() const { return configDb_; }

    /// The engines. The first request reads the model files, and is slow.
    /// @throws FNEGeneric "<engine> : <reason>" if one cannot be made
    FaceFinder faceFinder() const;
    EyesFinder eyesFinder() const;
    /// The algorithm that `AlgorithmVersion` names, with its mappings.
    Cmp::Strategy cmpStrategy() const;
    /// Portraits: the measures, and what they tell. These read no model files yet.
    Cmp::Portrait::Analyzer portraitAnalyzer() const;
    Kx::ISO_19794_5::FullFrontal::Test fullFrontalTest() const;
    Kx::Feature::Test featureTest() const;
    /// The plug-ins of capture devices.
    FNCountedPtr<FG::DllFrameGrabberFactoryCache> dllFrameGrabberFactoryCache() const;

private:
    /// Held while an engine is made; recursive, since making one engine may ask for another.
    FNMutex mutex_{FNMutex::recursive};
    FNCountedPtr<AppConfigDB> configDb_;
    Fn::Deployment::Component rootComponent_;
    MadeOnce<FaceFinder::Body> faceFinder_;
    MadeOnce<EyesFinder::Body> eyesFinder_;
    MadeOnce<Cmp::Strategy> cmpStrategy_;
    MadeOnce<Cmp::Portrait::Analyzer> portraitAnalyzer_;
    MadeOnce<Kx::ISO_19794_5::FullFrontal::Test> fullFrontalTest_;
    MadeOnce<Kx::Feature::Test> featureTest_;
    mutable FNCountedPtr<FG::DllFrameGrabberFactoryCache> dllFrameGrabberFactoryCache_;
};

} // namespace Orbek

#include "orbek/full_frontal_test.h"

#include "orbek/implementation/assessment.h"

namespace Orbek::ISO_19794_5::FullFrontal {

class Boundaries::Implementation {
public:
    static Boundaries make(const Kx::ISO_19794_5::FullFrontal::Boundaries& limits) {
        return Boundaries(CountedPtr<Implementation>(new Implementation{limits}));
    }

    Kx::ISO_19794_5::FullFrontal::Boundaries limits;
};

class Compliance::Implementation {
public:
    static Compliance make(const Kx::ISO_19794_5::FullFrontal::Compliance& compliance,
                           bool onlyOneFaceVisible) {
        return Compliance(CountedPtr<Implementation>(new Implementation{compliance, onlyOneFaceVisible}));
    }

    Kx::ISO_19794_5::FullFrontal::Compliance compliance;
    bool onlyOneFaceVisible;
};

class Test::Implementation : public EngineOf<Kx::ISO_19794_5::FullFrontal::Test> {
public:
    using EngineOf::EngineOf;
};

Boundaries::Boundaries(const CountedPtr<Implementation>& implementation) : implementation_(implementation) {}
Boundaries::Boundaries(const Boundaries&) = default;
Boundaries& Boundaries::operator=(const Boundaries&) = default;
Boundaries::~Boundaries() = default;

float Boundaries::leftBoundCenteredFace() const {
    return implementation_->limits.leftBoundCenteredFace();
}
float Boundaries::rightBoundCenteredFace() const {
    return implementation_->limits.rightBoundCenteredFace();
}
float Boundaries::upperBoundVerticalPosition() const {
    return implementation_->limits.upperBoundVerticalPosition();
}
float Boundaries::lowerBoundVerticalPosition() const {
    return implementation_->limits.lowerBoundVerticalPosition();
}
float Boundaries::minWidthOfHeadRatio() const {
    return implementation_->limits.minWidthOfHeadRatio();
}
float Boundaries::minLengthOfHeadRatio() const {
    return implementation_->limits.minLengthOfHeadRatio();
}
float Boundaries::maxWidthOfHeadRatio() const {
    return implementation_->limits.maxWidthOfHeadRatio();
}
float Boundaries::maxLengthOfHeadRatio() const {
    return implementation_->limits.maxLengthOfHeadRatio();
}
float Boundaries::minHeadWidth() const {
    return implementation_->limits.minHeadWidth();
}
float Boundaries::minWidthOfHeadRatioBestPractice() const {
    return implementation_->limits.minWidthOfHeadRatioBestPractice();
}
float Boundaries::minLengthOfHeadRatioBestPractice() const {
    return implementation_->limits.minLengthOfHeadRatioBestPractice();
}
float Boundaries::maxWidthOfHeadRatioBestPractice() const {
    return implementation_->limits.maxWidthOfHeadRatioBestPractice();
}
float Boundaries::maxLengthOfHeadRatioBestPractice() const {
    return implementation_->limits.maxLengthOfHeadRatioBestPractice();
}
float Boundaries::minHeadWidthBestPractice() const {
    return implementation_->limits.minHeadWidthBestPractice();
}
float Boundaries::minWidthToHeightRatioBestPractice() const {
    return implementation_->limits.minWidthToHeightRatioBestPractice();
}
float Boundaries::maxWidthToHeightRatioBestPractice() const {
    return implementation_->limits.maxWidthToHeightRatioBestPractice();
}
float Boundaries::lowExposerThreshold() const {
    return implementation_->limits.lowExposerThreshold();
}
float Boundaries::highExposerThreshold() const {
    return implementation_->limits.highExposerThreshold();
}
float Boundaries::minimalGrayScaleBounding() const {
    return implementation_->limits.minimalGrayScaleBounding();
}
float Boundaries::minimalSkinColourRatio() const {
    return implementation_->limits.minimalSkinColourRatio();
}
float Boundaries::maxFrontalPoseDeviation() const {
    return implementation_->limits.maxFrontalPoseDeviation();
}
float Boundaries::poseMaxRotation() const {
    return implementation_->limits.poseMaxRotation();
}
float Boundaries::maxFrontalPoseDeviationBestPractice() const {
    return implementation_->limits.maxFrontalPoseDeviationBestPractice();
}
float Boundaries::poseMaxRotationBestPractice() const {
    return implementation_->limits.poseMaxRotationBestPractice();
}
float Boundaries::maxDeviationFromLighting() const {
    return implementation_->limits.maxDeviationFromLighting();
}
float Boundaries::eyesOpenThreshold() const {
    return implementation_->limits.eyesOpenThreshold();
}
float Boundaries::eyesGazeFrontalThreshold() const {
    return implementation_->limits.eyesGazeFrontalThreshold();
}
float Boundaries::eyesNotRedThreshold() const {
    return implementation_->limits.eyesNotRedThreshold();
}
float Boundaries::minimalSharpness() const {
    return implementation_->limits.minimalSharpness();
}
float Boundaries::closedMouthThreshold() const {
    return implementation_->limits.closedMouthThreshold();
}
float Boundaries::hotSpotsThreshold() const {
    return implementation_->limits.hotSpotsThreshold();
}
float Boundaries::wearsGlassesThreshold() const {
    return implementation_->limits.wearsGlassesThreshold();
}
float Boundaries::tintedGlassesThreshold() const {
    return implementation_->limits.tintedGlassesThreshold();
}

Compliance::Compliance(const CountedPtr<Implementation>& implementation) : implementation_(implementation) {}
Compliance::Compliance(const Compliance&) = default;
Compliance& Compliance::operator=(const Compliance&) = default;
Compliance::~Compliance() = default;

bool Compliance::isCompliant() const {
    return implementation_->onlyOneFaceVisible && implementation_->compliance.isCompliant();
}
bool Compliance::isBestPractice() const {
    return implementation_->onlyOneFaceVisible && implementation_->compliance.isBestPractice();
}
bool Compliance::onlyOneFaceVisible() const {
    return implementation_->onlyOneFaceVisible;
}
bool Compliance::goodVerticalFacePosition() const {
    return implementation_->compliance.goodVerticalFacePosition();
}
bool Compliance::horizontallyCenteredFace() const {
    return implementation_->compliance.horizontallyCenteredFace();
}
bool Compliance::widthOfHead() const {
    return implementation_->compliance.widthOfHead();
}
bool Compliance::lengthOfHead() const {
    return implementation_->compliance.lengthOfHead();
}
bool Compliance::widthOfHeadBestPractice() const {
    return implementation_->compliance.widthOfHeadBestPractice();
}
bool Compliance::lengthOfHeadBestPractice() const {
    return implementation_->compliance.lengthOfHeadBestPractice();
}
bool Compliance::resolution() const {
    return implementation_->compliance.resolution();
}
bool Compliance::resolutionBestPractice() const {
    return implementation_->compliance.resolutionBestPractice();
}
bool Compliance::imageWidthToHeightBestPractice() const {
    return implementation_->compliance.imageWidthToHeightBestPractice();
}
bool Compliance::goodExposure() const {
    return implementation_->compliance.goodExposure();
}
bool Compliance::goodGrayScaleProfile() const {
    return implementation_->compliance.goodGrayScaleProfile();
}
bool Compliance::hasNaturalSkinColour() const {
    return implementation_->compliance.hasNaturalSkinColour();
}
bool Compliance::noHotSpots() const {
    return implementation_->compliance.noHotSpots();
}
bool Compliance::isBackgroundUniformBestPractice() const {
    return implementation_->compliance.isBackgroundUniformBestPractice();
}
bool Compliance::isFrontal() const {
    return implementation_->compliance.isFrontal();
}
bool Compliance::isFrontalBestPractice() const {
    return implementation_->compliance.isFrontalBestPractice();
}
bool Compliance::isLightingUniform() const {
    return implementation_->compliance.isLightingUniform();
}
bool Compliance::eyesOpenBestPractice() const {
    return implementation_->compliance.eyesOpenBestPractice();
}
bool Compliance::eyesGazeFrontalBestPractice() const {
    return implementation_->compliance.eyesGazeFrontalBestPractice();
}
bool Compliance::eyesNotRedBestPractice() const {
    return implementation_->compliance.eyesNotRedBestPractice();
}
bool Compliance::noTintedGlasses() const {
    return implementation_->compliance.noTintedGlasses();
}
bool Compliance::isSharp() const {
    return implementation_->compliance.isSharp();
}
bool Compliance::mouthClosedBestPractice() const {
    return implementation_->compliance.mouthClosedBestPractice();
}

Test::Test(const Configuration& configuration)
    : implementation_(new Implementation(configuration, &Resources::fullFrontalTest)) {}
Test::Test(const Test&) = default;
Test& Test::operator=(const Test&) = default;
Test::~Test() = default;

Boundaries Test::boundaries() const {
    return Boundaries::Implementation::make(implementation_->engine().boundaries());
}

Compliance Test::assess(const Portrait::Characteristics& portrait) const {
    return Compliance::Implementation::make(
        implementation_->engine().assess(Portrait::Characteristics::Implementation::of(portrait).portrait),
        portrait.numberOfFaces() == 1);
}

} // namespace Orbek::ISO_19794_5::FullFrontal

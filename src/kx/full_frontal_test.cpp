#include "kx/full_frontal_test.h"

#include "fn/serialize.h"
#include "fn/thread/mutex.h"

#include <array>
#include <cmath>
#include <optional>

namespace Kx::ISO_19794_5::FullFrontal {

namespace {

using Cmp::Portrait::Characteristics;

/// In the order in which they are packed.
enum Check : std::size_t {
    goodVerticalFacePosition,
    horizontallyCenteredFace,
    widthOfHead,
    lengthOfHead,
    widthOfHeadBestPractice,
    lengthOfHeadBestPractice,
    resolution,
    resolutionBestPractice,
    goodExposure,
    goodGrayScaleProfile,
    isBackgroundUniformBestPractice,
    isFrontal,
    isFrontalBestPractice,
    isLightingUniform,
    eyesOpenBestPractice,
    imageWidthToHeightBestPractice,
    isSharp,
    mouthClosedBestPractice,
    hasNaturalSkinColour,
    noHotSpots,
    eyesNotRedBestPractice,
    eyesGazeFrontalBestPractice,
    noTintedGlasses,
    checks ///< their number
};

/// What the summaries ask, in this order, up to the first failure.
constexpr Check demanded[] = {goodVerticalFacePosition,
                              horizontallyCenteredFace,
                              widthOfHead,
                              lengthOfHead,
                              resolution,
                              goodExposure,
                              goodGrayScaleProfile,
                              noHotSpots,
                              isFrontal,
                              isLightingUniform,
                              isSharp,
                              noTintedGlasses,
                              hasNaturalSkinColour};
constexpr Check recommended[] = {goodVerticalFacePosition,
                                 horizontallyCenteredFace,
                                 widthOfHeadBestPractice,
                                 lengthOfHeadBestPractice,
                                 resolutionBestPractice,
                                 imageWidthToHeightBestPractice,
                                 isBackgroundUniformBestPractice,
                                 goodExposure,
                                 goodGrayScaleProfile,
                                 noHotSpots,
                                 isFrontalBestPractice,
                                 eyesOpenBestPractice,
                                 eyesGazeFrontalBestPractice,
                                 isLightingUniform,
                                 isSharp,
                                 noTintedGlasses,
                                 mouthClosedBestPractice,
                                 eyesNotRedBestPractice,
                                 hasNaturalSkinColour};

bool needsColor(std::size_t check) {
    return check == hasNaturalSkinColour || check == eyesNotRedBestPractice;
}

bool within(float least, float value, float greatest) {
    return least <= value && value <= greatest;
}

/// One check of a portrait.
class Checker {
public:
    Checker(const Characteristics& portrait, const Boundaries& limits)
        : portrait_(portrait), limits_(limits), width_(static_cast<float>(portrait.width())),
          height_(static_cast<float>(portrait.height())) {}

    bool operator()(Check check) const {
        const Characteristics& p = portrait_;
        const Boundaries& l = limits_;
        switch (check) {
        case goodVerticalFacePosition:
            return within(height_ * l.lowerBoundVerticalPosition(), p.faceCenter().y,
                          height_ * l.upperBoundVerticalPosition());
        case horizontallyCenteredFace:
            return within(width_ * l.leftBoundCenteredFace(), p.faceCenter().x,
                          width_ * l.rightBoundCenteredFace());
        case widthOfHead:
            return headFitsInWidth(l.minWidthOfHeadRatio(), l.maxWidthOfHeadRatio());
        case lengthOfHead:
            return headFitsInHeight(l.minLengthOfHeadRatio(), l.maxLengthOfHeadRatio());
        case widthOfHeadBestPractice:
            return headFitsInWidth(l.minWidthOfHeadRatioBestPractice(), l.maxWidthOfHeadRatioBestPractice());
        case lengthOfHeadBestPractice:
            return headFitsInHeight(l.minLengthOfHeadRatioBestPractice(),
                                    l.maxLengthOfHeadRatioBestPractice());
        case resolution:
            return p.widthOfHead() >= l.minHeadWidth();
        case resolutionBestPractice:
            return p.widthOfHead() >= l.minHeadWidthBestPractice();
        case goodExposure:
            return within(l.lowExposerThreshold(), p.exposure(), l.highExposerThreshold());
        case goodGrayScaleProfile:
            return static_cast<float>(p.grayScaleDensity()) >= l.minimalGrayScaleBounding();
        case isBackgroundUniformBestPractice:
            return p.backgroundUniformity() > 0;
        case isFrontal:
            return frontal(l.poseMaxRotation(), l.maxFrontalPoseDeviation());
        case isFrontalBestPractice:
            return frontal(l.poseMaxRotationBestPractice(), l.maxFrontalPoseDeviationBestPractice());
        case isLightingUniform:
            return p.deviationFromUniformLighting() <= l.maxDeviationFromLighting();
        case eyesOpenBestPractice:
            return p.eye0Open() > l.eyesOpenThreshold() && p.eye1Open() > l.eyesOpenThreshold();
        case imageWidthToHeightBestPractice:
            return within(l.minWidthToHeightRatioBestPractice(), height_ / width_,
                          l.maxWidthToHeightRatioBestPractice());
        case isSharp:
            return p.sharpness() >= l.minimalSharpness();
        case mouthClosedBestPractice:
            return p.mouthClosed() >= l.closedMouthThreshold();
        case hasNaturalSkinColour:
            return p.naturalSkinColour() >= l.minimalSkinColourRatio();
        case noHotSpots:
            return p.hotSpots() < l.hotSpotsThreshold();
        case eyesNotRedBestPractice:
            return p.eye0Red() <= l.eyesNotRedThreshold() && p.eye1Red() <= l.eyesNotRedThreshold();
        case eyesGazeFrontalBestPractice:
            return p.eye0GazeFrontal() >= l.eyesGazeFrontalThreshold() &&
                   p.eye1GazeFrontal() >= l.eyesGazeFrontalThreshold();
        case noTintedGlasses:
            return p.glasses() <= l.wearsGlassesThreshold() ||
                   (p.eye0Tinted() <= l.tintedGlassesThreshold() &&
                    p.eye1Tinted() <= l.tintedGlassesThreshold());
        case checks:
            break;
        }
        FN_THROW(FNEBadArg, "Compliance: unknown check");
    }

private:
    bool headFitsInWidth(float least, float greatest) const {
        if (!within(least, width_ / portrait_.widthOfHead(), greatest)) return false;
        const FNBox head = earToEarChinCrownSurroundingBox(portrait_);
        return head.x0 >= 0 && static_cast<float>(head.x1) <= width_;
    }
    bool headFitsInHeight(float least, float greatest) const {
        if (!within(least, height_ / portrait_.lengthOfHead(), greatest)) return false;
        const FNBox head = earToEarChinCrownSurroundingBox(portrait_);
        return head.y0 >= 0 && static_cast<float>(head.y1) <= height_;
    }
    bool frontal(float maxRotation, float maxDeviation) const {
        return std::abs(portrait_.poseAngleRoll()) <= maxRotation &&
               portrait_.deviationFromFrontalPose() <= maxDeviation;
    }

    const Characteristics& portrait_;
    const Boundaries& limits_;
    float width_, height_;
};

} // namespace

class Compliance::Implementation {
public:
    Implementation(const Characteristics& portrait, const Boundaries& limits)
        : isColor_(portrait.isColor()), source_(Source{portrait, limits}) {}

    explicit Implementation(Fn::PackageReader reader) : isColor_(reader.next<bool>()) {
        for (std::optional<bool>& result : results_) result = reader.next<bool>();
        reader.expectEnd();
    }

    Fn::Package serialize() const {
        std::list<Fn::Package> elements{Fn::Package(isColor_)};
        for (std::size_t i = 0; i < checks; ++i)
            elements.emplace_back(applies(i) && passes(static_cast<Check>(i)));
        return Fn::Package(elements);
    }

    bool passes(Check check) const {
        const FNMutexLock lock(mutex_);
        std::optional<bool>& result = results_[check];
        if (!result) result = Checker(source_->portrait, source_->limits)(check);
        return *result;
    }
    /// @param name of the operation
    bool passesInColor(Check check, const char* name) const {
        if (!isColor_)
            FN_THROW(FNEBadArg, std::string("Compliance::") + name + " not applicable on gray scale image");
        return passes(check);
    }
    template <std::size_t n> bool passesAll(const Check (&list)[n]) const {
        return std::all_of(std::begin(list), std::end(list),
                           [&](Check check) { return !applies(check) || passes(check); });
    }

private:
    /// A packed object has none, but all results.
    struct Source {
        Characteristics portrait;
        Boundaries limits;
    };

    bool applies(std::size_t check) const { return isColor_ || !needsColor(check); }

    bool isColor_;
    std::optional<Source> source_;
    FNMutex mutex_{FNMutex::recursive}; ///< guards the results
    mutable std::array<std::optional<bool>, checks> results_;
};

Compliance::Compliance(const FNCountedPtr<const Implementation>& implementation)
    : implementation_(implementation) {}
Compliance::Compliance(const Fn::Package& package)
    : implementation_(new Implementation(Fn::PackageReader(package))) {}
Compliance::Compliance(const Compliance&) = default;
Compliance& Compliance::operator=(const Compliance&) = default;
Compliance::~Compliance() = default;

Fn::Package Compliance::serialize() const {
    return implementation_->serialize();
}
bool Compliance::isCompliant() const {
    return implementation_->passesAll(demanded);
}
bool Compliance::isBestPractice() const {
    return implementation_->passesAll(recommended);
}

bool Compliance::goodVerticalFacePosition() const {
    return implementation_->passes(FullFrontal::goodVerticalFacePosition);
}
bool Compliance::horizontallyCenteredFace() const {
    return implementation_->passes(FullFrontal::horizontallyCenteredFace);
}
bool Compliance::widthOfHead() const {
    return implementation_->passes(FullFrontal::widthOfHead);
}
bool Compliance::lengthOfHead() const {
    return implementation_->passes(FullFrontal::lengthOfHead);
}
bool Compliance::widthOfHeadBestPractice() const {
    return implementation_->passes(FullFrontal::widthOfHeadBestPractice);
}
bool Compliance::lengthOfHeadBestPractice() const {
    return implementation_->passes(FullFrontal::lengthOfHeadBestPractice);
}
bool Compliance::resolution() const {
    return implementation_->passes(FullFrontal::resolution);
}
bool Compliance::resolutionBestPractice() const {
    return implementation_->passes(FullFrontal::resolutionBestPractice);
}
bool Compliance::goodExposure() const {
    return implementation_->passes(FullFrontal::goodExposure);
}
bool Compliance::goodGrayScaleProfile() const {
    return implementation_->passes(FullFrontal::goodGrayScaleProfile);
}
bool Compliance::isBackgroundUniformBestPractice() const {
    return implementation_->passes(FullFrontal::isBackgroundUniformBestPractice);
}
bool Compliance::isFrontal() const {
    return implementation_->passes(FullFrontal::isFrontal);
}
bool Compliance::isFrontalBestPractice() const {
    return implementation_->passes(FullFrontal::isFrontalBestPractice);
}
bool Compliance::isLightingUniform() const {
    return implementation_->passes(FullFrontal::isLightingUniform);
}
bool Compliance::eyesOpenBestPractice() const {
    return implementation_->passes(FullFrontal::eyesOpenBestPractice);
}
bool Compliance::imageWidthToHeightBestPractice() const {
    return implementation_->passes(FullFrontal::imageWidthToHeightBestPractice);
}
bool Compliance::isSharp() const {
    return implementation_->passes(FullFrontal::isSharp);
}
bool Compliance::mouthClosedBestPractice() const {
    return implementation_->passes(FullFrontal::mouthClosedBestPractice);
}
bool Compliance::hasNaturalSkinColour() const {
    return implementation_->passesInColor(FullFrontal::hasNaturalSkinColour, "hasNaturalSkinColour()");
}
bool Compliance::noHotSpots() const {
    return implementation_->passes(FullFrontal::noHotSpots);
}
bool Compliance::eyesNotRedBestPractice() const {
    return implementation_->passesInColor(FullFrontal::eyesNotRedBestPractice, "eyesNotRed()");
}
bool Compliance::eyesGazeFrontalBestPractice() const {
    return implementation_->passes(FullFrontal::eyesGazeFrontalBestPractice);
}
bool Compliance::noTintedGlasses() const {
    return implementation_->passes(FullFrontal::noTintedGlasses);
}

Fn::Deployment::Type Test::define() {
    return Fn::Deployment::Type(typeId(), "Assessment for ISO 19794-5 Full Frontal Images",
                                Boundaries::settingsOfThem(), "", false);
}

Compliance Test::assess(const Characteristics& portrait) const {
    return Compliance(FNCountedPtr<const Compliance::Implementation>(
        new Compliance::Implementation(portrait, boundaries_)));
}

} // namespace Kx::ISO_19794_5::FullFrontal

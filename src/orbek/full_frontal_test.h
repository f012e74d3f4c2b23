#pragma once

#include "orbek/portrait.h"

/// Whether a portrait is a full frontal image of a face as ISO/IEC 19794-5:2005 wants it for identity
/// documents.
///
///     const Orbek::ISO_19794_5::FullFrontal::Test test(configuration);
///     const auto compliance = test.assess(portrait);
///     if (!compliance.isCompliant() && !compliance.isSharp()) ...
namespace Orbek::ISO_19794_5::FullFrontal {

/// What the tests allow, as it is set below ORBEK.ISOFullFrontalTest. Bounds of positions are in widths and
/// heights of the image, ratios are of the image to the head, and the rest has the units of
/// Portrait::Characteristics.
class [[gnu::visibility("default")]] Boundaries {
public:
    Boundaries(const Boundaries&);
    Boundaries& operator=(const Boundaries&);
    ~Boundaries();

    float leftBoundCenteredFace() const;
    float rightBoundCenteredFace() const;
    float upperBoundVerticalPosition() const;
    float lowerBoundVerticalPosition() const;
    float minWidthOfHeadRatio() const;
    float minLengthOfHeadRatio() const;
    float maxWidthOfHeadRatio() const;
    float maxLengthOfHeadRatio() const;
    float minHeadWidth() const;
    float minWidthOfHeadRatioBestPractice() const;
    float minLengthOfHeadRatioBestPractice() const;
    float maxWidthOfHeadRatioBestPractice() const;
    float maxLengthOfHeadRatioBestPractice() const;
    float minHeadWidthBestPractice() const;
    float minWidthToHeightRatioBestPractice() const;
    float maxWidthToHeightRatioBestPractice() const;
    float lowExposerThreshold() const;
    float highExposerThreshold() const;
    float minimalGrayScaleBounding() const;
    float minimalSkinColourRatio() const;
    float maxFrontalPoseDeviation() const;
    float poseMaxRotation() const;
    float maxFrontalPoseDeviationBestPractice() const;
    float poseMaxRotationBestPractice() const;
    float maxDeviationFromLighting() const;
    float eyesOpenThreshold() const;
    float eyesGazeFrontalThreshold() const;
    float eyesNotRedThreshold() const;
    float minimalSharpness() const;
    float closedMouthThreshold() const;
    float hotSpotsThreshold() const;
    float wearsGlassesThreshold() const;
    float tintedGlassesThreshold() const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    explicit Boundaries(const CountedPtr<Implementation>& implementation);
    CountedPtr<Implementation> implementation_;
};

/// The tests of one portrait. Each is worked out when it is first asked for, and throws what the measures
/// behind it throw. Copies share the results; any number of threads may ask.
class [[gnu::visibility("default")]] Compliance {
public:
    Compliance(const Compliance&);
    Compliance& operator=(const Compliance&);
    ~Compliance();

    /// What the standard demands of a picture of one person.
    bool isCompliant() const;
    /// What it recommends, too.
    bool isBestPractice() const;

    bool onlyOneFaceVisible() const;
    bool goodVerticalFacePosition() const;
    bool horizontallyCenteredFace() const;
    /// These four also fail for a head that is cut by the border of the image.
    bool widthOfHead() const;
    bool lengthOfHead() const;
    bool widthOfHeadBestPractice() const;
    bool lengthOfHeadBestPractice() const;
    bool resolution() const;
    bool resolutionBestPractice() const;
    bool imageWidthToHeightBestPractice() const;
    bool goodExposure() const;
    bool goodGrayScaleProfile() const;
    /// @throws std::exception for a portrait without colour
    bool hasNaturalSkinColour() const;
    bool noHotSpots() const;
    bool isBackgroundUniformBestPractice() const;
    bool isFrontal() const;
    bool isFrontalBestPractice() const;
    bool isLightingUniform() const;
    bool eyesOpenBestPractice() const;
    bool eyesGazeFrontalBestPractice() const;
    /// @throws std::exception for a portrait without colour
    bool eyesNotRedBestPractice() const;
    /// True without glasses.
    bool noTintedGlasses() const;
    bool isSharp() const;
    bool mouthClosedBestPractice() const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    explicit Compliance(const CountedPtr<Implementation>& implementation);
    CountedPtr<Implementation> implementation_;
};

/// Copies share everything; any number of threads may use one.
class [[gnu::visibility("default")]] Test {
public:
    explicit Test(const Configuration& configuration);
    Test(const Test&);
    Test& operator=(const Test&);
    ~Test();

    Boundaries boundaries() const;
    /// Costs nothing yet.
    Compliance assess(const Portrait::Characteristics& portrait) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::ISO_19794_5::FullFrontal

#pragma once

#include "cmp/portrait/characteristics.h"
#include "kx/full_frontal_boundaries.h"

/// Whether a portrait is a full frontal image of a face as ISO/IEC 19794-5:2005 wants it for identity
/// documents.
///
///     const auto compliance = Kx::ISO_19794_5::FullFrontal::Test(component).assess(portrait);
///     if (!compliance.isCompliant() && !compliance.eyesOpenBestPractice()) ...
namespace Kx::ISO_19794_5::FullFrontal {

/// The tests of one portrait against one set of limits. Each is worked out when it is first asked for, and
/// kept; the two summaries stop at the first test that fails. Copies share the results; any number of threads
/// may ask.
///
/// All throw what the portrait's measures throw. A measure that is not a number fails its test.
class Compliance {
public:
    /// What serialize() has written. @throws FNEBadArg
    explicit Compliance(const Fn::Package& package);
    Compliance(const Compliance&);
    Compliance& operator=(const Compliance&);
    ~Compliance();

    /// What the standard demands.
    bool isCompliant() const;
    /// What it recommends, too.
    bool isBestPractice() const;

    bool goodVerticalFacePosition() const;
    bool horizontallyCenteredFace() const;
    /// These four also fail for a head that is cut by the border of the image.
    bool widthOfHead() const;
    bool lengthOfHead() const;
    bool widthOfHeadBestPractice() const;
    bool lengthOfHeadBestPractice() const;
    bool resolution() const;
    bool resolutionBestPractice() const;
    bool goodExposure() const;
    bool goodGrayScaleProfile() const;
    bool isBackgroundUniformBestPractice() const;
    bool isFrontal() const;
    bool isFrontalBestPractice() const;
    bool isLightingUniform() const;
    bool eyesOpenBestPractice() const;
    bool imageWidthToHeightBestPractice() const;
    bool isSharp() const;
    bool mouthClosedBestPractice() const;
    /// @throws FNEBadArg for a portrait without colour
    bool hasNaturalSkinColour() const;
    bool noHotSpots() const;
    /// @throws FNEBadArg for a portrait without colour
    bool eyesNotRedBestPractice() const;
    bool eyesGazeFrontalBestPractice() const;
    /// True without glasses.
    bool noTintedGlasses() const;

    /// Works out all tests. A list of whether there is colour and of the tests in the order above; the two
    /// that need colour count as failed without it.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

private:
    friend class Test;
    class Implementation;
    explicit Compliance(const FNCountedPtr<const Implementation>& implementation);
    FNCountedPtr<const Implementation> implementation_;
};

/// Any number of threads may use one.
class Test {
public:
    explicit Test(const Fn::Deployment::Component& component) : boundaries_(component) {}

    static std::string typeId() { return "Kx::ISO_19794_5::FullFrontal::Test"; }
    static Fn::Deployment::Type define();

    const Boundaries& boundaries() const { return boundaries_; }
    /// Costs nothing yet.
    Compliance assess(const Cmp::Portrait::Characteristics& portrait) const;

private:
    Boundaries boundaries_;
};

} // namespace Kx::ISO_19794_5::FullFrontal

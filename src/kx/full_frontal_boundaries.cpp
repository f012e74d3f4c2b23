#include "kx/full_frontal_boundaries.h"

#include "fn/deployment/leaf_values.h"

namespace Kx::ISO_19794_5::FullFrontal {

using namespace Fn::Deployment;

namespace {

constexpr const char* minWidthDoc =
    "The minimal ratio of the image width to the width of the head. Defaults to 1.4 (7:5) according to "
    "ISO 19794-5:2005 section 8.3.4.";
constexpr const char* maxWidthDoc =
    "The maximal ratio of the image width to the width of the head. Defaults to 2.0 (2:1) according to "
    "ISO 19794-5:2005 appendix A3.2.2.";
constexpr const char* poseDoc =
    "The frontal pose check is based an a yes/no decision if the pose of the face is les or equal than "
    "+/-5 degree. Roll angle is not part of this check. So the value has a meaning of a threshold and "
    "variing the threshold increases or decreases FAR and FRR of the decision. Higher values will "
    "decrease FRR, lower value will decrease FAR. The defaut is 0.42 (at the equal error rate). Range: "
    "-FLT_MAX - FLT_MAX";

constexpr const char* centerKey = "DeviationFromCenter";
constexpr const char* centerDoc =
    "Upper bound for the deviation of the horizontal face position from image center relative to the "
    "image width. This value revers to leftBoundCenteredFace and rightBoundCenteredFace as following: "
    "\nleftBoundCenteredFace = DeviationFromCenter, rightBoundCenteredFace = DeviationFromCenter. (See "
    "8.3.2.) Available range 0 - 0.5";

/// A setting that is a limit.
struct Setting {
    const char* key;
    float Limits::*limit;
    const char* preset; ///< text of the default; some need more digits than a written float has
    const char* doc;
};

/// Defaults follow ISO/IEC 19794-5:2005 where it gives numbers. For scores of trained measures they are
/// fixed, and the models are trained such that a score has its meaning at them (see models/CARD.md).
constexpr Setting settings[] = {
    {"LowerBoundForVerticalPosition", &Limits::lowerBoundVerticalPosition, "0.3",
     "Lower bound for the vertical face position relative to the portrait height. Defaults to 0.3 "
     "according to ISO 19794-5:2005 section 8.3.3. ( Note: upper left corner is 0,0)"},
    {"UpperBoundForVerticalPosition", &Limits::upperBoundVerticalPosition, "0.5",
     "Upper bound for the vertical face position relative to the portrait height. Defaults to 0.5 "
     "according to ISO 19794-5:2005 section 8.3.3, Use 0.6 for children under 11."},
    {"ImageMinWidthToHeadWidthRatio", &Limits::minWidthOfHeadRatio, "1.3333", minWidthDoc},
    {"ImageMinWidthToHeadWidthRatioBestPractice", &Limits::minWidthOfHeadRatioBestPractice, "1.4",
     minWidthDoc},
    {"ImageMaxWidthToHeadWidthRatio", &Limits::maxWidthOfHeadRatio, "2.0", maxWidthDoc},
    {"ImageMaxWidthToHeadWidthRatioBestPractice", &Limits::maxWidthOfHeadRatioBestPractice, "2.0",
     maxWidthDoc},
    {"ImageMinHeightToHeadLengthRatio", &Limits::minLengthOfHeadRatio, "1.1111",
     "The minimal ratio of the image height to the length of the head. Defaults to 1.11 according to ISO "
     "19794-5:2005 section 8.3.5."},
    {"ImageMaxHeightToHeadLengthRatio", &Limits::maxLengthOfHeadRatio, "1.6666",
     "The maximal ratio of the image height to the length of the head. Defaults to 1.6666  (10/6) "
     "according to 8.3.5."},
    {"ImageMinHeightToHeadLengthRatioBestPractice", &Limits::minLengthOfHeadRatioBestPractice, "1.25",
     "The minimal ratio of the image height to the length of the head. Defaults to 1.25 according to ISO "
     "19794-5:2005 section 8.3.5."},
    {"ImageMaxHeightToHeadLengthRatioBestPractice", &Limits::maxLengthOfHeadRatioBestPractice, "1.428",
     "The maximal ratio of the image height to the length of the head. Defaults to 1.428  (10/7) "
     "according to ISO 19794-5:2005 appendix A3.2.2."},
    {"ImageMinWidthToHeightRatioBestPractice", &Limits::minWidthToHeightRatioBestPractice, "1.25",
     "The minimal ratio of the image height to image width. Defaults to 1.25 according to ISO "
     "19794-5:2005 appendix A3.2.1."},
    {"ImageMaxWidthToHeightRatioBestPractice", &Limits::maxWidthToHeightRatioBestPractice, "1.34",
     "The maximal ratio of the image height to image width. Defaults to 1.34 according to ISO "
     "19794-5:2005 appendix A3.2.1."},
    {"MinHeadWidthBestPractice", &Limits::minHeadWidthBestPractice, "240",
     "The minimal head width in pixel according to ISO 19794-5:2005 section 8.4.1. Defaults to 240 Pixel "
     "according to Best practice recommendations (ISO 19794-5:2005 appendix A3.1.1)."},
    {"MinHeadWidth", &Limits::minHeadWidth, "180",
     "The minimal head width in pixel according to ISO 19794-5:2005 section 8.4.1. "},
    {"PoseMaxRotation", &Limits::poseMaxRotation, "0.14054083",
     "The absolute value (tangent of the angle) for the maximal deviation from frontal pose (roll angle "
     "only).Defaults to 0.14054083, tan( 8 degrees) according to ISO 19794-5:2005 section 7.2.2."},
    {"PoseMaxRotationBestPractice", &Limits::poseMaxRotationBestPractice, "0.0875",
     "The absolute value (tangent of the angle) for the maximal deviation from frontal pose (roll angle "
     "only).Defaults to 0.0875, tan(5 degrees) according to ISO 19794-5:2005 appendix A 2.2."},
    {"MaxFrontalPoseDeviation", &Limits::maxFrontalPoseDeviation, "0.42", poseDoc},
    {"MaxFrontalPoseDeviationBestPractice", &Limits::maxFrontalPoseDeviationBestPractice, "0.42", poseDoc},
    {"MinOpenEyeThresholdBestPractice", &Limits::eyesOpenThreshold, "-0.67",
     "An eye is threated as open, if either the eye lid is closed of half closed or the eye is partially "
     "covered by glasses frames or hair. It is recommanded in 7.2.3 that the eyes are normally open. The "
     "threshold defines the lower border of scores. Higher values of the threshold means that the eyes "
     "are treated as open with more safty. Range: -FLT_MAX - FLT_MAX"},
    {"MaxRedEyeThresholdBestPractice", &Limits::eyesNotRedThreshold, "0.18",
     "The maximal value of the red eye check. If the check leads to a higher value, the test will fail. "
     "So if the threshold is increased the test will be more tolerant for red eyes. Usefull range of "
     "threshold: 0 - 1"},
    {"LowExposureThreshold", &Limits::lowExposerThreshold, "63.75",
     "The exposure test of portrait characteristics leads to a value describing exposure of the face "
     "region. The  threshold describes the lower limit of acceptance. All exposure values below means "
     "underexposure and will be rejected (test failed). Usefull range of threshold: 0 - 255 "},
    {"HighExposureThreshold", &Limits::highExposerThreshold, "191.25",
     "The exposure test of portrait characteristics leads to a value describing exposure of the face "
     "region. The  threshold describes the upper limit of acceptance. All exposure higher values means "
     "overexposure and will be rejected (test failed).Useful range of threshold: 0 - 255 "},
    {"MinimalGrayScaleThreshold", &Limits::minimalGrayScaleBounding, "128",
     "Minimum number of different gray scale values in the face region. Useful range: 0 - 255"},
    {"MinSkinColourRatio", &Limits::minimalSkinColourRatio, "0.7",
     "Minimal relativ ratio of natural skin colour inface region. A higher ratio means, that the "
     "proportion of natural skin color in face must be higher. Range of threshold: 0.0 - 1.0 "},
    {"DeviationFromUniformLightingThreshold", &Limits::maxDeviationFromLighting, "-0.75",
     "The maximal (absolute value) of the deviation from uniform lighting. Higher values leads to more "
     "false acceptances. The theoretical possible range is: -FLT_MAX - FLT_MAX"},
    {"MinSharpness", &Limits::minimalSharpness, "0.26",
     "The minimal sharpness value of a face region which will pass the test as sharp enough. Increasing "
     "the threshold will increase the number of images rejected as not sharp enough. Range: 0.0 - 1.0"},
    {"ClosedMouthThresholdBestPractice", &Limits::closedMouthThreshold, "0.5",
     "The closed mouth check is based on a classification. Open mouthes  will get high values and closed "
     "mouthes will get lower values. Incresing the threshold will lead to less false acceptances (the "
     "propability to have realy openmothes will increase with the threshold).  Range of threshold: "
     "-FLT_MAX - FLT_MAX "},
    {"HotSpotThreshold", &Limits::hotSpotsThreshold, "0.5",
     "The hot spot check of portrait characteristics detects hot spots on skin and glasses caused by "
     "reflections within face area. The threshold determines the maximal acceptable value for the hot "
     "spot check in order to be iso compliant. The usefull range: 0 - 100. Available range: 0 - 12000"},
    {"EyesGazeFrontalThresholdBestPractice", &Limits::eyesGazeFrontalThreshold, "0.5",
     "Threshold to decide if eyes looking frontal to the camera. A higher threshold  will increase the "
     "false rejection rate (eyes gazing frontal, but classified as'none frontal'). Range: -FLT_MAX - "
     "FLT_MAX"},
    {"WearsGlassesThreshold", &Limits::wearsGlassesThreshold, "-0.8",
     "This threthold is only used for testing of noTintedGlasses. Tinted glasses can only be detected if "
     "wearsGlasses test returns true. May have another value than the wearsGlasseThreshold in "
     "FeatureTest. Thresholds for glasses weight determining whether the persons wears glasses. Higher "
     "threshold will lead to a higher false acceptance rate. (person wearing glasses but classified as "
     "'not wearing glasses'). The theoretical range of threshold is from -FLT_MAX - FLT_MAX"},
    {"TintedGlassesThreshold", &Limits::tintedGlassesThreshold, "33",
     "Threshold for tinted glasses determining whether the glasses are tinted or not. Higher threshold "
     "will lead to a higher false acceptance rate (tinted glasses classified as 'none tinted glasses'). "
     "Usefull range of threshold: -255 - 255"},
};

float number(const Component& component, const char* key) {
    return Value<Float>::get(component.subComponent(key));
}

} // namespace

std::list<Property> Boundaries::settingsOfThem() {
    const auto property = [](const char* key, const char* preset, const char* doc) {
        return Property(type<Float>(), key, preset, doc, false);
    };
    std::list<Property> properties{property(centerKey, "0.05", centerDoc)};
    for (const Setting& setting : settings)
        properties.push_back(property(setting.key, setting.preset, setting.doc));
    return properties;
}

Boundaries::Boundaries(const Component& component) {
    const FNCountedPtr<Limits> limits(new Limits);
    const float deviation = number(component, centerKey);
    limits->leftBoundCenteredFace = 0.5f - deviation;
    limits->rightBoundCenteredFace = 0.5f + deviation;
    for (const Setting& setting : settings) (*limits).*setting.limit = number(component, setting.key);
    limits_ = limits;
}

} // namespace Kx::ISO_19794_5::FullFrontal

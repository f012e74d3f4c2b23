#include "portrait_checks.h"

#include "output.h"

#include <array>
#include <cstdio>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using ISO_19794_5::FullFrontal::Boundaries;
using ISO_19794_5::FullFrontal::Compliance;

/// Limits of a number.
struct Allowed {
    std::optional<double> least, greatest;
    bool strict = false;
};
Allowed atLeast(double least) {
    return {least, {}};
}
Allowed atMost(double greatest) {
    return {{}, greatest};
}
Allowed above(double limit) {
    return {limit, {}, true};
}
Allowed below(double limit) {
    return {{}, limit, true};
}

struct Scale {
    double from, to;
};
/// Where nine of ten pictures of the labelled photos lie, and a little more.
constexpr Scale poses{-2, 2}, openness{-1.5, 1}, gazes{-40, 40}, mouths{-8, 8}, glassiness{-4, 4},
    lights{-8, 2}, tints{-100, 100}, spots{0, 200}, share{0, 1};

CheckedValue number(const char* name, const char* label, double value, const Allowed& allowed, Scale scale,
                    int decimals = 2) {
    return {name,           label,      value,    allowed.least, allowed.greatest,
            allowed.strict, scale.from, scale.to, decimals};
}

/// Who asks a test.
enum Level { Both, Required, Recommended };

/// Makes the checks of one portrait.
class Checks {
public:
    Checks(const Portrait::Characteristics& portrait, const Compliance& compliance)
        : compliance_(compliance), isColor_(portrait.isColor()) {}

    void group(const char* title) { group_ = title; }
    void add(const char* name, bool (Compliance::*test)() const, const char* title, Level level,
             const std::vector<CheckedValue>& values) {
        checks_.push_back(
            {name, title, group_, level != Recommended, level != Required, (compliance_.*test)(), values});
    }
    /// A test for colour pictures. @param values makes them
    template <class Values>
    void addColor(const char* name, bool (Compliance::*test)() const, const char* title, Level level,
                  Values values) {
        if (isColor_) return add(name, test, title, level, values());
        checks_.push_back({name, title, group_, level != Recommended, level != Required, {}, {}});
    }

    std::vector<PortraitCheck> take() { return std::move(checks_); }

private:
    const Compliance& compliance_;
    bool isColor_;
    const char* group_ = "";
    std::vector<PortraitCheck> checks_;
};

} // namespace

std::string CheckedValue::numberText(double number) const {
    std::array<char, 64> text;
    std::snprintf(text.data(), text.size(), "%.*f", decimals, number);
    return text.data();
}

std::string CheckedValue::limitsText() const {
    if (least && greatest)
        return *least == *greatest ? numberText(*least) : numberText(*least) + " to " + numberText(*greatest);
    if (least) return (strict ? "above " : "at least ") + numberText(*least);
    if (greatest) return (strict ? "below " : "at most ") + numberText(*greatest);
    return "";
}

std::vector<PortraitCheck> portraitChecks(const Portrait::Characteristics& portrait,
                                          const Compliance& compliance, const Boundaries& l) {
    const Portrait::Characteristics& p = portrait;
    using C = Compliance;
    const double w = p.width(), h = p.height(), widthOfHead = p.widthOfHead(),
                 lengthOfHead = p.lengthOfHead();
    Checks checks(p, compliance);

    checks.group("Picture");
    checks.add("onlyOneFaceVisible", &C::onlyOneFaceVisible, "One person alone", Both,
               {number("numberOfFaces", "", p.numberOfFaces(), {1, 1}, {0, 4}, 0)});
    const auto resolution = [&](double least) {
        return std::vector{number("widthOfHead", "", widthOfHead, atLeast(least), {0, 480}, 0)};
    };
    checks.add("resolution", &C::resolution, "Head width in pixels", Required, resolution(l.minHeadWidth()));
    checks.add("resolutionBestPractice", &C::resolutionBestPractice, "Head width in pixels", Recommended,
               resolution(l.minHeadWidthBestPractice()));
    checks.add(
        "imageWidthToHeightBestPractice", &C::imageWidthToHeightBestPractice,
        "Height to width of the picture", Recommended,
        {number("heightToWidth", "", h / w,
                {l.minWidthToHeightRatioBestPractice(), l.maxWidthToHeightRatioBestPractice()}, {0.8, 1.8})});
    checks.add("isSharp", &C::isSharp, "Sharpness", Both,
               {number("sharpness", "", p.sharpness(), atLeast(l.minimalSharpness()), share)});

    checks.group("Place of the head");
    checks.add("goodVerticalFacePosition", &C::goodVerticalFacePosition, "Eyes from above, in heights", Both,
               {number("verticalPosition", "", p.faceCenter().y / h,
                       {l.lowerBoundVerticalPosition(), l.upperBoundVerticalPosition()}, share)});
    checks.add("horizontallyCenteredFace", &C::horizontallyCenteredFace, "Eyes from the left, in widths",
               Both,
               {number("horizontalPosition", "", p.faceCenter().x / w,
                       {l.leftBoundCenteredFace(), l.rightBoundCenteredFace()}, share)});
    const auto width = [&](double least, double greatest) {
        return std::vector{number("widthOfHeadRatio", "", w / widthOfHead, {least, greatest}, {1, 3})};
    };
    checks.add("widthOfHead", &C::widthOfHead, "Width of the picture in heads", Required,
               width(l.minWidthOfHeadRatio(), l.maxWidthOfHeadRatio()));
    checks.add("widthOfHeadBestPractice", &C::widthOfHeadBestPractice, "Width of the picture in heads",
               Recommended, width(l.minWidthOfHeadRatioBestPractice(), l.maxWidthOfHeadRatioBestPractice()));
    const auto length = [&](double least, double greatest) {
        return std::vector{number("lengthOfHeadRatio", "", h / lengthOfHead, {least, greatest}, {0.8, 2.2})};
    };
    checks.add("lengthOfHead", &C::lengthOfHead, "Height of the picture in heads", Required,
               length(l.minLengthOfHeadRatio(), l.maxLengthOfHeadRatio()));
    checks.add("lengthOfHeadBestPractice", &C::lengthOfHeadBestPractice, "Height of the picture in heads",
               Recommended,
               length(l.minLengthOfHeadRatioBestPractice(), l.maxLengthOfHeadRatioBestPractice()));

    checks.group("Pose and expression");
    const auto frontal = [&](double roll, double deviation) {
        return std::vector{number("poseAngleRoll", "eye line", p.poseAngleRoll(), {-roll, roll}, {-0.4, 0.4}),
                           number("deviationFromFrontalPose", "turned away", p.deviationFromFrontalPose(),
                                  atMost(deviation), poses)};
    };
    checks.add("isFrontal", &C::isFrontal, "Looks straight ahead", Required,
               frontal(l.poseMaxRotation(), l.maxFrontalPoseDeviation()));
    checks.add("isFrontalBestPractice", &C::isFrontalBestPractice, "Looks straight ahead", Recommended,
               frontal(l.poseMaxRotationBestPractice(), l.maxFrontalPoseDeviationBestPractice()));
    // The openness and the gaze of eye0 are those of the eye on the right of the picture; its colours on the
    // left.
    const auto open = above(l.eyesOpenThreshold()), gaze = atLeast(l.eyesGazeFrontalThreshold());
    checks.add("eyesOpenBestPractice", &C::eyesOpenBestPractice, "Eyes open", Recommended,
               {number("eye1Open", "left eye", p.eye1Open(), open, openness),
                number("eye0Open", "right eye", p.eye0Open(), open, openness)});
    checks.add("eyesGazeFrontalBestPractice", &C::eyesGazeFrontalBestPractice, "Eyes look into the camera",
               Recommended,
               {number("eye1GazeFrontal", "left eye", p.eye1GazeFrontal(), gaze, gazes),
                number("eye0GazeFrontal", "right eye", p.eye0GazeFrontal(), gaze, gazes)});
    checks.add("mouthClosedBestPractice", &C::mouthClosedBestPractice, "Mouth closed", Recommended,
               {number("mouthClosed", "", p.mouthClosed(), atLeast(l.closedMouthThreshold()), mouths)});
    const auto tint = atMost(l.tintedGlassesThreshold());
    checks.add("noTintedGlasses", &C::noTintedGlasses, "No glasses, or clear ones", Both,
               {number("glasses", "glasses", p.glasses(), atMost(l.wearsGlassesThreshold()), glassiness),
                number("eye0Tinted", "left tint", p.eye0Tinted(), tint, tints, 1),
                number("eye1Tinted", "right tint", p.eye1Tinted(), tint, tints, 1)});

    checks.group("Light and colour");
    checks.add("goodExposure", &C::goodExposure, "Exposure of the face", Both,
               {number("exposure", "", p.exposure(), {l.lowExposerThreshold(), l.highExposerThreshold()},
                       {0, 255}, 1)});
    checks.add("goodGrayScaleProfile", &C::goodGrayScaleProfile, "Gray levels of the face", Both,
               {number("grayScaleDensity", "", p.grayScaleDensity(), atLeast(l.minimalGrayScaleBounding()),
                       {0, 256}, 0)});
    checks.add("isLightingUniform", &C::isLightingUniform, "Unevenness of the light", Both,
               {number("deviationFromUniformLighting", "", p.deviationFromUniformLighting(),
                       atMost(l.maxDeviationFromLighting()), lights)});
    checks.add("noHotSpots", &C::noHotSpots, "Glaring pixels", Both,
               {number("hotSpots", "", p.hotSpots(), below(l.hotSpotsThreshold()), spots, 1)});
    checks.addColor("hasNaturalSkinColour", &C::hasNaturalSkinColour, "Natural colour of the skin", Both,
                    [&] {
                        return std::vector{number("naturalSkinColour", "", p.naturalSkinColour(),
                                                  atLeast(l.minimalSkinColourRatio()), share)};
                    });
    checks.addColor("eyesNotRedBestPractice", &C::eyesNotRedBestPractice, "Eyes not red", Recommended, [&] {
        const auto red = atMost(l.eyesNotRedThreshold());
        return std::vector{number("eye0Red", "left eye", p.eye0Red(), red, share),
                           number("eye1Red", "right eye", p.eye1Red(), red, share)};
    });
    checks.add("isBackgroundUniformBestPractice", &C::isBackgroundUniformBestPractice, "Plain background",
               Recommended,
               {number("backgroundUniformity", "", p.backgroundUniformity(), above(0), share, 0)});
    return checks.take();
}

nlohmann::ordered_json checksJson(const std::vector<PortraitCheck>& checks) {
    using Json = nlohmann::ordered_json;
    constexpr int decimals = 4;
    Json list = Json::array();
    for (const PortraitCheck& check : checks) {
        Json& json = list.emplace_back();
        json["test"] = check.name;
        json["passed"] = check.passed ? Json(*check.passed) : Json();
        json["required"] = check.required;
        json["recommended"] = check.recommended;
        json["values"] = Json::object();
        for (const CheckedValue& value : check.values) {
            Json& entry = json["values"][value.name];
            entry["value"] = rounded(value.value, decimals);
            if (value.least) entry[value.strict ? "above" : "min"] = rounded(*value.least, decimals);
            if (value.greatest) entry[value.strict ? "below" : "max"] = rounded(*value.greatest, decimals);
        }
    }
    return list;
}

std::string checksText(const std::vector<PortraitCheck>& checks) {
    std::string text;
    for (const PortraitCheck& check : checks) {
        std::array<char, 128> head;
        std::snprintf(head.data(), head.size(), "\n  %-4s  %-11s  %-31s ",
                      !check.passed   ? "-"
                      : *check.passed ? "pass"
                                      : "FAIL",
                      check.required ? "required" : "recommended", check.title.c_str());
        text += head.data();
        std::string values;
        for (const CheckedValue& value : check.values)
            values += (values.empty() ? "" : ", ") + value.label + (value.label.empty() ? "" : " ") +
                      value.valueText() + " (" + value.limitsText() + ")";
        text += values.empty() ? "for colour pictures" : values;
    }
    return text;
}

} // namespace Orbek::Tool

#include "fakes.h"
#include "kx/annotated_set_enroller.h"
#include "kx/feature_test.h"
#include "kx/full_frontal_creator.h"
#include "kx/full_frontal_test.h"
#include "kx/set_enroller.h"
#include "kx/set_identifier.h"
#include "kx/set_recognizer.h"
#include "kx/stream_enroller.h"
#include "kx/stream_identifier.h"
#include "kx/stream_recognizer.h"
#include "kx/token_face.h"

#include <gtest/gtest.h>

namespace Kx {
namespace {

/// The type's name and description, and a line for each setting with its default, all below.
std::string listing(const Fn::Deployment::Component& component, const std::string& indent = "") {
    std::string text = component.type().id() + ": " + component.type().doc() + "\n";
    for (const Fn::Deployment::Component& setting : component.subComponents()) {
        const std::string name = setting.name().substr(setting.name().rfind('.') + 1);
        text += indent + name + " = " + setting.readDefault() + " ";
        text += setting.type().hasValue() ? "\n" : listing(setting, indent + "  ");
    }
    return text;
}

const std::string range =
    "EyeDistanceRange =  Eye::DistanceRange: Eye distance limitation range for face finder.\n"
    "  MinEyeDistance = 0.1 \n"
    "  MaxEyeDistance = 0.4 \n";

TEST(OperationSettings, HaveTheirNamesAndDefaults) {
    const std::pair<Fn::Deployment::Component, std::string> cases[] = {
        {Fakes::settings<StreamEnroller>(), "Kx::StreamEnroller: Enroller for image streams\n" + range +
                                                "MinNumOfSamples = 1 \n"
                                                "NumOfAcquisitions = 8 \n"
                                                "TotalEnrollmentTime = 60000 \n"
                                                "MinImageTime = 1000 \n"},
        {Fakes::settings<SetEnroller>(),
         "Kx::SetEnroller: Enroller for image streams\n" + range + "MinNumOfSamples = 1 \n"},
        {Fakes::settings<AnnotatedSetEnroller>(),
         "Kx::AnnotatedSetEnroller: Enroller for annotated sets of images\nMinNumOfSamples = 1 \n"},
        {Fakes::settings<StreamRecognizer>(),
         "Kx::StreamRecognizer: Recognizer/Verifier for image streams\n" + range +
             "MaxNumOfImages = 2147483647 \n"
             "ImagePeriod = 200 \n"
             "TotalTime = 10000 \n"
             "UseLifeCheck = false \n"},
        {Fakes::settings<SetRecognizer>(), "Kx::SetRecognizer: Recognizer for image sets.\n" + range},
        {Fakes::settings<AnnotatedSetRecognizer>(),
         "Kx::AnnotatedSetRecognizer: Recognizer for annotated image sets.\n"},
        {Fakes::settings<StreamIdentifier>(), "Kx::StreamIdentifier: Identifier for image streams\n" + range +
                                                  "TotalTime = 10000 \n"
                                                  "UseLifeCheck = false \n"
                                                  "LifeImagePeriod = 200 \n"},
        {Fakes::settings<SetIdentifier>(), "Kx::SetIdentifier: Identifier for image sets.\n" + range},
        {Fakes::settings<AnnotatedSetIdentifier>(),
         "Kx::AnnotatedSetIdentifier: Identifier for image sets.\n"},
    };
    for (const auto& [component, expected] : cases) {
        EXPECT_EQ(listing(component), expected);
        EXPECT_FALSE(component.type().hasValue()) << expected;
    }
}

TEST(CropSettings, HaveTheirDefaults) {
    const auto creator = Fakes::settings<FullFrontal::Creator>();
    const auto token = Fakes::settings<TokenFace::CropTokenImage>();
    const auto compliance = Fakes::settings<ISO_19794_5::FullFrontal::Test>();
    const auto feature = Fakes::settings<Feature::Test>();
    const struct {
        const Fn::Deployment::Component& component;
        std::vector<std::pair<const char*, const char*>> defaults;
    } cases[] = {
        {creator,
         {{"Scaling", "Disabled"},
          {"Scaling.Enabled.TargetWidth", "460"},
          {"HeadLengthToImageLengthRatio", "0.75"},
          {"ImageWidthStrategy", "AspectRatio"},
          {"ImageWidthStrategy.AspectRatio", "1.285714"},
          {"ImageWidthStrategy.HeadWidthToImageWidthRatio", "0.7"},
          {"HeadToImagePositionRatio", "0.55"},
          {"EnableISOTestForGeometricParameter", "true"},
          {"AllowRotation", "true"},
          {"PaddingRatio", "1"},
          {"PaddingColorRed", "192"},
          {"PaddingColorGreen", "192"},
          {"PaddingColorBlue", "192"},
          {"FaceGeometry.WidthOfHeadFactor", "2.2"},
          {"FaceGeometry.LengthOfHeadFactor", "3.436"},
          {"FaceGeometry.TopOfHeadFactor", "1.669"},
          {"FaceGeometry.BottomOfHeadFactor", "1.766"}}},
        {token,
         {{"PaddingRatio", "1"},
          {"PaddingColorRed", "192"},
          {"PaddingColorGreen", "192"},
          {"PaddingColorBlue", "192"}}},
        {compliance,
         {{"LowerBoundForVerticalPosition", "0.3"},
          {"UpperBoundForVerticalPosition", "0.5"},
          {"DeviationFromCenter", "0.05"},
          {"ImageMinWidthToHeadWidthRatio", "1.3333"},
          {"ImageMaxWidthToHeadWidthRatio", "2.0"},
          {"ImageMinWidthToHeadWidthRatioBestPractice", "1.4"},
          {"ImageMaxWidthToHeadWidthRatioBestPractice", "2.0"},
          {"ImageMinHeightToHeadLengthRatio", "1.1111"},
          {"ImageMaxHeightToHeadLengthRatio", "1.6666"},
          {"ImageMinHeightToHeadLengthRatioBestPractice", "1.25"},
          {"ImageMaxHeightToHeadLengthRatioBestPractice", "1.428"},
          {"ImageMinWidthToHeightRatioBestPractice", "1.25"},
          {"ImageMaxWidthToHeightRatioBestPractice", "1.34"},
          {"LowExposureThreshold", "63.75"},
          {"HighExposureThreshold", "191.25"},
          {"MinimalGrayScaleThreshold", "128"},
          {"MinSkinColourRatio", "0.7"},
          {"MaxFrontalPoseDeviation", "0.42"},
          {"MaxFrontalPoseDeviationBestPractice", "0.42"},
          {"DeviationFromUniformLightingThreshold", "-0.75"},
          {"MinOpenEyeThresholdBestPractice", "-0.67"},
          {"MaxRedEyeThresholdBestPractice", "0.18"},
          {"WearsGlassesThreshold", "-0.8"},
          {"TintedGlassesThreshold", "33"},
          {"PoseMaxRotationBestPractice", "0.0875"},
          {"MinHeadWidth", "180"},
          {"MinHeadWidthBestPractice", "240"},
          {"MinSharpness", "0.26"},
          {"ClosedMouthThresholdBestPractice", "0.5"},
          {"HotSpotThreshold", "0.5"},
          {"EyesGazeFrontalThresholdBestPractice", "0.5"}}},
        {feature, {{"WearsGlassesThreshold", "-0.8"}, {"IsMaleThreshold", "0"}}},
    };
    for (const auto& c : cases) {
        EXPECT_FALSE(c.component.type().hasValue()) << c.component.type().id();
        for (const auto& [path, value] : c.defaults) {
            Fn::Deployment::Component setting = c.component;
            std::istringstream names(path);
            for (std::string name; std::getline(names, name, '.');) setting = setting.subComponent(name);
            EXPECT_EQ(setting.readDefault(), value) << setting.name();
        }
    }
}

} // namespace
} // namespace Kx

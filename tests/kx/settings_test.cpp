#include "fakes.h"
#include "kx/annotated_set_enroller.h"
#include "kx/set_enroller.h"
#include "kx/set_identifier.h"
#include "kx/set_recognizer.h"
#include "kx/stream_enroller.h"
#include "kx/stream_identifier.h"
#include "kx/stream_recognizer.h"

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

const std::string range = "EyeDistanceRange =  Eye::DistanceRange: Eye distance limitation range for face finder.\n"
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
    for (const auto& [component, expected] : cases) EXPECT_EQ(listing(component), expected);
}

} // namespace
} // namespace Kx

#pragma once

#include "program.h"
#include "support/b7_setup.h"

/// The commands that know people, with a comparison of random weights.
class RecognitionToolWithModels : public B7Setup {
protected:
    static void SetUpTestSuite() {
        B7Setup::SetUpTestSuite();
        writeMappings();
        const std::string b7 = "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.";
        folder().write("b7.conf",
                       "ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n" + b7 +
                           "DataDir = " + folder().path().string() + "\n" + b7 +
                           "SampleSelector.SampleEvaluator.RegardDeviationFromFrontalPose = false\n");
    }

    static ProgramRun run(std::vector<std::string> arguments) {
        arguments.insert(arguments.end(), {"--config", folder().file("b7.conf")});
        return runOrbekJson(arguments);
    }
    static std::string image(const std::string& name) { return ORBEK_SOURCE_DIR "/examples/images/" + name; }
    /// A record of one picture.
    static std::string record(const ScratchFolder& scratch, const std::string& name) {
        const std::string file = scratch.file(name + ".fir");
        EXPECT_EQ(run({"enrol", "-o", file, image(name + ".jpg")}).status, 0);
        return file;
    }
};

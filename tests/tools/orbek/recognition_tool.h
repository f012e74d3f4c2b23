#pragma once

#include "cmp/b7_setup.h"
#include "cmp/mapping_files.h"
#include "program.h"

/// The commands that know people, with a comparison of random weights.
class RecognitionToolWithModels : public B7Setup {
protected:
    static void SetUpTestSuite() {
        B7Setup::SetUpTestSuite();
        const auto write = [](const std::string& name, float first, float last, float xMax) {
            const Fn::InvertibleFunction<float, float> mapping(FNVector<float>(std::vector{first, last}), 0,
                                                               xMax);
            Cmp::Implementation::writeMappingFile(mapping, folder().file(name));
        };
        write("smap-b7.dat", 0, 1, 4000);
        write("smap-b7-sn.dat", 0, 1, 10); // normalized
        for (const std::string names : {"b7.dat", "b7-sn.dat"}) {
            write("farmap-" + names, 1, 0, 1);
            write("frrmap-" + names, 0, 0.5f, 1);
        }
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

#include "cmp/b7/settings.h"

#include "cmp/portrait/analyzer.h"
#include "eye/boca/mouth_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/raiz/bridge_finder.h"

namespace Cmp::B7 {

using namespace Fn::Deployment;
using Implementation::MappingFiles;

namespace {

template <class T> auto valueOf(const Component& component, const char* key) {
    return Value<T>::get(component.subComponent(key));
}

bool normalizes(const Component& component) {
    return valueOf<Alternative<ScoreNormalization>>(component, "ScoreNormalization") == "Enabled";
}

MappingFiles mappingFiles(const Component& component) {
    const Component choice = component.subComponent("ScoreNormalization");
    return {valueOf<String>(component, "DataDir"),
            choice.subComponent(normalizes(component) ? "Enabled" : "Disabled")};
}

std::list<Property> mappingProperties(const std::string& set) {
    return MappingFiles::properties(
        {"smap-" + set + ".dat", "farmap-" + set + ".dat", "frrmap-" + set + ".dat"});
}

[[noreturn]] void failInvalid(const std::string& value, const std::string& what) {
    FN_THROW(FNEBadArg, "CmpAlgorithm(): " + value + " is invalid value for " + what);
}

} // namespace

Type ScoreNormalizationDisabled::define() {
    return Type(typeId(), "B7 comparison algorithm mapping files (scores not normalized)",
                mappingProperties("b7"), "", false);
}

Type ScoreNormalizationEnabled::define() {
    return Type(typeId(), "B7 comparison algorithm mappings files (scores normalized)",
                mappingProperties("b7-sn"), "", false);
}

Type ScoreNormalization::define() {
    const auto choice = []<class T>(const char* name, T) {
        return property<T>::create(name, type<T>().doc());
    };
    return Type(typeId(), "Enables/disables score normalization",
                Fn::Deployment::properties(choice("Disabled", ScoreNormalizationDisabled()),
                                           choice("Enabled", ScoreNormalizationEnabled())),
                "", false);
}

SampleSelector::SampleSelector(const Component& component)
    : evaluator(component.subComponent("SampleEvaluator")),
      strictLandmarks(valueOf<Bool>(component, "StrictLandmarkLocalization")),
      qualityFraction(valueOf<Float>(component, "SampleQualityFraction")),
      maxSamples(valueOf<UInt>(component, "MaxSamples")) {
    if (!(qualityFraction >= 0 && qualityFraction <= 1))
        failInvalid(Float::valueToString(qualityFraction), "SampleQualityFraction [0 <= value <= 1]");
    if (maxSamples == 0) failInvalid("0", "MaxSamples");
}

Type SampleSelector::define() {
    return Type(
        typeId(), "Selection of samples for FIR generation",
        Fn::Deployment::properties(
            property<SampleEvaluator>::create(
                "SampleEvaluator",
                "Evaluates the quality of the facial image samples according to the algorithm requirements"),
            propertyWithDefault<Bool>::create("StrictLandmarkLocalization", true,
                                              "Accept only those faces both eyes of which are located."),
            propertyWithDefault<Float>::create(
                "SampleQualityFraction", 0.9f,
                "Accept only those frames the quality of which is better than the quality of the best frame "
                "multiplied by qualityFraction."),
            propertyWithDefault<UInt>::create(
                "MaxSamples", 32u, "The maximal number of good quality samples to collect and process.")),
        "", false);
}

std::list<Property> Settings::properties() {
    return Fn::Deployment::properties(
        propertyWithDefault<String>::create("DataDir", "$INSTALLDIR/etc/cmp",
                                            "Path of the directory which contains the mapping files."),
        propertyWithDefault<String>::create("TransfFile", "trans-b7.dat",
                                            "Name of GCmpAlgorithm transformer file"),
        propertyWithDefault<Int>::create(
            "MaxNumOfClusters", 5, "Maximum number of feature vectors used to constitute a reference set"),
        property<Eye::Ojo::T8::EyesFinder>::create("EyesFinder", "Eyes Finder"),
        property<Eye::Boca::MouthFinder>::create("MouthFinder", "Mouth finder"),
        property<Eye::Raiz::BridgeFinder>::create("BridgeFinder", "Bridge of the nose finder"),
        property<Portrait::Analyzer>::create("PortraitAnalyzer", "Portrait analyzer facility"),
        property<Alternative<ScoreNormalization>>::create("ScoreNormalization",
                                                          "Enables/disables score normalization"),
        propertyWithDefault<String>::create("FIRVersion", "11.0", "Version of the FIRs created by B7."),
        propertyWithDefault<Bool>::create(
            "ProcessTwoItemsAtOnce", true,
            "Enables speed optimization: process two items at once (default: enabled)"),
        property<SampleSelector>::create("SampleSelector",
                                         "Selects a configurable number of best samples for FIR generation "
                                         "in order to reduce the encoding load."));
}

Settings::Settings(const Component& component)
    : transformationFile(Implementation::pathInFolder(valueOf<String>(component, "DataDir"),
                                                      valueOf<String>(component, "TransfFile"))),
      maxNumberOfClusters(
          static_cast<unsigned int>(std::max(valueOf<Int>(component, "MaxNumOfClusters"), 1))),
      normalizeScores(normalizes(component)), mappings(mappingFiles(component)),
      firVersion(valueOf<String>(component, "FIRVersion")),
      twoItemsAtOnce(valueOf<Bool>(component, "ProcessTwoItemsAtOnce")),
      selector(component.subComponent("SampleSelector")) {}

} // namespace Cmp::B7

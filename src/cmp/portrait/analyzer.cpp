#include "cmp/portrait/analyzer.h"

#include "cmp/portrait/age_cascade.h"
#include "cmp/portrait/analyzer_implementation.h"
#include "cmp/portrait/characteristics_implementation.h"
#include "fn/deployment/leaf_values.h"

#include <fstream>

namespace Cmp::Portrait {

using namespace Fn::Deployment;

namespace {

constexpr const char *directoryKey = "DataDir", *spharKey = "SpharTransformatorFile";

Property file(const std::string& key, const std::string& name, const std::string& doc) {
    return propertyWithDefault<String>::create(key, name, doc);
}

/// The files of the age cascade.
struct AgeFiles {
    static std::string typeId() { return "Cmp::Portrait::Analyzer::AgeDiscFiles"; }
    static Type define() {
        const auto property = [](const AgeEstimator& e) { return file(e.key, e.file, e.doc); };
        std::list<Property> files{property(primaryAgeEstimator())};
        for (const AgeStage& stage : laterAgeStages())
            for (const AgeEstimator& estimator : stage) files.push_back(property(estimator));
        return Type(typeId(), "Data files for the age discriminator.", files, "", false);
    }
};

/// The component at a dotted path below another.
Component descendant(const Component& component, const std::string& path) {
    const std::size_t dot = path.find('.');
    if (dot == std::string::npos) return component.subComponent(path);
    return descendant(component.subComponent(path.substr(0, dot)), path.substr(dot + 1));
}

} // namespace

Type Analyzer::define() {
    return Type(typeId(), "Portrait Analyzer",
                properties(file(directoryKey, "$INSTALLDIR/etc/portrait", "Portrait analyzer data directory"),
                           file("GlassesDiscFile", "gldisc.dat", "Glasses discriminator data file"),
                           file("FrontalPoseDiscFile", "fpdisc.dat", "Frontal pose discriminator data file"),
                           file("ChinEstFile", "chinest.dat", "Chin estimator data file"),
                           file("CrownEstFile", "crownest.dat", "Crown estimator data file"),
                           file("LeftEarEstFile", "learest.dat", "Left ear estimator data file"),
                           file("RightEarEstFile", "rearest.dat", "Right ear estimator data file"),
                           file("GenderDiscFile", "gedisc.dat", "Gender discriminator data file"),
                           file("ClosedEyeDiscFile", "cedisc.dat", "Closed eye discriminator data file"),
                           file("GazeAwayDiscFile", "gadisc.dat", "Gaze away discriminator data file"),
                           file("EthnicityBDiscFile", "ethbdisc.dat", "Ethnicity discriminator file black"),
                           file("EthnicityWDiscFile", "ethwdisc.dat", "Ethnicity discriminator file white"),
                           file("EthnicityADiscFile", "ethadisc.dat", "Ethnicity discriminator file asian"),
                           file("OpenMouthDiscFile", "cmdisc.dat", "Open mouth discriminator data file"),
                           file("LightingUniformityDiscFile", "ludisc.dat",
                                "Lighting uniformity discriminator data file"),
                           file(spharKey, "sphartr.dat", "Spherical Harmonics Transformation data file"),
                           property<AgeFiles>::create(ageFilesKey, "Data files for the age discriminator.")),
                "", false);
}

Analyzer::Analyzer(const Component& component) : implementation_(new Implementation(component)) {}

Analyzer::Analyzer(const Analyzer&) = default;
Analyzer& Analyzer::operator=(const Analyzer&) = default;
Analyzer::~Analyzer() = default;

Characteristics Analyzer::analyze(const Face& face) const {
    return Characteristics::Implementation::make(implementation_, face, face.image().isColor());
}

Characteristics Analyzer::analyzeColor(const Face& face) const {
    return Characteristics::Implementation::make(implementation_, face, true);
}

Characteristics Analyzer::analyzeGrayScale(const Face& face) const {
    return Characteristics::Implementation::make(implementation_, face, false);
}

Characteristics Analyzer::analyze(const Face& face, const AdditionalAnnotations& annotations) const {
    return Characteristics::Implementation::make(implementation_, face, face.image().isColor(), annotations);
}

Characteristics Analyzer::analyzeColor(const Face& face, const AdditionalAnnotations& annotations) const {
    return Characteristics::Implementation::make(implementation_, face, true, annotations);
}

Characteristics Analyzer::analyzeGrayScale(const Face& face, const AdditionalAnnotations& annotations) const {
    return Characteristics::Implementation::make(implementation_, face, false, annotations);
}

void Analyzer::readAll() const {
    implementation_->readAll();
}

std::string Analyzer::Implementation::pathOf(const std::string& key) const {
    const auto text = [&](const std::string& path) {
        return Value<String>::get(descendant(component_, path));
    };
    return text(directoryKey) + "/" + text(key);
}

template <class Read> auto Analyzer::Implementation::readFile(const std::string& key, Read read) const {
    const std::string path = pathOf(key);
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "Could not open data file " + path + " for reading");
    try {
        return read(stream);
    } catch (const FNException& e) {
        FN_THROW(FNEGeneric, "Error " + std::string(e.what()) + " when reading data file " + path);
    } catch (const std::exception& e) {
        FN_THROW(FNEIOError, "Could not read data file " + path + ": " + e.what());
    }
}

const Eye::SVMFPDiscriminator& Analyzer::Implementation::discriminator(const std::string& key) const {
    // Lower than any score, so that no evaluation is left early.
    constexpr double threshold = std::numeric_limits<double>::lowest();
    const auto read = [&](std::istream& stream) { return Eye::SVMFPDiscriminator(stream, threshold); };
    const auto slot = [&]() -> const MadeOnDemand<Eye::SVMFPDiscriminator>& {
        const FNMutexLock lock(mutex_);
        return discriminators_[key];
    };
    return slot().get(mutex_, [&] { return readFile(key, read); });
}

float Analyzer::Implementation::score(const std::string& key, const FNVector<float>& features) const {
    const Eye::SVMFPDiscriminator& discriminator = this->discriminator(key);
    if (discriminator.dimension() != features.size())
        FN_THROW(FNEGeneric, "Error Support vectors of " + std::to_string(discriminator.dimension()) +
                                 " instead of " + std::to_string(features.size()) +
                                 " values when reading data file " + pathOf(key));
    double score = 0;
    discriminator(Img::FeatureVector<float>(features), score);
    return static_cast<float>(score);
}

float Analyzer::Implementation::age(const FNVector<float>& features) const {
    return ageOfCascade([&](const AgeEstimator& estimator) {
        return score(std::string(ageFilesKey) + "." + estimator.key, features);
    });
}

const SpharTransformator& Analyzer::Implementation::sphar() const {
    return sphar_.get(mutex_, [&] {
        return readFile(spharKey, [](std::istream& stream) { return SpharTransformator(stream); });
    });
}

FNVector<float> Analyzer::Implementation::lightingCoefficients(const FNImage<float>& window) const {
    return sphar()(window);
}

void Analyzer::Implementation::readAll() const {
    for (const Property& file : type<Analyzer>().properties())
        if (const std::string& key = file.name();
            key != directoryKey && key != spharKey && key != ageFilesKey)
            discriminator(key);
    for (const Property& file : type<AgeFiles>().properties())
        discriminator(std::string(ageFilesKey) + "." + file.name());
    sphar();
}

} // namespace Cmp::Portrait

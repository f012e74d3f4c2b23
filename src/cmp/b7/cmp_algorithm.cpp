#include "cmp/b7/cmp_algorithm.h"

#include "cmp/b7/feature_set_builder.h"
#include "cmp/b7/packed_scoring.h"
#include "cmp/b7/score_normalization.h"
#include "cmp/gallery_walk.h"
#include "cmp/portrait/analyzer.h"
#include "eye/boca/mouth_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/raiz/bridge_finder.h"

namespace Cmp::B7 {

using namespace Implementation;
using Fn::Deployment::Component;

namespace {

template <class Finder, class Body> Finder finder(const Component& component, const char* key) {
    return Finder(FNCountedPtr<typename Finder::Body>(new Body(component.subComponent(key))));
}

Finders configuredFinders(const Component& component) {
    return {finder<::EyesFinder, Eye::Ojo::T8::EyesFinder>(component, "EyesFinder"),
            finder<::MouthFinder, Eye::Boca::MouthFinder>(component, "MouthFinder"),
            finder<::BridgeFinder, Eye::Raiz::BridgeFinder>(component, "BridgeFinder"),
            [analyzer = Portrait::Analyzer(component.subComponent("PortraitAnalyzer"))](
                const Face& face, const SampleEvaluator::Regarded& regarded) {
                const Portrait::Characteristics portrait = analyzer.analyze(face);
                PortraitMeasures measures;
                if (regarded.sharpness) measures.sharpness = portrait.sharpness();
                if (regarded.deviationFromFrontalPose)
                    measures.deviationFromFrontalPose = portrait.deviationFromFrontalPose();
                return measures;
            }};
}

} // namespace

CmpAlgorithm::CmpAlgorithm(const Component& component)
    : CmpAlgorithm(component, configuredFinders(component)) {}
CmpAlgorithm::CmpAlgorithm(const Component& component, const Finders& finders)
    : core_(new Core(Settings(component), finders)) {}
CmpAlgorithm::CmpAlgorithm(const CmpAlgorithm&) = default;
CmpAlgorithm::~CmpAlgorithm() = default;

Fn::Deployment::Type CmpAlgorithm::define() {
    return Fn::Deployment::Type(typeId(), "B7 comparison algorithm", Settings::properties(), "", false);
}

std::string CmpAlgorithm::name() const {
    return core_->records().label();
}

RecordBuilder CmpAlgorithm::createRecordBuilder() const {
    return RecordBuilder(FNCountedPtr<RecordBuilder::Body>(new FeatureSetBuilder(core_)));
}

FIR CmpAlgorithm::merge(const std::list<FIR>& earlier, const FIR& added) const {
    if (earlier.empty()) return added;
    Core::Features features;
    for (const FIR& record : earlier) core_->decode(record, features);
    core_->decode(added, features);
    return core_->record(features);
}

float CmpAlgorithm::one2one(const FIR& first, const FIR& second) const {
    const FNCountedPtr<PreparedProbes> probe(new PreparedProbes(core_, {&first, 1}));
    float result;
    PackedScorer(probe).score(core_->records().record(second), nullptr, {&result, 1});
    return result;
}

Population CmpAlgorithm::createPopulation(unsigned int capacity) const {
    return Population(FNCountedPtr<Population::Body>(new FeatureSets<Core::Records::Record>(capacity)));
}

std::list<GalleryIterator> CmpAlgorithm::prepareFew2Many(const std::vector<FIR>& probes,
                                                         const Fn::View<Population>::Iterator& populations,
                                                         unsigned int partitions) const {
    const FNCountedPtr<PreparedProbes> prepared(new PreparedProbes(core_, probes));
    return walkGallery(populations, partitions, probes.size(), GalleryComparer(core_, prepared), "Pcld");
}

RawMatches CmpAlgorithm::normalizeRawScores(const RawMatches& matches,
                                            const ScoreHistogram& distribution) const {
    return B7::normalizeRawScores(matches, distribution);
}

FNCountedPtr<ScoreMapping> CmpAlgorithm::scoreMapping() const {
    return core_->settings().mappings.scoreMapping();
}

FNCountedPtr<RatesMapping> CmpAlgorithm::ratesMapping() const {
    return core_->settings().mappings.ratesMapping();
}

FloatingPointFeature CmpAlgorithm::processSample(FNImageReference const& image,
                                                 Fn::Optional<FNImage<float>> const& warped,
                                                 FNPos const& leftEye, FNPos const& rightEye,
                                                 FNPos const& mouth, FNPos const& bridge) const {
    return core_->processSample(image, warped, leftEye, rightEye, mouth, bridge);
}

FIR CmpAlgorithm::record(const std::vector<FloatingPointFeature>& features) const {
    return core_->record(features);
}

FNImage<float> CmpAlgorithm::reconstructSample(FNVector<float> const&) const {
    FN_THROW(FNEBadArg, "CmpAlgorithm::reconstructSample: not implemented");
}

} // namespace Cmp::B7

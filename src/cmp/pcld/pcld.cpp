#include "cmp/pcld/pcld.h"

#include "cmp/clustering.h"
#include "cmp/encoded_records.h"
#include "cmp/gallery_walk.h"
#include "cmp/pcld/rank_tables.h"
#include "cmp/reshape.h"
#include "cmp/unrated_builder.h"

#include <cmath>
#include <functional>
#include <memory>
#include <numbers>

namespace Cmp::Implementation {

using Pcld::FloatingPointFeature;
using Features = std::vector<FloatingPointFeature>;
using Records = EncodedRecords<PCLD, Pcld::Encoder>;

namespace {

constexpr const char* module = "PCLD";

constexpr unsigned int l5Side = 80;
constexpr FNPos l5Target(24, 29.333334f);

using FeatureMaker = std::function<FloatingPointFeature(const FNVector<float>&)>;

/// The walk of clustering, for features of length 1.
class Cluster {
public:
    /// @param makeFeature from a vector of length 1
    Cluster(const FloatingPointFeature& centre, const FeatureMaker& makeFeature)
        : centre_(centre), sum_(centre.vector.size(), 0.0f), makeFeature_(&makeFeature) {}

    float similarity(const FloatingPointFeature& feature) const { return Pcld::score(feature, centre_); }
    void add(const FloatingPointFeature& feature) { sum_ += feature.vector; }
    bool settle() {
        constexpr float stable = 1.1920929e-05f;
        const float length = std::sqrt(sum_ * sum_);
        if (length == 0) return true;
        const FNVector<float> mean = sum_ / length;
        sum_.fill(0);
        if (std::abs(1 - mean * centre_.vector) <= stable) return true;
        centre_ = (*makeFeature_)(mean);
        return false;
    }
    const FloatingPointFeature& centre() const { return centre_; }

private:
    FloatingPointFeature centre_;
    FNVector<float> sum_;
    const FeatureMaker* makeFeature_;
};

} // namespace

/// What the algorithm, its builders and its iterators share.
class PCLD::Core {
public:
    using Feature = FloatingPointFeature;

    explicit Core(const L5Settings& settings)
        : preprocessor_(initializePreprocessor(settings.preprocessor, l5Params(settings.direction))),
          mappings_(settings.mappings),
          transformation_(transformations_.get(settings.transformationFile,
                                               [&](const std::string& path) {
                                                   return Pcld::Transformation::read(
                                                       path, preprocessor_->featureSize());
                                               })),
          maxNumberOfClusters_(std::max(settings.maxNumberOfClusters, 1)) {
        if (settings.encoding != "FloatEncoding") FN_THROW(FNEBadArg, "Encoder not known.");
        if (!settings.isotropisationFile.empty())
            isotropisation_ =
                isotropisationData_.get(settings.isotropisationFile, Pcld::readIsotropisationData);
        RecordForm form;
        form.label = settings.firVersion + " " + preprocessor_->algorithmName() + settings.strategyName;
        form.module = module;
        form.header.assign(3, RecordForm::Field::Float);
        const FNCountedPtr<const Pcld::Encoder> encoder(
            new Pcld::FloatEncoder(transformation_->matrix.cols()));
        records_ = std::make_unique<const Records>(form, encoder);
    }

    const Records& records() const { return *records_; }
    const Pcld::Encoder& encoder() const { return records_->encoder(); }
    const MappingFiles& mappings() const { return mappings_; }

    FNVector<float> processSample(const FNImageReference& image, FNPos left, FNPos right) const {
        return (*transformation_)((*preprocessor_)(l5Face(image, left, right)));
    }
    Feature extract(const FNImageReference& image, FNPos left, FNPos right) const {
        return Feature(processSample(image, left, right), isotropisation_.get(), false);
    }

    /// A record of the centres that features cluster around.
    FIR record(const Features& features) const {
        const FeatureMaker makeFeature = [&](const FNVector<float>& unit) {
            return Feature(unit, isotropisation_.get(), true);
        };
        Features centres;
        for (const Cluster& c :
             cluster<Cluster>(features, static_cast<std::size_t>(maxNumberOfClusters_), makeFeature))
            centres.push_back(c.centre());
        return records_->encode(centres);
    }
    FIR largestRecord() const {
        return records_->encode(
            Features(static_cast<std::size_t>(maxNumberOfClusters_), encoder().createRawType()));
    }
    FIR readRecord(const Fn::Package& package) const { return records_->read(package); }
    FIR readRecord(unsigned char*& memory) const { return records_->read(memory); }

    /// Appends the features of a record. @throws std::bad_cast, FNEBadArg for a record that is not of this
    /// algorithm
    void decode(const FIR& record, Features& features) const {
        records_->decode(record, encoder().createRawType(), features);
    }

private:
    SharedFiles<Pcld::Transformation> transformations_;
    SharedFiles<Pcld::IsotropisationData> isotropisationData_;
    FNCountedPtr<const Pcld::Preprocessor> preprocessor_;
    MappingFiles mappings_;
    FNCountedPtr<const Pcld::Transformation> transformation_;
    FNCountedPtr<const Pcld::IsotropisationData> isotropisation_; ///< null for none
    std::unique_ptr<const Records> records_;
    int maxNumberOfClusters_;
};

namespace {

/// One record at a time against all probes.
class Comparer {
public:
    using Record = Records::Record;
    using Core = PCLD::Core;
    using Probes = FNCountedPtr<const std::vector<Features>>;

    Comparer(const FNCountedPtr<const Core>& core, const Probes& probes) : core_(core), probes_(probes) {}

    std::size_t itemsAtOnce() const { return 1; }
    void load(std::size_t, const Record& record) {
        count_ = core_->records().demandSize(record).count();
        while (features_.size() < count_) features_.push_back(core_->encoder().createRawType());
        for (std::size_t i = 0; i < count_; ++i) core_->encoder().decode(record.feature(i), features_[i]);
    }
    void compare(std::span<GalleryIterator::Item> items) {
        Pcld::score(*probes_, features_, count_, items.front().scores);
    }
    const std::vector<ScoreHistogram>* distributions() const { return nullptr; }

private:
    FNCountedPtr<const Core> core_;
    Probes probes_;
    Features features_; ///< the first count_ are the loaded record's
    std::size_t count_ = 0;
};

} // namespace

PCLD::PCLD(const L5Settings& settings) : core_(new Core(settings)) {}
PCLD::PCLD(const PCLD&) = default;
PCLD::~PCLD() = default;

std::string PCLD::name() const {
    return core_->records().label();
}

RecordBuilder PCLD::createRecordBuilder() const {
    return RecordBuilder(FNCountedPtr<RecordBuilder::Body>(new UnratedRecordBuilder<Core>(core_)));
}

FIR PCLD::merge(const std::list<FIR>& earlier, const FIR& added) const {
    Features features;
    for (const FIR& record : earlier) core_->decode(record, features);
    core_->decode(added, features);
    return core_->record(features);
}

float PCLD::one2one(const FIR& first, const FIR& second) const {
    std::vector<Features> probe(1);
    Features gallery;
    core_->decode(first, probe.front());
    core_->decode(second, gallery);
    float result = 0;
    Pcld::score(probe, gallery, gallery.size(), {&result, 1});
    return result;
}

Population PCLD::createPopulation(unsigned int capacity) const {
    return Population(FNCountedPtr<Population::Body>(new FeatureSets<Records::Record>(capacity)));
}

std::list<GalleryIterator> PCLD::prepareFew2Many(const std::vector<FIR>& probes,
                                                 const Fn::View<Population>::Iterator& populations,
                                                 unsigned int partitions) const {
    std::vector<Features> decoded(probes.size());
    for (std::size_t p = 0; p < probes.size(); ++p) core_->decode(probes[p], decoded[p]);
    const Comparer comparer(core_, Comparer::Probes(new std::vector<Features>(decoded)));
    return walkGallery(populations, partitions, probes.size(), comparer, "Pcld");
}

FNCountedPtr<ScoreMapping> PCLD::scoreMapping() const {
    return core_->mappings().scoreMapping();
}

FNCountedPtr<RatesMapping> PCLD::ratesMapping() const {
    return core_->mappings().ratesMapping();
}

FNVector<float> PCLD::processSample(const FNImageReference& image, const FNPos& leftEye,
                                    const FNPos& rightEye) const {
    return core_->processSample(image, leftEye, rightEye);
}

namespace {

template <class Made, class Params>
FNCountedPtr<const Pcld::Preprocessor> make(const Params& params, const std::string& type) {
    return FNCountedPtr<const Pcld::Preprocessor>(new Made(params, type));
}

[[noreturn]] void failIncompatible(const std::string& type, const char* params) {
    FN_THROW(FNEBadArg, "PCLD: Configured preprocessor " + type +
                            " is not compatible for initialization with " + params + "::Params!");
}

} // namespace

FNCountedPtr<const Pcld::Preprocessor>
PCLD::initializePreprocessor(const PreprocessorType& type,
                             const Pcld::GaborPyrRankNormProcessor::Params& params) {
    if (type == "GPyrRankNormNoPreproc") return make<Pcld::GPyrRankNormNoPreprocessor>(params, type);
    if (type == "B4Preprocessor") return make<Pcld::B4Preprocessor>(params, type);
    failIncompatible(type, "GaborPyrRankNormProcessor");
}

FNCountedPtr<const Pcld::Preprocessor>
PCLD::initializePreprocessor(const PreprocessorType& type, const Pcld::GaborPyrProcessor::Params& params) {
    if (type == "GPyr") return make<Pcld::GPyrPreprocessor>(params, type);
    if (type == "GPyrENRLH") return make<Pcld::GPyrNRLHPreprocessor>(params, type);
    if (type == "GPyrNoPreproc") return make<Pcld::GPyrNoPreprocessor>(params, type);
    failIncompatible(type, "GaborPyrProcessor");
}

Pcld::GaborPyrRankNormProcessor::Params l5Params(char direction) {
    const auto& table = direction == 'x' ? Pcld::rankTableX : Pcld::rankTableZ;
    return {l5Side, l5Side, 2, 7, 8,           4.0f, 8, 8, 0, static_cast<float>(2 * std::numbers::pi),
            1,      1,      1, 1, table.data()};
}

FNImage<float> l5Face(const FNImageReference& image, const FNPos& leftEye, const FNPos& rightEye) {
    return reshape<float>(image.toMonoFloat(), leftEye, rightEye, l5Side, l5Side, l5Target, true, 1.0f).first;
}

} // namespace Cmp::Implementation

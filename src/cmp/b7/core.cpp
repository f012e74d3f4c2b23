#include "cmp/b7/core.h"

#include "cmp/b7/reshape_warp.h"
#include "cmp/clustering.h"

#include <cmath>

namespace Cmp::B7 {

using Implementation::RecordForm;

namespace {

RecordForm recordForm(const std::string& version) {
    RecordForm form;
    form.label = "B7-0 FIR" + version;
    form.module = "PCLD";
    form.header.assign(3, RecordForm::Field::Float);
    return form;
}

/// The walk of clustering by the means of features.
class Cluster {
public:
    explicit Cluster(const FloatingPointFeature& centre)
        : centre_(centre), sum_(centre.vector.size(), 0.0f) {}

    float similarity(const FloatingPointFeature& feature) const { return feature.score(centre_); }
    void add(const FloatingPointFeature& feature) {
        sum_ += feature.vector;
        ++count_;
    }
    bool settle() {
        constexpr float stable = 1.1920929e-5f;
        if (count_ == 0) return true;
        const FNVector<float> mean = sum_ / static_cast<float>(count_), move = mean - centre_.vector;
        sum_.fill(0);
        count_ = 0;
        if (!(std::sqrt(std::abs(move * move)) > stable)) return true;
        centre_ = {mean, 0, 1};
        return false;
    }
    const FloatingPointFeature& centre() const { return centre_; }

private:
    FloatingPointFeature centre_;
    FNVector<float> sum_;
    int count_ = 0;
};

} // namespace

Core::Core(const Settings& settings, const Finders& finders)
    : settings_(settings), finders_(finders),
      records_(recordForm(settings.firVersion), FNCountedPtr<const Encoder>(new Encoder)),
      transformation_(transformations_.get(settings.transformationFile, [&](const std::string& path) {
          return Transformation::read(path, PreProcessor::computeFeatureVectorSize(), encoder().components());
      })) {}

FloatingPointFeature Core::processSample(FNImageReference const& image,
                                         Fn::Optional<FNImage<float>> const& warped, FNPos const& leftEye,
                                         FNPos const& rightEye, FNPos const& mouth,
                                         FNPos const& bridge) const {
    float padding;
    const FNImage<float> face =
        warped.isSet() ? *warped
                       : reshapeWarp(image.toMonoFloat(), leftEye, rightEye, mouth, bridge, padding);
    return {(*transformation_)(preProcessor_(face)), 0, 1};
}

FIR Core::record(const Features& features) const {
    Features centres;
    for (const Cluster& c : Implementation::cluster<Cluster>(features, settings_.maxNumberOfClusters))
        centres.push_back(c.centre());
    return records_.encode(centres);
}

FIR Core::largestRecord() const {
    return records_.encode(Features(settings_.maxNumberOfClusters, encoder().createRawType()));
}

} // namespace Cmp::B7

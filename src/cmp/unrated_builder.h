#pragma once

#include "cmp/record_builder.h"

#include <map>
#include <vector>

namespace Cmp::Implementation {

/// Builder of generations that do not rate samples: features in the order in which their samples came.
///
/// @tparam Algorithm has a class Feature, extract(image, left eye, right eye) that gives one, and for records
/// record(features), readRecord(package), readRecord(memory) and largestRecord(), which has as many features
/// as one can have
template <class Algorithm> class UnratedRecordBuilder final : public RecordBuilder::Body {
public:
    explicit UnratedRecordBuilder(const FNCountedPtr<const Algorithm>& algorithm) : algorithm_(algorithm) {}

    /// @throws FNEBadFunCall if image or eyes are missing
    int pushSample(const Sample& sample) override {
        if (!sample.intensityImage || !sample.leftEye || !sample.rightEye)
            FN_THROW(FNEBadFunCall, "Optional data accessed but not set!");
        features_.emplace(next_,
                          algorithm_->extract(*sample.intensityImage, *sample.leftEye, *sample.rightEye));
        return next_++;
    }
    void removeSample(int handle) override { features_.erase(handle); }
    Quality quality() const override { return {}; }
    Face bestFace() const override { return {}; }
    FIR generate() override {
        if (features_.empty()) FN_THROW(FNEBadFunCall, "No faces provided to FIR generation!");
        std::vector<typename Algorithm::Feature> features;
        for (const auto& [handle, feature] : features_) features.push_back(feature);
        const FIR record = algorithm_->record(features);
        clear();
        return record;
    }
    void clear() override { features_.clear(); }
    std::size_t dumpSize() const override { return algorithm_->largestRecord().serialize().size(); }
    std::size_t numberOfSamples() const override { return features_.size(); }
    FIR create(const Fn::Package& package) const override { return algorithm_->readRecord(package); }
    FIR createFromMemento(unsigned char*& memory) const override { return algorithm_->readRecord(memory); }
    FIR createVoid() const override { return algorithm_->record({}); }

private:
    FNCountedPtr<const Algorithm> algorithm_;
    int next_ = 0;
    std::map<int, typename Algorithm::Feature> features_;
};

} // namespace Cmp::Implementation

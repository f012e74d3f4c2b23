#pragma once

#include "cmp/b7/core.h"
#include "cmp/b7/sample_selection.h"

namespace Cmp::B7 {

/// Builds B7 records: rates each sample, keeps the best, and extracts their features when a record is asked
/// for. The features stay until clear(), so that a second record costs little.
class FeatureSetBuilder final : public RecordBuilder::Body {
public:
    explicit FeatureSetBuilder(const FNCountedPtr<const Core>& core)
        : core_(core), selection_(core->settings().selector) {}

    /// A list of the next handle, whether a first frame waits for its motion, its measures, samples,
    /// qualities, and quality().
    Fn::Package createMemento() const override;
    /// @throws FNEBadArg
    void setMemento(const Fn::Package& package) override;

    int pushSample(const Sample& sample) override;
    void removeSample(int handle) override { selection_.removeSample(handle); }
    Quality quality() const override { return quality_; }
    /// @throws FNEOutOfRange without samples, and when the record has been generated
    Face bestFace() const override;
    FIR generate() override;
    void clear() override;
    std::size_t dumpSize() const override { return core_->largestRecord().serialize().size(); }
    std::size_t numberOfSamples() const override { return selection_.size(); }
    FIR create(const Fn::Package& package) const override { return core_->records().read(package); }
    FIR createFromBytes(std::span<const unsigned char> package) const override {
        return core_->records().read(package);
    }
    FIR createFromMemento(unsigned char*& memory) const override { return core_->records().read(memory); }
    FIR createVoid() const override { return core_->record({}); }

private:
    /// Measures of a face, 0 where they do not count.
    struct Measures {
        float sharpness = 0, deviation = 0, padding = 0, simToIdeal = 0;
    };

    int push(Face const& face, int id, int frameIndex, FN2Vector<float> const& offset);
    int push(FaceStream const& stream, int id);
    int annotateLandmarks(Face& face) const;
    Measures measure(const Face& face, Fn::Optional<FNImage<float>>& warped) const;
    float motion(const SampleEntryKey& key, const Face& face, FN2Vector<float> offset,
                 const Measures& measures);
    void rateFirst(float motion);
    float rate(const Measures& measures, float motion) const;

    FNCountedPtr<const Core> core_;
    int nextSampleId_ = 0;
    bool pendingFirst_ = false; ///< the first frame waits for two that tell its motion
    Measures pending_;          ///< of that frame; so is the next one
    SampleEntryKey pendingKey_;
    SampleSelection selection_;
    Quality quality_;
};

/// How far the eyes moved while a frame was exposed, in eye distances.
/// @param exposure seconds
/// @throws std::invalid_argument for an eye distance or a time between the frames of 0
float motionBlur(FNPos const& prevLeft, FNPos const& prevRight, float prevEyeDistance,
                 Fn::TimeStamp const& prevTime, FNPos const& curLeft, FNPos const& curRight,
                 float curEyeDistance, Fn::TimeStamp const& curTime, float exposure);

} // namespace Cmp::B7

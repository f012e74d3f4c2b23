#pragma once

#include "cmp/strategy.h"
#include "kx/events.h"
#include "kx/sensor_sample.h"

#include <map>

namespace Kx {

/// Asked when all samples are taken.
using SamplesToDrop = Fn::Functor0Ret<std::list<int>>;
using FirsToMerge = Fn::Functor0Ret<std::list<Cmp::FIR>>;

namespace Implementation {

/// Which samples a record builder holds, by the index of their images.
class SampleDataCollector {
public:
    struct Sample {
        int id; ///< what the builder calls it
        FNImageReference image;
    };

    /// Takes a sample, in the place of the one of that index.
    void insert(int index, int id, const FNImageReference& image);
    /// Keeps it as a removed one. Does nothing if it is not there.
    void remove(int index);

    const std::map<int, Sample>& accepted() const { return accepted_; }
    const std::map<int, Sample>& removed() const { return removed_; }

private:
    std::map<int, Sample> accepted_;
    std::map<int, Sample> removed_;
};

/// One enrolment: takes samples, and sends a record or that there is none.
class Enroller : public Subject<EnrolmentInterest::NotEnoughGoodImages, EnrolmentInterest::DoneProcessing> {
public:
    /// @param minSamples fewer make no record
    /// @param samplesToDrop samples to forget before the record is made. Each number counts as an image's
    /// index
    ///        and as the builder's handle of a sample: the caller sees to it that they are the same.
    /// @param firsToMerge earlier records that become part of the new one
    Enroller(const Cmp::Strategy& strategy, unsigned int minSamples, const SamplesToDrop& samplesToDrop,
             const FirsToMerge& firsToMerge)
        : strategy_(strategy), builder_(strategy.algorithm()->createRecordBuilder()), minSamples_(minSamples),
          samplesToDrop_(samplesToDrop), firsToMerge_(firsToMerge) {}

    /// @return whether the record builder has taken the sample
    bool pushSample(int index, const Cmp::Face& face);
    bool pushSample(int index, const SensorSample& sample);
    /// Ends the enrolment.
    void processSamples();

private:
    bool push(int index, const Cmp::Sample& sample, const FNImageReference& image);

    Cmp::Strategy strategy_;
    Cmp::RecordBuilder builder_;
    unsigned int minSamples_;
    SamplesToDrop samplesToDrop_;
    FirsToMerge firsToMerge_;
    SampleDataCollector samples_;
};

} // namespace Implementation

} // namespace Kx

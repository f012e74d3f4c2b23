#pragma once

#include "cmp/strategy.h"
#include "kx/events.h"
#include "kx/sensor_sample.h"

#include <optional>

namespace Kx::Implementation {

/// The record of one sample alone, if the comparison algorithm takes it.
std::optional<Cmp::FIR> recordOf(const Cmp::Strategy& strategy, const Cmp::Sample& sample);

/// Compares samples, each for itself, with one record.
class Recognizer : public Subject<RecognitionInterest::ExtractedFIR, RecognitionInterest::AchievedScore,
                                  RecognitionInterest::AttemptResult> {
public:
    Recognizer(const Cmp::Strategy& strategy, const Cmp::FIR& reference, Cmp::Score threshold)
        : strategy_(strategy), reference_(reference), threshold_(threshold) {}

    /// One attempt: sends the sample's record, its score, and the result; of a sample that makes no record
    /// the result only.
    /// @return whether the score reaches the threshold
    bool compare(const Cmp::Face& face, int index) const;
    bool compare(const SensorSample& sample, int index) const;

private:
    bool compare(const Cmp::Sample& sample, int index) const;

    Cmp::Strategy strategy_;
    Cmp::FIR reference_;
    Cmp::Score threshold_;
};

} // namespace Kx::Implementation

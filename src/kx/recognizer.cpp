#include "kx/recognizer.h"

namespace Kx::Implementation {

using namespace RecognitionInterest;

std::optional<Cmp::FIR> recordOf(const Cmp::Strategy& strategy, const Cmp::Sample& sample) {
    const Cmp::RecordBuilder builder = strategy.algorithm()->createRecordBuilder();
    if (pushSample(builder, sample) == -1) return {};
    return builder->generate();
}

bool Recognizer::compare(const Cmp::Face& face, int index) const {
    return compare(Cmp::Sample{face.image(), face.leftEye(), face.rightEye()}, index);
}

bool Recognizer::compare(const SensorSample& sample, int index) const {
    return compare(sample.cmpSample(), index);
}

bool Recognizer::compare(const Cmp::Sample& sample, int index) const {
    bool accepted = false;
    if (const std::optional<Cmp::FIR> record = recordOf(strategy_, sample)) {
        broadcast(ExtractedFIR{index, *record});
        const Cmp::Score score =
            strategy_.scoreMapping()->convert(strategy_.algorithm()->one2one(*record, reference_));
        broadcast(AchievedScore{index, score.value()});
        accepted = score >= threshold_;
    }
    broadcast(AttemptResult{index, accepted});
    return accepted;
}

} // namespace Kx::Implementation

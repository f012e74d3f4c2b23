#include "kx/enroller.h"

namespace Kx::Implementation {

void SampleDataCollector::insert(int index, int id, const FNImageReference& image) {
    removed_.erase(index);
    accepted_.insert_or_assign(index, Sample{id, image});
}

void SampleDataCollector::remove(int index) {
    const auto sample = accepted_.find(index);
    if (sample == accepted_.end()) return;
    removed_.insert_or_assign(index, sample->second);
    accepted_.erase(sample);
}

bool Enroller::pushSample(int index, const Cmp::Face& face) {
    return push(index, Cmp::Sample{face.image(), face.leftEye(), face.rightEye()}, face.image());
}

bool Enroller::pushSample(int index, const SensorSample& sample) {
    return push(index, sample.cmpSample(), sample.image);
}

bool Enroller::push(int index, const Cmp::Sample& sample, const FNImageReference& image) {
    const int id = Implementation::pushSample(builder_, sample);
    if (id == -1) return false;
    samples_.insert(index, id, image);
    return true;
}

void Enroller::processSamples() {
    for (const int sample : samplesToDrop_()) {
        samples_.remove(sample);
        builder_->removeSample(sample);
    }
    if (samples_.accepted().size() < minSamples_) return broadcast(EnrolmentInterest::NotEnoughGoodImages{});
    const Cmp::FIR generated = builder_->generate();
    broadcast(EnrolmentInterest::DoneProcessing{strategy_.algorithm()->merge(firsToMerge_(), generated)});
}

} // namespace Kx::Implementation

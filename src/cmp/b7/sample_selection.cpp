#include "cmp/b7/sample_selection.h"

using FeaturePackage = FNTriple<FNVector<float>, float, float>;

Fn::Package
Fn::Serializer<Cmp::B7::FloatingPointFeature>::pack(const Cmp::B7::FloatingPointFeature& feature) {
    return Package(FeaturePackage(feature.vector, feature.mean, feature.stdDev));
}

Cmp::B7::FloatingPointFeature Fn::Serializer<Cmp::B7::FloatingPointFeature>::unpack(const Package& package) {
    const FeaturePackage parts(package);
    return {parts.first, parts.second, parts.third};
}

namespace Cmp::B7 {

SampleEntryKey::SampleEntryKey(const Fn::Package& package) {
    const FNPair<int, int> both(package);
    handle = both.first;
    frame = both.second;
}

SampleEntryKey::operator Fn::Package() const {
    return Fn::Package(FNPair<int, int>(handle, frame));
}

PrimaryData::PrimaryData(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    warped = reader.next<Fn::Optional<FNImage<float>>>();
    face = reader.next<Face>();
    quality = reader.next<float>();
    reader.expectEnd();
}

PrimaryData::operator Fn::Package() const {
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(warped), face.serialize(), Fn::Package(quality)});
}

SampleEntryValue::SampleEntryValue(const Fn::Package& package) {
    using Parts = FNPair<Fn::Optional<PrimaryData>, Fn::Optional<FloatingPointFeature>>;
    const Parts parts(package);
    primary = parts.first;
    feature = parts.second;
}

SampleEntryValue::operator Fn::Package() const {
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(primary), Fn::serialize(feature)});
}

bool SampleSelection::tryAddSample(SampleEntryKey const& key, float quality, SampleEntryValue const& value) {
    if (!value.primary.isSet() && !value.feature.isSet())
        FN_THROW(FNEGeneric, "tryAddSample(): the to be inserted sample should have at least primary data or "
                             "extracted feature");
    samples_.insert_or_assign(key, value);
    qualities_.emplace(quality, key);
    const float limit = qualities_.rbegin()->first * limits_.qualityFraction;
    bool kept = true;
    while (!qualities_.empty()) {
        const auto worst = qualities_.begin();
        if (samples_.size() <= limits_.maxSamples && !(worst->first < limit)) break;
        kept = kept && worst->second != key;
        samples_.erase(worst->second);
        qualities_.erase(worst);
    }
    return kept;
}

void SampleSelection::removeSample(int handle) {
    std::erase_if(samples_, [&](const auto& sample) { return sample.first.handle == handle; });
    std::erase_if(qualities_, [&](const auto& quality) { return quality.second.handle == handle; });
}

void SampleSelection::removeFrame(const SampleEntryKey& key) {
    samples_.erase(key);
    std::erase_if(qualities_, [&](const auto& quality) { return quality.second == key; });
}

void SampleSelection::clear() {
    samples_.clear();
    qualities_.clear();
}

void SampleSelection::restore(const Samples& samples, const Qualities& qualities) {
    for (const auto& [quality, key] : qualities)
        if (!samples.contains(key)) FN_THROW(FNEBadArg, "Quality of a sample that is not there");
    for (const auto& [key, value] : samples)
        if (!value.primary.isSet() && !value.feature.isSet())
            FN_THROW(FNEBadArg, "Sample of neither primary data nor extracted feature");
    samples_ = samples;
    qualities_ = qualities;
}

float SampleSelection::meanQuality() const {
    float sum = 0;
    for (const auto& [quality, key] : qualities_) sum += quality;
    return qualities_.empty() ? 0 : sum / static_cast<float>(qualities_.size());
}

const SampleEntryValue& SampleSelection::best() const {
    if (qualities_.empty())
        FN_THROW(FNEOutOfRange, "No best face available. No Sample has been accepted so far.");
    return samples_.at(qualities_.rbegin()->second);
}

void SampleSelection::settle(const SampleEntryKey& key, const FloatingPointFeature& feature) {
    samples_.at(key) = SampleEntryValue({}, feature);
}

} // namespace Cmp::B7

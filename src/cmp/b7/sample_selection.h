#pragma once

#include "cmp/b7/encoder.h"
#include "cmp/b7/settings.h"
#include "cmp/record_builder.h"
#include "fn/image_package.h"

/// A list of the vector, the mean and the standard deviation.
template <> struct Fn::Serializer<Cmp::B7::FloatingPointFeature> {
    static Package pack(const Cmp::B7::FloatingPointFeature& feature);
    /// @throws FNEBadArg
    static Cmp::B7::FloatingPointFeature unpack(const Package& package);
};

namespace Cmp::B7 {

/// A frame of a sample; samples are counted from 0, and so are the frames of each.
struct SampleEntryKey {
    int handle = 0, frame = 0;

    SampleEntryKey() = default;
    SampleEntryKey(int handle_, int frame_) : handle(handle_), frame(frame_) {}
    explicit SampleEntryKey(const Fn::Package& package);
    /// A list of both.
    explicit operator Fn::Package() const;
    auto operator<=>(const SampleEntryKey&) const = default;
};

/// What a feature is extracted from.
struct PrimaryData {
    Fn::Optional<FNImage<float>> warped; ///< by reshapeWarp(), if it was needed already
    Face face;
    float quality = 0;

    PrimaryData() = default;
    PrimaryData(const Fn::Optional<FNImage<float>>& warped_, const Face& face_, float quality_)
        : warped(warped_), face(face_), quality(quality_) {}
    explicit PrimaryData(const Fn::Package& package);
    /// A list of all three.
    explicit operator Fn::Package() const;
};

/// One of the two is there: the data until the feature is extracted.
struct SampleEntryValue {
    Fn::Optional<PrimaryData> primary;
    Fn::Optional<FloatingPointFeature> feature;

    SampleEntryValue() = default;
    SampleEntryValue(const Fn::Optional<PrimaryData>& primary_,
                     const Fn::Optional<FloatingPointFeature>& feature_ = {})
        : primary(primary_), feature(feature_) {}
    explicit SampleEntryValue(const Fn::Package& package);
    /// A list of both.
    explicit operator Fn::Package() const;
};

/// The best samples of one person: at most so many, and none whose quality is below a fraction of the best
/// one's.
class SampleSelection {
public:
    using Samples = Fn::SerializableMap<SampleEntryKey, SampleEntryValue>;
    using Qualities = Fn::SerializableMultiMap<float, SampleEntryKey>; ///< ascending

    explicit SampleSelection(const SampleSelector& limits) : limits_(limits) {}

    /// Adds a sample and drops those that do not belong to the best now.
    /// @return whether the one added was kept. @throws FNEGeneric for a value of neither kind
    bool tryAddSample(SampleEntryKey const& key, float quality, SampleEntryValue const& value);
    /// Forgets all frames of a sample.
    void removeSample(int handle);
    void removeFrame(const SampleEntryKey& key);
    void clear();
    /// Takes over what samples() and qualities() gave. @throws FNEBadArg if they do not fit each other
    void restore(const Samples& samples, const Qualities& qualities);

    std::size_t size() const { return samples_.size(); }
    const Samples& samples() const { return samples_; }
    const Qualities& qualities() const { return qualities_; }
    /// Of the qualities, 0 without any.
    float meanQuality() const;
    /// @throws FNEOutOfRange without samples
    const SampleEntryValue& best() const;
    /// Stores the feature that was extracted from a sample in place of its data.
    void settle(const SampleEntryKey& key, const FloatingPointFeature& feature);

private:
    SampleSelector limits_;
    Samples samples_;
    Qualities qualities_;
};

} // namespace Cmp::B7

#pragma once

#include "cmp/portrait/portrait_features.h"
#include "labelled/labels.h"
#include "train/training_sources.h"

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace Train {

/// What discriminators of portraits learn from: feature vectors of labelled faces, extracted by the library.
///
/// Each face is taken as our own finders see it (as it is labelled where they do not find it), and those of
/// the train part a second time in a mirror, with the labelled eyes moved a little. Further views of the
/// train part are the other way round: what the finders see is mirrored, and what is moved is not.

/// The feature vectors, and two things that labels are derived from.
enum class PortraitKind {
    glasses,
    pose,
    mouth,
    head,
    closedEyes, ///< of both eyes, one after the other
    gazeAway,   ///< of both eyes
    gender,
    age,
    ethnicity,
    lighting, ///< the pixels of the lighting window, columns one after another
    iris      ///< offset of the iris in the left and right eye; beyond 1 if it is not seen
};
inline constexpr std::size_t portraitKinds = 11;

enum class PortraitViews { first, further };

struct PortraitSample {
    std::size_t row; ///< of the set
    Labelled::Split split;
    bool mirrored;
    FNPos leftEye, rightEye; ///< as they were taken, in the picture before it was mirrored
    bool found;              ///< by our finders
};

/// All samples of one set of labelled pictures.
class PortraitSet {
public:
    std::vector<Labelled::Row> rows;
    std::vector<PortraitSample> samples;

    /// Values of sample i: dimension(kind) numbers. Empty for a kind that the set has none of.
    std::span<const float> features(PortraitKind kind, std::size_t i) const;
    std::size_t dimension(PortraitKind kind) const;
    bool has(PortraitKind kind) const { return dimension(kind) > 0; }
    const Labelled::Row& rowOf(std::size_t i) const { return rows[samples[i].row]; }

private:
    friend class PortraitSampler;
    struct Columns {
        std::size_t dimension = 0;
        std::vector<float> values;
    };
    std::map<PortraitKind, Columns> columns_;
};

/// The set in a folder below the data. @param kinds all that are ever extracted of it
/// @param wanted those of them that are returned
/// @param most rows at most, the others being left out evenly
PortraitSet loadPortraits(const TrainingSources& sources, const std::string& folder,
                          const std::vector<PortraitKind>& kinds, const std::vector<PortraitKind>& wanted,
                          PortraitViews views = PortraitViews::first, std::size_t most = 1000000);

/// Vectors of single eyes, from pictures of one eye each; the same interface, kind closedEyes only. The eye
/// is taken to be as large as it is on average.
PortraitSet loadEyePictures(const TrainingSources& sources, const std::string& folder);

} // namespace Train

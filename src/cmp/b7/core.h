#pragma once

#include "cmp/b7/encoder.h"
#include "cmp/b7/preprocessor.h"
#include "cmp/b7/settings.h"
#include "cmp/b7/transformation.h"
#include "cmp/encoded_records.h"
#include "cmp/face/face.h"
#include "cmp/shared_files.h"
#include "eye/bridge_finder.h"
#include "eye/eyes_finder.h"
#include "eye/mouth_finder.h"
#include "fn/image_reference.h"

#include <functional>

namespace Cmp::B7 {

class CmpAlgorithm;

/// Measures of a face as a portrait, 0 where they are not asked for.
struct PortraitMeasures {
    float sharpness = 0;
    float deviationFromFrontalPose = 0;
};

/// What looks for the landmarks of a face, and measures it.
struct Finders {
    EyesFinder eyes;
    MouthFinder mouth;
    BridgeFinder bridge;
    std::function<PortraitMeasures(const Face&, const SampleEvaluator::Regarded&)> portrait;
};

/// What the algorithm, its builders and its iterators share: how features come from images, and records from
/// features. Immutable.
class Core {
public:
    using Features = std::vector<FloatingPointFeature>;
    using Records = Implementation::EncodedRecords<CmpAlgorithm, Encoder>;

    /// Reads the transformation, unless an algorithm that lives has read it.
    /// @throws FNEIOError, FNEBadArg
    Core(const Settings& settings, const Finders& finders);

    const Settings& settings() const { return settings_; }
    const Finders& finders() const { return finders_; }
    const Records& records() const { return records_; }
    const Encoder& encoder() const { return records_.encoder(); }

    /// The feature of a face. @param warped by reshapeWarp(), made here if it is not set
    FloatingPointFeature processSample(FNImageReference const& image,
                                       Fn::Optional<FNImage<float>> const& warped, FNPos const& leftEye,
                                       FNPos const& rightEye, FNPos const& mouth, FNPos const& bridge) const;

    /// A record of the centres that features cluster around.
    FIR record(const Features& features) const;
    /// With as many features as one can have.
    FIR largestRecord() const;
    /// Appends the features of a record. @throws std::bad_cast for a record of another algorithm
    void decode(const FIR& record, Features& features) const {
        records_.decode(record, encoder().createRawType(), features);
    }

private:
    Settings settings_;
    Finders finders_;
    Records records_;
    PreProcessor preProcessor_;
    Implementation::SharedFiles<Transformation> transformations_;
    FNCountedPtr<const Transformation> transformation_;
};

} // namespace Cmp::B7

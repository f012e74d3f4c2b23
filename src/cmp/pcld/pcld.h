#pragma once

#include "cmp/comparison_algorithm.h"
#include "cmp/pcld/encoder.h"
#include "cmp/pcld/preprocessor.h"
#include "cmp/pcld/settings.h"
#include "cmp/pcld/transformation.h"
#include "cmp/shared_files.h"
#include "cmp/stored_features.h"

namespace Cmp::Implementation {

/// A comparison algorithm of floats: Gabor pyramid, trained linear projection, cosine. Its settings choose
/// the member of the family; L5 is the one that configurations make.
///
/// Samples need an image and the positions of both eyes, and are not rated.
class PCLD final : public ComparisonAlgorithm {
public:
    using PreprocessorType = std::string; ///< one of PreprocessorNames
    class Core;

    /// Reads the trained files. @throws FNEIOError, FNEBadArg
    explicit PCLD(const L5Settings& settings);
    PCLD(const PCLD&);
    ~PCLD() override;

    std::string name() const override;
    Sample::Requirements sampleRequirements() const override { return {true, true, false, false, false}; }
    RecordBuilder createRecordBuilder() const override;
    FIR merge(const std::list<FIR>& earlier, const FIR& added) const override;
    float one2one(const FIR& first, const FIR& second) const override;
    Population createPopulation(unsigned int capacity) const override;
    std::list<GalleryIterator> prepareFew2Many(const std::vector<FIR>& probes,
                                               const Fn::View<Population>::Iterator& populations,
                                               unsigned int partitions) const override;

    FNCountedPtr<ScoreMapping> scoreMapping() const;
    FNCountedPtr<RatesMapping> ratesMapping() const;

    /// The feature vector of a face, not scaled to length 1.
    FNVector<float> processSample(const FNImageReference& image, const FNPos& leftEye,
                                  const FNPos& rightEye) const;

    /// @throws FNEBadArg for a pre-processor of other parameters
    static FNCountedPtr<const Pcld::Preprocessor>
    initializePreprocessor(const PreprocessorType& type,
                           const Pcld::GaborPyrRankNormProcessor::Params& params);
    static FNCountedPtr<const Pcld::Preprocessor>
    initializePreprocessor(const PreprocessorType& type, const Pcld::GaborPyrProcessor::Params& params);

private:
    FNCountedPtr<const Core> core_;
};

/// The parameters of L5's pyramid. @param direction 'x' or 'z'
Pcld::GaborPyrRankNormProcessor::Params l5Params(char direction);

/// The face as L5 takes it: 80 by 80 pixels, the eyes at (24, 29.333334) and (56, 29.333334).
FNImage<float> l5Face(const FNImageReference& image, const FNPos& leftEye, const FNPos& rightEye);

} // namespace Cmp::Implementation

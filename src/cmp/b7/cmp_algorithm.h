#pragma once

#include "cmp/b7/encoder.h"
#include "cmp/comparison_algorithm.h"
#include "cmp/score_mapping.h"
#include "fn/deployment/component.h"
#include "fn/image_reference.h"
#include "fn/optional.h"

namespace Cmp::B7 {

class Core;
struct Finders;

/// The B7 comparison algorithm: ranks of Gabor responses on an unrolled face, a trained linear projection to
/// 5912 components, packed into 2728 bytes, and scalar products of those.
///
/// Samples need an image and the positions of both eyes, or a stream of faces; mouth and bridge of the nose
/// are looked for. Builders keep the best of them. Copies share everything.
class CmpAlgorithm final : public Implementation::ComparisonAlgorithm {
public:
    /// Reads the models of the finders, and the transformation unless another one has read it.
    /// @throws FNEIOError that names the file; FNEBadArg for settings out of their ranges
    explicit CmpAlgorithm(const Fn::Deployment::Component& component);
    /// The same with finders of the caller's in place of the configured ones.
    CmpAlgorithm(const Fn::Deployment::Component& component, const Finders& finders);
    CmpAlgorithm(const CmpAlgorithm&);
    ~CmpAlgorithm() override;

    static std::string typeId() { return "Cmp::B7::CmpAlgorithm"; }
    static Fn::Deployment::Type define();

    std::string name() const override;
    Sample::Requirements sampleRequirements() const override { return {true, true, false, false, false}; }
    RecordBuilder createRecordBuilder() const override;
    FIR merge(const std::list<FIR>& earlier, const FIR& added) const override;
    float one2one(const FIR& first, const FIR& second) const override;
    Population createPopulation(unsigned int capacity) const override;
    std::list<Implementation::GalleryIterator>
    prepareFew2Many(const std::vector<FIR>& probes, const Fn::View<Population>::Iterator& populations,
                    unsigned int partitions) const override;
    RawMatches normalizeRawScores(const RawMatches& matches,
                                  const ScoreHistogram& distribution) const override;

    FNCountedPtr<Implementation::ScoreMapping> scoreMapping() const;
    FNCountedPtr<Implementation::RatesMapping> ratesMapping() const;

    /// The feature of a face. @param warped by reshapeWarp(); made from the image if it is not set, which is
    /// all that image and positions are for
    FloatingPointFeature processSample(FNImageReference const& image,
                                       Fn::Optional<FNImage<float>> const& warped, FNPos const& leftEye,
                                       FNPos const& rightEye, FNPos const& mouth, FNPos const& bridge) const;
    /// A record of features of one person.
    FIR record(const std::vector<FloatingPointFeature>& features) const;
    /// There is no way back. @throws FNEBadArg
    FNImage<float> reconstructSample(FNVector<float> const& feature) const;

private:
    FNCountedPtr<const Core> core_;
};

} // namespace Cmp::B7

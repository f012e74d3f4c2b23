#pragma once

#include "fn/deployment/component.h"
#include "kx/enroller.h"

namespace Kx {

/// Makes a record from faces that a face finder has found already: the eyes are where its locations put them,
/// and are not looked for.
///
/// For each face it sends ProcessingSample and FaceFound; at last DoneProcessing or NotEnoughGoodImages.
class AnnotatedSetEnroller
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::FaceFound,
                     EnrolmentInterest::NotEnoughGoodImages, EnrolmentInterest::DoneProcessing> {
public:
    AnnotatedSetEnroller(const Cmp::Strategy& strategy, const Fn::Deployment::Component& component);

    /// @throws FNEBadFunCall for a face without a location of a face finder
    void enrol(const std::list<Cmp::Face>& faces, const SamplesToDrop& samplesToDrop = {},
               const FirsToMerge& firsToMerge = {}) const;
    template <class Iterator>
    void enrol(Iterator first, Iterator last, const SamplesToDrop& samplesToDrop = {},
               const FirsToMerge& firsToMerge = {}) const {
        enrol(std::list<Cmp::Face>(first, last), samplesToDrop, firsToMerge);
    }

    static std::string typeId() { return "Kx::AnnotatedSetEnroller"; }
    static Fn::Deployment::Type define();

private:
    Cmp::Strategy strategy_;
    unsigned int minNumOfSamples_;
};

} // namespace Kx

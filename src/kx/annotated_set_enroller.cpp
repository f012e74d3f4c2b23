#include "kx/annotated_set_enroller.h"

#include "kx/enroller_settings.h"
#include "kx/intensity_caching_image.h"

namespace Kx {

using namespace Fn::Deployment;

AnnotatedSetEnroller::AnnotatedSetEnroller(const Cmp::Strategy& strategy, const Component& component)
    : strategy_(strategy), minNumOfSamples_(Implementation::minNumOfSamples(component)) {}

Type AnnotatedSetEnroller::define() {
    return Type(typeId(), "Enroller for annotated sets of images",
                properties(Implementation::minNumOfSamples(
                    "This key determines the minimum number of images required for enrollment. If the "
                    "annotated image set contains less images, enrollment will fail.")),
                "", false);
}

void AnnotatedSetEnroller::enrol(const std::list<Cmp::Face>& faces, const SamplesToDrop& samplesToDrop,
                                 const FirsToMerge& firsToMerge) const {
    Implementation::Enroller enroller(strategy_, minNumOfSamples_, samplesToDrop, firsToMerge);
    forward<EnrolmentInterest::NotEnoughGoodImages, EnrolmentInterest::DoneProcessing>(enroller, *this);
    int index = 0;
    for (const Cmp::Face& face : faces) {
        const Implementation::IntensityCache cache(face.image());
        broadcast(OperationInterest::ProcessingSample{index, cache.image()});
        const FaceFinder::Location& location = face.faceFinderLocation();
        broadcast(OperationInterest::FaceFound{index, location});
        enroller.pushSample(index, Cmp::Face(cache.image(), location));
        ++index;
    }
    enroller.processSamples();
}

} // namespace Kx

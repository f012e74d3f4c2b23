#include "kx/set_recognizer.h"

namespace Kx {

using namespace Fn::Deployment;
using namespace RecognitionInterest;

SetRecognizer::SetRecognizer(const Component& component, const FaceFinder& faceFinder,
                             const EyesFinder& eyesFinder, const Cmp::Strategy& strategy)
    : eyes_(faceFinder, eyesFinder, component, true), strategy_(strategy) {}

Type SetRecognizer::define() {
    return Type(typeId(), "Recognizer for image sets.", properties(Implementation::EyeSearch::range()), "",
                false);
}

template <class Samples>
void SetRecognizer::recognizeAny(const Samples& samples, const Cmp::FIR& reference,
                                 Cmp::Score threshold) const {
    const Implementation::Recognizer recognizer(strategy_, reference, threshold);
    forward<ExtractedFIR, AchievedScore, AttemptResult>(recognizer, *this);
    const bool accepted =
        Implementation::walk(*this, eyes_, samples, [&](const SensorSample& sample, int index) {
            return recognizer.compare(sample, index);
        });
    broadcast(Result{accepted});
}

void SetRecognizer::recognize(const std::list<SensorSample>& samples, const Cmp::FIR& reference,
                              Cmp::Score threshold) const {
    recognizeAny(samples, reference, threshold);
}

void SetRecognizer::recognize(const FNImageSet& images, const Cmp::FIR& reference,
                              Cmp::Score threshold) const {
    recognizeAny(images, reference, threshold);
}

Type AnnotatedSetRecognizer::define() {
    return Type(typeId(), "Recognizer for annotated image sets.", "", false);
}

void AnnotatedSetRecognizer::recognize(const std::list<Cmp::Face>& faces, const Cmp::FIR& reference,
                                       Cmp::Score threshold) const {
    const Implementation::Recognizer recognizer(strategy_, reference, threshold);
    forward<ExtractedFIR, AchievedScore, AttemptResult>(recognizer, *this);
    const bool accepted = Implementation::walk(*this, faces, [&](const SensorSample& sample, int index) {
        return recognizer.compare(sample, index);
    });
    broadcast(Result{accepted});
}

} // namespace Kx

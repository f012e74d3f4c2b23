#include "orbek/face_tracker.h"

#include "eye/tracker/reference_face_tracker.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"

namespace Orbek::Face {

class Tracker::Implementation {
public:
    explicit Implementation(const Configuration& configuration)
        : configuration_(configuration),
          tracker_(new Eye::ReferenceFaceTracker(Configuration::Implementation::implementation(configuration)
                                                     ->resources()
                                                     .rootComponent()
                                                     .subComponent("FaceTracker"))) {
        tracker_->addObserver(Observer::callee(*this, &Implementation::rcv));
    }
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    Eye::ReferenceFaceTracker& tracker() { return *tracker_; }
    /// The faces of the last frame.
    std::list<TrackedFace> faces() const {
        std::list<TrackedFace> faces;
        for (const Eye::FaceTracker::FaceInfo& face : faces_)
            faces.emplace_back(face.identity(), adapt(face.location()));
        return faces;
    }

private:
    using Observer = Fn::Functor2<FNImageReference, Eye::FaceTracker::FaceInfos>;

    void rcv(const FNImageReference&, const Eye::FaceTracker::FaceInfos& faces) { faces_ = faces; }

    Eye::FaceTracker::FaceInfos faces_;
    Configuration configuration_;
    FNCountedPtr<Eye::ReferenceFaceTracker> tracker_;
};

Tracker::Tracker(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Tracker::Tracker(const Tracker&) = default;
Tracker& Tracker::operator=(const Tracker&) = default;
Tracker::~Tracker() = default;

std::list<Tracker::TrackedFace> Tracker::processFrame(const Image& image) {
    implementation_->tracker().processFrame(adapt(image));
    return implementation_->faces();
}

std::list<Tracker::TrackedFace> Tracker::processImage(const Image& image, const unsigned int& timeMs) {
    implementation_->tracker().processFrame(adapt(image), timeMs);
    return implementation_->faces();
}

} // namespace Orbek::Face

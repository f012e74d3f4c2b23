#pragma once

#include "eye/face_tracker.h"
#include "eye/tracker/distance_range.h"
#include "fn/callback/observable.h"
#include "fn/callback/unique_id.h"
#include "fn/deployment/component.h"

#include <vector>

namespace Eye {

/// Gives the faces that a finder finds in the frames of a video stable identities: a face takes over the
/// identity of the nearest face of the frame before, if a face at the highest allowed speed can have come
/// that far. Places are compared in metres, estimated from the eye distance and the camera's field of view.
///
/// The faces of each frame go to the observers, on the caller's thread. A face that the finder misses in one
/// frame has a new identity when it comes back; a frame of another size drops all identities. One thread
/// drives one tracker.
class ReferenceFaceTracker final : public FaceTracker::Body,
                                   public Fn::Deployment::Component,
                                   public FNObservableBody2<FNImageReference, FaceTracker::FaceInfos> {
public:
    /// Reads the model files of the face finder.
    /// @throws FNEOutOfRange for a field of view or a frame rate out of range; FNEIOError naming a model file
    explicit ReferenceFaceTracker(const Fn::Deployment::Component& component);
    /// The same with a finder of the caller's in place of the configured one.
    ReferenceFaceTracker(const Fn::Deployment::Component& component, const ::FaceFinder& finder);

    /// The time wraps after 24 days.
    void processFrame(const FNImageReference& image) override;
    void processFrame(const FNImageReference& image, const unsigned int& timeMs) override;

    static std::string typeId() { return "Eye::ReferenceFaceTracker"; }
    static Fn::Deployment::Type define();

private:
    struct Trace {
        std::string identity;
        ::FaceFinder::Location location;
        float z;            ///< distance from the camera, metres
        std::uint32_t time; ///< milliseconds
        bool returned;      ///< whether observers are told of it
    };
    using Traces = std::list<Trace>;

    Traces findFaces(const FNImageReference& image, std::uint32_t time);
    /// The old trace that the candidate continues, the end if there is none.
    Traces::iterator predecessor(const Trace& candidate);
    float spatialDistance(const Trace& a, const Trace& b) const;

    ::FaceFinder finder_;
    float returnThreshold_;
    DistanceRange range_;
    float speedLimit_; ///< metres per millisecond
    Fn::UniqueId::Generator identities_;
    Traces traces_; ///< of the frame before
    float zLow_, zHigh_;
    std::uint32_t width_ = 0, height_ = 0;
    float tanHalf_;
    float zFactor_ = 0; ///< metres of distance times pixels of eye distance
    std::uint32_t time_ = 0;
    std::uint32_t frameInterval_; ///< milliseconds
    bool exhaustive_;
};

} // namespace Eye

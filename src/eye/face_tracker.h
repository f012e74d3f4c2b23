#pragma once

#include "eye/face_finder.h"
#include "fn/serialize.h"

/// A list of the position, itself a list of x and y, the eye distance, the confidence and the rotation.
template <> struct Fn::Serializer<FaceFinder::Location> {
    static Package pack(const FaceFinder::Location& location);
    /// @throws FNEBadArg
    static FaceFinder::Location unpack(const Package& package);
};

namespace Eye {

/// Handle on an engine that follows faces through the frames of one video.
class FaceTracker {
public:
    /// A face in one frame. What is not known of it is undefined, and its accessor throws.
    class FaceInfo {
    public:
        /// Nothing is defined but the identity.
        explicit FaceInfo(const std::string& identity = {}) : identity_(identity) {}
        /// @param distance from the camera, metres
        FaceInfo(const std::string& identity, const FaceFinder::Location& location, float distance)
            : identity_(identity), location_(location), distance_(distance), distanceDefined_(true) {}
        /// @throws FNEBadArg if the package holds no face
        explicit FaceInfo(const Fn::Package& package) : FaceInfo(Fn::PackageReader(package)) {}

        /// A list of identity, location, distance, whether it is defined, velocity, pixel velocity, and
        /// whether they are defined.
        Fn::Package serialize() const;
        explicit operator Fn::Package() const { return serialize(); }

        /// Stays the same over the frames of one track.
        const std::string& identity() const { return identity_; }
        /// @throws std::runtime_error if it is undefined: no face has an eye distance of 0
        const FaceFinder::Location& location() const;
        /// Metres. @throws std::runtime_error
        float distanceFromCamera() const;
        /// Metres per second. @throws std::runtime_error
        float velocity() const;
        /// Pixels per second. @throws std::runtime_error
        float pixVelocity() const;
        /// Defines both velocities.
        void velocityInfo(float velocity, float pixVelocity);
        /// Maps the location: position * factor + shift, eye distance * factor.
        /// @throws std::runtime_error if there is no location
        void scaleshift(float factor, const FNPos& shift);

    private:
        explicit FaceInfo(Fn::PackageReader reader);
        const FaceFinder::Location& checkedLocation(const char* operation) const;

        std::string identity_;
        FaceFinder::Location location_;
        float distance_ = 0;
        bool distanceDefined_ = false;
        float velocity_ = 0;
        float pixVelocity_ = 0;
        bool velocityDefined_ = false;
    };
    using FaceInfos = Fn::SerializableList<FaceInfo>;

    class Body {
    public:
        virtual ~Body() = default;
        /// The next frame. @param timeMs by the caller's clock, milliseconds
        virtual void processFrame(const FNImageReference& image, const unsigned int& timeMs) = 0;
        /// The next frame of a video with a constant frame rate.
        virtual void processFrame(const FNImageReference& image) = 0;
    };

    explicit FaceTracker(const FNCountedPtr<Body>& body) : body_(body) {}

    void processFrame(const FNImageReference& image, const unsigned int& timeMs) const {
        body_->processFrame(image, timeMs);
    }
    void processFrame(const FNImageReference& image) const { body_->processFrame(image); }

private:
    FNCountedPtr<Body> body_;
};

/// A copy in which each face is mapped by FaceInfo::scaleshift(): brings results on a reduced frame back to
/// the full one.
FaceTracker::FaceInfos scaleshift(const FaceTracker::FaceInfos& faces, float factor, const FNPos& shift);

} // namespace Eye

#pragma once

#include "eye/face_finder.h"
#include "fn/serialize.h"

namespace Eye {

/// Handle on an engine that follows the faces of a video.
class FaceTracker {
public:
    /// A face in a frame.
    class FaceInfo {
    public:
        FaceInfo() = default;
        /// @param identity stays the same over the frames of one track
        /// @param location where the face is; none if its width is 0
        FaceInfo(const std::string& identity, const FaceFinder::Location& location)
            : identity_(identity), location_(location) {}
        /// @param distance from the camera in metres
        FaceInfo(const std::string& identity, const FaceFinder::Location& location, float distance)
            : identity_(identity), location_(location), distance_(distance), distanceDefined_(true) {}
        /// @throws FNEBadArg
        explicit FaceInfo(const Fn::Package& package);

        /// A list of identity, location, distance and whether it is defined, velocity, pixel velocity and
        /// whether they are.
        Fn::Package serialize() const;
        explicit operator Fn::Package() const { return serialize(); }

        const std::string& identity() const { return identity_; }
        bool hasLocation() const { return location_.width != 0; }

        /// What is not defined fails with a std::runtime_error.
        FaceFinder::Location location() const;
        float distanceFromCamera() const; ///< metres
        float velocity() const;           ///< metres per second
        float pixVelocity() const;        ///< pixels per second

        /// Defines both.
        void velocityInfo(float velocity, float pixVelocity);
        /// Makes this a face of an image in which pixel p is at factor * p + shift.
        /// @throws std::runtime_error without a location
        void scaleshift(float factor, const FNPos& shift);

    private:
        void demand(bool defined, const char* operation, const char* item) const;

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
        /// @param timeMs the caller's clock, milliseconds
        virtual void processFrame(const FNImageReference& image, const unsigned int& timeMs) = 0;
        /// The next frame of a video of constant rate.
        virtual void processFrame(const FNImageReference& image) = 0;
    };

    explicit FaceTracker(const FNCountedPtr<Body>& body) : body_(body) {}

    void processFrame(const FNImageReference& image, unsigned int timeMs) {
        body_->processFrame(image, timeMs);
    }
    void processFrame(const FNImageReference& image) { body_->processFrame(image); }

private:
    FNCountedPtr<Body> body_;
};

/// FaceInfo::scaleshift() of each face.
FaceTracker::FaceInfos scaleshift(const FaceTracker::FaceInfos& faces, float factor, const FNPos& shift);

} // namespace Eye

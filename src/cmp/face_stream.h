#pragma once

#include "cmp/evidence.h"

namespace Cmp {

/// One track of an evidence: what a person is enrolled from. Copies are handles on the same one.
class FaceStream {
public:
    /// A frame of the track.
    class Frame : public EvidenceFrame {
    public:
        Frame(const EvidenceFrame& frame, const std::string& trackingId)
            : EvidenceFrame(frame), trackingId_(trackingId) {}
        explicit Frame(const Fn::Package& package) : Frame(Fn::PackageReader(package)) {}
        /// A list of the frame and the tracking id.
        Fn::Package serialize() const;
        explicit operator Fn::Package() const { return serialize(); }

        /// The person's face. @throws FNEBadArg if the frame does not have it
        FaceInfo faceInfo() const;
        const std::string& trackingId() const { return trackingId_; }

    private:
        explicit Frame(Fn::PackageReader reader);

        std::string trackingId_;
    };

    /// Without frames.
    FaceStream() = default;
    FaceStream(const std::string& trackingId, const Evidence& evidence)
        : trackingId_(trackingId), evidence_(evidence) {}
    explicit FaceStream(const Fn::Package& package) : FaceStream(Fn::PackageReader(package)) {}
    /// A list of the evidence and the tracking id.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    const std::string& personTrackId() const { return trackingId_; }
    const Evidence& evidence() const { return evidence_; }

    // @throws FNEBadArg if the evidence has no such track, or beyond its end
    unsigned long numberOfFrames() const { return evidence_.faceTrackNumberOfFrames(trackingId_); }
    Frame operator[](unsigned long index) const {
        return {evidence_.faceTrackFrame(trackingId_, index), trackingId_};
    }
    Fn::TimeStamp startTime() const { return (*this)[0].timeStamp(); }
    Fn::TimeStamp endTime() const { return (*this)[numberOfFrames() - 1].timeStamp(); }

private:
    explicit FaceStream(Fn::PackageReader reader);

    std::string trackingId_;
    Evidence evidence_;
};

} // namespace Cmp

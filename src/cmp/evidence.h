#pragma once

#include "cmp/evidence_frame.h"

#include <vector>

namespace Cmp {

/// What an evidence says of itself without its images.
struct EvidenceMetadata {
    using Times = FNPair<Fn::TimeStamp, Fn::TimeStamp>;
    using TrackedIds = Fn::SerializableMap<std::string, Times>;

    std::string id;
    std::string secondText;
    TrackedIds trackedIds; ///< of each track the times of its first and last frame
    Fn::TimeStamp startTime, endTime;
    std::string thirdText;

    EvidenceMetadata() = default;
    explicit EvidenceMetadata(const Fn::Package& package);
    /// A list of id, trackedIds, startTime, endTime, thirdText, secondText.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }
};

/// What a tracker saw: frames in the order of time, and the tracks of faces through them. Copies are handles
/// on the same evidence. Filled by one thread, without a lock.
///
/// A track consists of all frames from the first to the last one that has a face of its id, also of those in
/// between that have none.
class Evidence {
public:
    using Frame = EvidenceFrame;

    explicit Evidence(const std::string& id = {});
    /// @throws FNEBadArg, or what the package of an image throws
    explicit Evidence(const Fn::Package& package);

    /// A list of metadata, frames and a map of thumbnails by tracking id, each the package of a Face. A
    /// thumbnail that cannot be made is reported to FNDialog::warn. @throws as Frame::serialize()
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    const std::string& id() const;
    /// Frames come in the order of time.
    void push_back(const Frame& frame);

    std::size_t numberOfFrames() const;
    std::size_t numberOfFaceTracks() const;
    /// Over all frames.
    std::size_t numberOfFaces() const;
    const EvidenceMetadata::TrackedIds& trackedIds() const;
    /// @throws FNEBadArg for an index beyond the end
    Frame operator[](unsigned long index) const;

    bool hasFaceTrack(const std::string& trackingId) const;
    /// @throws FNEBadArg for an unknown track, or an index beyond its end; so does the next one
    unsigned long faceTrackNumberOfFrames(const std::string& trackingId) const;
    Frame faceTrackFrame(const std::string& trackingId, unsigned long index) const;

    /// The first `appearances` faces of each track, and the frames that have any of them.
    Evidence getReduced(unsigned int appearances) const;

private:
    /// Indices of the first and the last frame.
    using Track = FNPair<unsigned long, unsigned long>;
    using Thumbnails = Fn::SerializableMap<std::string, Fn::Package>;
    struct Implementation {
        EvidenceMetadata metadata;
        std::vector<Frame> frames;
        Thumbnails thumbnails;
        std::map<std::string, Track> tracks;

        void addToTracks(std::size_t index);
        void updateThumbnails();
    };

    const Track& track(const std::string& trackingId) const;

    FNCountedPtr<Implementation> implementation_;
};

// ---- parts of the package of an evidence, without making its frames. @throws FNEBadArg for another package

EvidenceMetadata getMetaDataFromSerializedEvidence(const Fn::Package& evidence);
Fn::Package getImageDataFromSerializedEvidence(const Fn::Package& evidence);
Fn::Package getSerializedThumbsFromEvidence(const Fn::Package& evidence);
std::map<std::string, Fn::Package> getThumbsFromSerializedEvidence(const Fn::Package& evidence);
/// The same evidence without thumbnails.
Fn::Package stripThumbsFromSerializedEvidence(const Fn::Package& evidence);
/// A list of both.
Fn::Package serializeEvidenceMetadataAndThumbs(const EvidenceMetadata& metadata, const Fn::Package& thumbs);
/// @param trackedObject a list of an evidence and a tracking id, as FaceStream packs itself
/// @return the image of the track's first frame, see EvidenceFrame::img()
EvidenceFrame::Image getFirstFrameFromSerializedTrackedObjectData(const Fn::Package& trackedObject);

} // namespace Cmp

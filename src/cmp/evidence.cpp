#include "cmp/evidence.h"

#include "cmp/face_stream.h"
#include "fn/message/dialog.h"

namespace Cmp {

EvidenceMetadata::EvidenceMetadata(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    id = reader.next<std::string>();
    trackedIds = reader.next<TrackedIds>();
    startTime = reader.next<Fn::TimeStamp>();
    endTime = reader.next<Fn::TimeStamp>();
    thirdText = reader.next<std::string>();
    secondText = reader.next<std::string>();
    reader.expectEnd();
}

Fn::Package EvidenceMetadata::serialize() const {
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(id), Fn::Package(trackedIds),
                                              Fn::Package(startTime), Fn::Package(endTime),
                                              Fn::serialize(thirdText), Fn::serialize(secondText)});
}

void Evidence::Implementation::addToTracks(std::size_t index) {
    for (const Frame::FaceInfo& face : frames[index].faceInfos()) {
        const auto [entry, added] = tracks.try_emplace(face.identity(), Track(index, index));
        if (!added) entry->second.second = index;
    }
}

void Evidence::Implementation::updateThumbnails() {
    for (const auto& [id, times] : metadata.trackedIds) {
        if (thumbnails.contains(id)) continue;
        for (const Frame& frame : frames) {
            if (!frame.hasFaceTrackInfo(id)) continue;
            try {
                thumbnails.emplace(id, frame.getFaceForID(id, Frame::THUMBNAIL).serialize());
                break;
            } catch (const std::exception& e) {
                FNDialog::warn(e.what());
            }
        }
    }
}

Evidence::Evidence(const std::string& id) : implementation_(new Implementation) {
    implementation_->metadata.id = id;
}

Evidence::Evidence(const Fn::Package& package) : implementation_(new Implementation) {
    Fn::PackageReader reader(package);
    Implementation& evidence = *implementation_;
    evidence.metadata = reader.next<EvidenceMetadata>();
    evidence.frames = reader.next<Fn::SerializableVector<Frame>>();
    evidence.thumbnails = reader.next<Thumbnails>();
    reader.expectEnd();
    for (std::size_t i = 0; i < evidence.frames.size(); ++i) evidence.addToTracks(i);
}

Fn::Package Evidence::serialize() const {
    Implementation& evidence = *implementation_;
    evidence.updateThumbnails();
    return Fn::Package(std::list<Fn::Package>{evidence.metadata.serialize(),
                                              Fn::Package(Fn::SerializableVector<Frame>(evidence.frames)),
                                              Fn::Package(evidence.thumbnails)});
}

const std::string& Evidence::id() const {
    return implementation_->metadata.id;
}

void Evidence::push_back(const Frame& frame) {
    Implementation& evidence = *implementation_;
    evidence.frames.push_back(frame);
    evidence.addToTracks(evidence.frames.size() - 1);
    const Fn::TimeStamp time = frame.timeStamp();
    for (const Frame::FaceInfo& face : frame.faceInfos()) {
        const auto [entry, added] =
            evidence.metadata.trackedIds.try_emplace(face.identity(), EvidenceMetadata::Times(time, time));
        if (!added) entry->second.second = time;
    }
    evidence.metadata.startTime = evidence.frames.front().timeStamp();
    evidence.metadata.endTime = time;
}

std::size_t Evidence::numberOfFrames() const {
    return implementation_->frames.size();
}

std::size_t Evidence::numberOfFaceTracks() const {
    return implementation_->tracks.size();
}

std::size_t Evidence::numberOfFaces() const {
    std::size_t count = 0;
    for (const Frame& frame : implementation_->frames) count += frame.faceInfos().size();
    return count;
}

const EvidenceMetadata::TrackedIds& Evidence::trackedIds() const {
    return implementation_->metadata.trackedIds;
}

Evidence::Frame Evidence::operator[](unsigned long index) const {
    if (index >= implementation_->frames.size())
        FN_THROW(FNEBadArg, "Evidence::operator[]: index out of range");
    return implementation_->frames[index];
}

bool Evidence::hasFaceTrack(const std::string& trackingId) const {
    return implementation_->tracks.contains(trackingId);
}

const Evidence::Track& Evidence::track(const std::string& trackingId) const {
    const auto entry = implementation_->tracks.find(trackingId);
    if (entry == implementation_->tracks.end())
        FN_THROW(FNEBadArg, "There is no face track with trackingID " + trackingId +
                                " within the evidence with ID " + id());
    return entry->second;
}

unsigned long Evidence::faceTrackNumberOfFrames(const std::string& trackingId) const {
    const Track& found = track(trackingId);
    return found.second - found.first + 1;
}

Evidence::Frame Evidence::faceTrackFrame(const std::string& trackingId, unsigned long index) const {
    const Track& found = track(trackingId);
    if (index > found.second - found.first)
        FN_THROW(FNEBadArg, "Evidence ID " + id() + ", trackingID " + trackingId + ": index " +
                                std::to_string(index) + " is out of range");
    return implementation_->frames[found.first + index];
}

Evidence Evidence::getReduced(unsigned int appearances) const {
    Evidence reduced(id());
    std::map<std::string, unsigned int> counts;
    for (const Frame& frame : implementation_->frames) {
        Frame::FaceInfos kept;
        for (const Frame::FaceInfo& face : frame.faceInfos()) {
            unsigned int& count = counts[face.identity()];
            if (count >= appearances) continue;
            ++count;
            kept.push_back(face);
        }
        if (!kept.empty()) reduced.push_back(frame.withFaces(kept));
    }
    return reduced;
}

namespace {

/// The children of an evidence's package.
struct Parts {
    explicit Parts(const Fn::Package& evidence) {
        Fn::PackageReader reader(evidence);
        for (Fn::Package* const part : {&metadata, &frames, &thumbs}) *part = reader.next<Fn::Package>();
        reader.expectEnd();
    }

    Fn::Package metadata, frames, thumbs;
};

} // namespace

EvidenceMetadata getMetaDataFromSerializedEvidence(const Fn::Package& evidence) {
    return EvidenceMetadata(Parts(evidence).metadata);
}

Fn::Package getImageDataFromSerializedEvidence(const Fn::Package& evidence) {
    return Parts(evidence).frames;
}

Fn::Package getSerializedThumbsFromEvidence(const Fn::Package& evidence) {
    return Parts(evidence).thumbs;
}

std::map<std::string, Fn::Package> getThumbsFromSerializedEvidence(const Fn::Package& evidence) {
    return Fn::SerializableMap<std::string, Fn::Package>(Parts(evidence).thumbs);
}

Fn::Package stripThumbsFromSerializedEvidence(const Fn::Package& evidence) {
    const Parts parts(evidence);
    return Fn::Package(std::list<Fn::Package>{parts.metadata, parts.frames,
                                              Fn::Package(Fn::SerializableMap<std::string, Fn::Package>())});
}

Fn::Package serializeEvidenceMetadataAndThumbs(const EvidenceMetadata& metadata, const Fn::Package& thumbs) {
    return Fn::Package(std::list<Fn::Package>{metadata.serialize(), thumbs});
}

EvidenceFrame::Image getFirstFrameFromSerializedTrackedObjectData(const Fn::Package& trackedObject) {
    return FaceStream(trackedObject)[0].img(false);
}

} // namespace Cmp

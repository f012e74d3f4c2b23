#include "cmp/face_stream.h"

namespace Cmp {

FaceStream::Frame::Frame(Fn::PackageReader reader)
    : EvidenceFrame(reader.next<EvidenceFrame>()), trackingId_(reader.next<std::string>()) {
    reader.expectEnd();
}

Fn::Package FaceStream::Frame::serialize() const {
    return Fn::Package(std::list<Fn::Package>{EvidenceFrame::serialize(), Fn::serialize(trackingId_)});
}

EvidenceFrame::FaceInfo FaceStream::Frame::faceInfo() const {
    FaceInfo info;
    if (!faceTrackInfo(trackingId_, info))
        FN_THROW(FNEBadArg,
                 "There is no face info for trackingID_ " + trackingId_ + " in this face steam frame");
    return info;
}

FaceStream::FaceStream(Fn::PackageReader reader) : evidence_(reader.next<Evidence>()) {
    trackingId_ = reader.next<std::string>();
    reader.expectEnd();
}

Fn::Package FaceStream::serialize() const {
    return Fn::Package(std::list<Fn::Package>{evidence_.serialize(), Fn::serialize(trackingId_)});
}

} // namespace Cmp

#pragma once

#include "cmp/face/face.h"
#include "eye/face_tracker.h"
#include "fn/time_stamp.h"

#include <map>

namespace Cmp {

/// A part of a frame that shows one face.
class CroppedFace : public Face {
public:
    CroppedFace(const Face& face, FNGridPos origin, float croppingFactor)
        : Face(face), origin_(origin), croppingFactor_(croppingFactor) {}
    explicit CroppedFace(const Fn::Package& package);
    /// A list of the face, the list of both coordinates, and the factor.
    Fn::Package serialize() const override;
    explicit operator Fn::Package() const { return serialize(); }

    /// Of the crop's first pixel in the whole frame.
    FNGridPos origin() const { return origin_; }
    /// What cropFace() was called with.
    float croppingFactor() const { return croppingFactor_; }

private:
    explicit CroppedFace(Fn::PackageReader reader);

    FNGridPos origin_;
    float croppingFactor_;
};

/// One frame of a video with the faces that a tracker saw in it. Copies are handles on the same frame.
///
/// A frame goes into a package either whole, or as the crops of its faces, which takes a fraction of the
/// space. Crops, and a frame that is put together again from them, are made at first need and kept, also by
/// const operations: there is no lock.
class EvidenceFrame {
public:
    using FaceInfo = Eye::FaceTracker::FaceInfo;
    using FaceInfos = Eye::FaceTracker::FaceInfos;
    using Strategy = FNImageReference::SerializationStrategy;
    using Image = FNCountedPtr<FNImageReference>; ///< may be null

    struct FaceThumbNailFormat {
        int height = 70; ///< pixels
        Strategy strategy = FNImageReference::UNCOMPRESSED_RAW;
    };
    /// What getFaceForID() gives: a small picture, or the crop as it is stored.
    enum FaceType : int { THUMBNAIL = 0, CROPPED = 1 };

    /// Without an image.
    EvidenceFrame();
    EvidenceFrame(const FNImageReference& image, const FaceInfos& faces, const Fn::TimeStamp& time,
                  bool serializeWholeFrame);
    /// @throws FNEBadArg, or what the image's package throws
    explicit EvidenceFrame(const Fn::Package& package);
    EvidenceFrame(const EvidenceFrame&);
    EvidenceFrame& operator=(const EvidenceFrame&);
    ~EvidenceFrame();

    /// Whole: true, the image, the faces, the time. Crops: false, width, height, the map of crops, the faces,
    /// the time. @throws as img(), and std::runtime_error for a face without a location
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    Fn::TimeStamp timeStamp() const;
    const FaceInfos& faceInfos() const;
    /// The image, put together from the crops if they are all that is there; 0 around them, and the one of
    /// the greatest id on top. Null for a frame of crops that has no face.
    /// @param colour converts it if it is gray, for good
    /// @throws FNEGeneric for a whole frame without an image; FNEBadFormat for crops of another pixel type
    /// than 8 and 16 bit gray and colour, or a frame that is too large; FNEBadArg for a crop that reaches
    /// beyond the frame
    Image img(bool colour) const;

    void setCroppingFactor(float factor);
    void setSerializeWholeFrame(bool whole);
    bool getSerializeWholeFrame() const;
    void setThumbnailFormat(const FaceThumbNailFormat& format);
    FaceThumbNailFormat getThumbnailFormat() const;
    /// Of the images that the frame makes.
    void setImageCompressionMethod(const Strategy& strategy);
    Strategy getImageCompressionMethod() const;

    bool hasFaceTrackInfo(const std::string& id) const;
    /// @param info written only if the frame has a face of that id. @return whether it has
    bool faceTrackInfo(const std::string& id, FaceInfo& info) const;
    /// @throws FNEBadArg if the frame has no face of that id, or an empty crop of it
    Face getFaceForID(const std::string& id, FaceType type) const;

    /// The frame with some of its faces only, with the same format and compression.
    EvidenceFrame withFaces(const FaceInfos& faces) const;

private:
    class Implementation;
    FNCountedPtr<Implementation> implementation_;
};

} // namespace Cmp

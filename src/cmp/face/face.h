#pragma once

#include "cmp/face/face_geometry.h"
#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"
#include "fn/cptr.h"
#include "fn/image_reference.h"

namespace Cmp {

/// What is known of one face in one image: the image, and those results of the finders that are there.
///
/// Each geometric question is answered from the best source at hand: a finder's own result, or else a value
/// derived from both eyes, or else from the face finder's location, by fixed proportions
/// (face_geometry.h). Positions are pixels of the image, angles radians.
///
///     Cmp::Face face(image, leftEye, rightEye);
///     const FNPos mouth = face.mouth();                  // derived
///     const Cmp::Face portrait = Cmp::cropFace(face, 1);
///
/// Copies share the image and the locations, and scale() and reshape() change the locations themselves: while
/// a face is being changed, no copy of it is in use. There is no lock.
class Face {
public:
    using FaceLocation = FNCountedPtr<FaceFinder::Location>;
    using FeatureLocation = FNCountedPtr<FacialFeatureLocation>;

    /// A black pixel of which nothing is known.
    Face() = default;
    Face(FNImageReference const& image, FacialFeatureLocation const& leftEye,
         FacialFeatureLocation const& rightEye);
    Face(FNImageReference const& image, FaceFinder::Location const& face);
    /// Shares the locations, each of which may be null.
    explicit Face(FNImageReference const& image, FaceLocation const& face = {},
                  FeatureLocation const& leftEye = {}, FeatureLocation const& rightEye = {},
                  FeatureLocation const& nasion = {}, FeatureLocation const& mouth = {});
    /// Reads what serialize() has written. @throws as FNImageReference, and FNEBadArg.
    explicit Face(Fn::Package const& package);
    Face(const Face&) = default;
    Face& operator=(const Face&) = default;
    virtual ~Face() = default;

    /// A list of the image, and then for face, left eye, right eye, nasion and mouth whether it is there and,
    /// if so, the location.
    virtual Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    FNImageReference const& image() const { return image_; }

    bool hasFaceFinderInfo() const { return static_cast<bool>(face_); }
    bool hasEyeFinderLeftEyeInfo() const { return static_cast<bool>(leftEye_); }
    bool hasEyeFinderRightEyeInfo() const { return static_cast<bool>(rightEye_); }
    bool hasBothEyeLocations() const { return hasEyeFinderLeftEyeInfo() && hasEyeFinderRightEyeInfo(); }
    bool hasNasionInfo() const { return static_cast<bool>(nasion_); }
    bool hasMouthInfo() const { return static_cast<bool>(mouth_); }

    /// Results of the finders. @throws FNEBadFunCall if there is none.
    FaceFinder::Location const& faceFinderLocation() const;
    FacialFeatureLocation const& leftEyeLocation() const;
    FacialFeatureLocation const& rightEyeLocation() const;
    FacialFeatureLocation const& nasionLocation() const;
    FacialFeatureLocation const& mouthLocation() const;

    /// From the best source. @throws FNEBadFunCall for the location that is missing at last;
    /// std::invalid_argument if the eyes coincide.
    FNPos leftEye() const;
    FNPos rightEye() const;
    FNPos mouth() const;
    FNPos nasion() const;
    FNPos facePosition() const; ///< the middle of the eyes
    float eyeDistance() const;
    float rollAngle() const;

    /// From the face finder's location.
    FNPos ffLeftEye() const;
    FNPos ffRightEye() const;
    FNPos ffMouth() const;

    /// From the locations of both eyes.
    FNPos efMouth() const;
    FNPos efFacePosition() const;
    float efEyeDistance() const;
    float efRollAngle() const;

    /// Scales image and locations in place; the image's sides are truncated to whole pixels.
    /// @throws FNEBadArg for a factor that is negative or makes a side of 2^31 pixels or more;
    /// std::runtime_error for an image of 48 bits.
    void scale(float factor);

    /// Scales image and locations in place such that the image, centred, fits into `width` by `height`
    /// pixels; the rest becomes 0. @throws FNEBadArg for an empty image or result; std::runtime_error as
    /// scale().
    void reshape(int width, int height);

private:
    friend Face vertReflection(Face const& face);
    friend Face cropFace(Face const& face, float factor);

    template <class Map> void mapLocations(Map map, float sizeFactor);
    template <class Map> Face mapped(FNImageReference const& image, Map map) const;

    FNImageReference image_;
    FaceLocation face_;
    FeatureLocation leftEye_, rightEye_, nasion_, mouth_;
};

/// The image mirrored left to right, in its own pixel type.
FNImageReference vertReflection(FNImageReference const& image);

/// The face in the mirrored image. Left stays left and right stays right, so that afterwards the left eye is
/// the one at the greater x; the angle of the face finder's location keeps its sign.
Face vertReflection(Face const& face);

/// Cuts out the head, 3.6 eye distances wide and 5 high where that lies inside of the image, in the image's
/// own pixel type.
/// @param factor of the sides; below 1 it counts as 1
/// @throws FNEBadFunCall if neither both eyes nor a face finder's location are there; std::invalid_argument
/// if the eyes coincide.
Face cropFace(Face const& face, float factor);

} // namespace Cmp

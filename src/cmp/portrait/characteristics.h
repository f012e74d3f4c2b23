#pragma once

#include "cmp/face/face.h"

namespace Cmp::Portrait {

/// What Analyzer has found out, or will: each value is computed when it is first asked for, and kept.
///
/// Lengths are pixels of the image; eye0 is the eye on the image's left. Scores of trained measures have no
/// unit: models/CARD.md tells how often each is right at the default limits of the compliance test. Copies
/// share the values. Any number of threads may ask; a value is computed once.
///
/// All throw what the computation of a value throws: FNEIOError and FNEGeneric for a model file that cannot
/// be read, FNEBadFunCall for a face of which neither both eyes nor a location are known.
class Characteristics {
public:
    /// What serialize() has written. Needs neither image nor model files. @throws FNEBadArg
    explicit Characteristics(const Fn::Package& package);
    Characteristics(const Characteristics&);
    Characteristics& operator=(const Characteristics&);
    ~Characteristics();
    /// Computes and packs all values. The colour measures red eyes and skin colour are there for colour
    /// images only.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    /// Whether the measures that need colour may be asked for.
    bool isColor() const;

    unsigned int width() const;
    unsigned int height() const;
    FNPos eye0() const;
    FNPos eye1() const;
    float eyeDistance() const;
    FNPos faceCenter() const;    ///< middle of the eyes
    float poseAngleRoll() const; ///< slope of the line through the eyes, positive if eye1 is higher

    float glasses() const; ///< above 0: glasses
    float eye0Open() const;
    float eye1Open() const;
    float eye0GazeFrontal() const;
    float eye1GazeFrontal() const;
    /// @throws FNEBadArg if not isColor()
    float eye0Red() const;
    float eye1Red() const;
    /// By how many levels it is darker below the eye than on the cheek.
    float eye0Tinted() const;
    float eye1Tinted() const;
    float mouthClosed() const;

    float exposure() const;                ///< mean gray level of the face, -0.5 to 255.5
    float sharpness() const;               ///< share of ordinary portraits that are less sharp, 0.01 to 1
    float hotSpots() const;                ///< number of glaring pixels in a face of 108 by 108
    unsigned int grayScaleDensity() const; ///< number of gray levels of the face
    /// Share of pixels with the colour of skin. @throws FNEBadArg if not isColor()
    float naturalSkinColour() const;
    float backgroundUniformity() const; ///< 1 or 0

    /// Extent of the head, from faceCenter().
    float chin() const;
    float crown() const;
    float ear0() const;
    float ear1() const;
    float widthOfHead() const { return ear0() + ear1(); }
    float lengthOfHead() const { return chin() + crown(); }

    float deviationFromFrontalPose() const;
    float deviationFromUniformLighting() const;
    float isMale() const; ///< above 0: male
    float age() const;    ///< years
    /// Scores for white, black and asian.
    FNTriple<float, float, float> ethnicity() const;

    class Implementation;
    explicit Characteristics(const FNCountedPtr<const Implementation>& implementation);

private:
    FNCountedPtr<const Implementation> implementation_;
};

/// The pixels of the head: the smallest box that holds its extent, with one pixel more to the right and
/// below.
FNBox earToEarChinCrownSurroundingBox(const Characteristics& portrait);

} // namespace Cmp::Portrait

#pragma once

#include "orbek/eyes_finder.h"

#include <array>
#include <utility>

/// What a portrait is like: whether eyes and mouth are open, how large the head is, how sharp the picture is,
/// how old the person looks, and much more.
///
///     const Orbek::Portrait::Analyzer analyzer(configuration);
///     const Orbek::Portrait::Characteristics portrait = analyzer.analyze({image, eyes});
///     if (portrait.mouthClosed() < 0.5f) ...
namespace Orbek::Portrait {

/// The measures of one portrait: each is computed when it is first asked for, and kept. Copies share them,
/// and any number of threads may ask.
///
/// Lengths are pixels of the image. eye0 is the eye that was given first, and is taken for the one on the
/// image's left: eyes that are given the other way round are not exchanged, and measure a face that is upside
/// down. Scores of
/// trained measures have no unit; the limits of ISO_19794_5::FullFrontal::Test are at home among them, and
/// models/CARD.md tells how often each is right there.
///
/// All throw std::exception for a model file that cannot be read, with its name; Analyzer reads none.
class [[gnu::visibility("default")]] Characteristics {
public:
    Characteristics(const Characteristics&);
    Characteristics& operator=(const Characteristics&);
    ~Characteristics();

    /// Whether the measures that need colour may be asked for: eye0Red(), eye1Red() and naturalSkinColour().
    bool isColor() const;
    unsigned int width() const;
    unsigned int height() const;
    /// Faces in the image, whichever was measured.
    unsigned int numberOfFaces() const;

    Position eye0() const;
    Position eye1() const;
    Position faceCenter() const; ///< middle of the eyes
    float eyeDistance() const;
    float poseAngleRoll() const; ///< slope of the line through the eyes, positive if eye1 is higher
    float deviationFromFrontalPose() const;

    /// Extent of the head, from faceCenter().
    float chin() const;
    float crown() const;
    float ear0() const;
    float ear1() const;
    float widthOfHead() const;  ///< from ear to ear
    float lengthOfHead() const; ///< from chin to crown

    float eye0Open() const;
    float eye1Open() const;
    float eye0GazeFrontal() const;
    float eye1GazeFrontal() const;
    /// Share of red pixels. @throws std::exception if not isColor()
    float eye0Red() const;
    float eye1Red() const;
    /// By how many levels it is darker below the eye than on the cheek.
    float eye0Tinted() const;
    float eye1Tinted() const;
    float glasses() const; ///< above 0: glasses
    float mouthClosed() const;

    float exposure() const;                ///< mean gray level of the face, -0.5 to 255.5
    unsigned int grayScaleDensity() const; ///< number of gray levels of the face
    /// Share of pixels with the colour of skin. @throws std::exception if not isColor()
    float naturalSkinColour() const;
    float hotSpots() const;             ///< number of glaring pixels in a face of 108 by 108
    float backgroundUniformity() const; ///< 1 or 0
    float deviationFromUniformLighting() const;
    float sharpness() const; ///< share of ordinary portraits that are less sharp, 0.01 to 1

    float isMale() const; ///< above 0: male
    float age() const;    ///< years
    /// Scores for white, black and asian.
    std::array<float, 3> ethnicity() const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    explicit Characteristics(const CountedPtr<Implementation>& implementation);
    CountedPtr<Implementation> implementation_;
};

/// The pixels of the head, with one pixel more to the right and below.
[[gnu::visibility("default")]] Box earToEarChinCrownSurroundingBox(const Characteristics& portrait);

/// Measures portraits. Copies share everything; any number of threads may use one.
class [[gnu::visibility("default")]] Analyzer {
public:
    explicit Analyzer(const Configuration& configuration);
    Analyzer(const Analyzer&);
    Analyzer& operator=(const Analyzer&);
    ~Analyzer();

    /// Counts the faces in the image, and takes the measures at the given eyes when they are asked for: in
    /// colour, if the image is.
    /// @throws std::exception if the finder's model files cannot be read
    Characteristics analyze(const std::pair<Image, Eyes::Location>& imageWithEyes) const;
    /// The same in colour, whatever the image is.
    Characteristics analyzeColor(const std::pair<Image, Eyes::Location>& imageWithEyes) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Portrait

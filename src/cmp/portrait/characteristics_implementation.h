#pragma once

#include "cmp/portrait/analyzer_implementation.h"

#include <array>
#include <optional>

namespace Cmp::Portrait {

/// The store of values, and what they are computed from.
///
/// The mutex of the values is held while one is computed; portrait and exposure crop have their own.
class Characteristics::Implementation {
public:
    /// The values, in the order in which they are packed.
    enum Measure : std::size_t {
        glasses,
        eye0Open,
        eye1Open,
        eye0GazeFrontal,
        eye1GazeFrontal,
        eye0Red,
        eye1Red,
        eye0Tinted,
        eye1Tinted,
        mouthClosed,
        exposure,
        grayScaleDensity,
        naturalSkinColour,
        hotSpots,
        backgroundUniformity,
        chin,
        crown,
        ear0,
        ear1,
        deviationFromFrontalPose,
        isMale,
        deviationFromUniformLighting,
        sharpness,
        age,
        measures ///< their number
    };
    using Ethnicity = FNTriple<float, float, float>;
    using Engine = FNCountedPtr<const Analyzer::Implementation>;

    static Characteristics make(const Engine& engine, const Face& face, bool isColor,
                                const std::optional<Analyzer::AdditionalAnnotations>& annotations = {});
    explicit Implementation(Fn::PackageReader reader);
    Fn::Package serialize() const;

    bool isColor() const { return isColor_; }
    unsigned int width() const { return stored_ ? stored_->width : face_.image().w(); }
    unsigned int height() const { return stored_ ? stored_->height : face_.image().h(); }
    FNPos eye0() const { return stored_ ? stored_->eye0 : face_.leftEye(); }
    FNPos eye1() const { return stored_ ? stored_->eye1 : face_.rightEye(); }
    float eyeDistance() const { return length(eye0() - eye1()); }

    float value(Measure measure) const;
    Ethnicity ethnicity() const;

private:
    /// What a packed object has in place of image and eyes.
    struct Stored {
        unsigned int width, height;
        FNPos eye0, eye1;
    };

    Implementation(const Engine& engine, const Face& face, bool isColor)
        : isColor_(isColor), engine_(engine), face_(face) {}

    float compute(Measure measure) const;
    const FNImage<float>& reshapedImage() const;
    const FNImage<float>& exposureCrop() const;
    /// Features that four measures share; under the mutex of the values.
    const FNVector<float>& headFeatures() const;

    bool isColor_;
    Engine engine_; ///< null in a packed object, as is the face
    Face face_;
    std::optional<Stored> stored_;

    FNMutex valuesMutex_{FNMutex::recursive}, reshapedMutex_{FNMutex::recursive},
        cropMutex_{FNMutex::recursive};
    mutable std::array<std::optional<float>, measures> values_;
    mutable std::optional<Ethnicity> ethnicity_;
    MadeOnDemand<FNImage<float>> reshaped_, crop_;
    MadeOnDemand<FNVector<float>> headFeatures_;
};

} // namespace Cmp::Portrait

#pragma once

#include "fn/deployment/component.h"
#include "fn/image.h"

namespace Cmp::B7 {

/// How good a sample is for a record, from measures of it. Immutable.
class SampleEvaluator {
public:
    /// Which measures count; one that does not need not be taken.
    struct Regarded {
        bool sharpness = true;
        bool deviationFromFrontalPose = true;
        bool motionBlurStrength = true;
        bool paddingRatio = true;
        bool simToIdeal = true;
    };

    SampleEvaluator() = default;
    SampleEvaluator(const Regarded& regarded, float simToIdealThreshold)
        : regarded_(regarded), simToIdealThreshold_(simToIdealThreshold) {}
    explicit SampleEvaluator(const Fn::Deployment::Component& component);

    static std::string typeId() { return "Cmp::B7::SampleEvaluator"; }
    static Fn::Deployment::Type define();

    const Regarded& regarded() const { return regarded_; }

    /// From 0 to 1, the best, by the mean badness of the measures that count.
    /// @param sharpness,deviation of Portrait::Characteristics
    /// @param motion in eye distances during the exposure
    /// @param padding share of the warped face that is outside of the image
    /// @param simToIdeal of imgSimToIdeal()
    float quality(double const& sharpness, float const& deviation, float const& motion, float const& padding,
                  float const& simToIdeal) const;

private:
    Regarded regarded_;
    float simToIdealThreshold_ = 0.3f;
};

/// How evenly the gray values of an image are spread over the range that they have: the cosine of their
/// histogram and a flat one.
/// @param clip share of the pixels that may be left out at either end of the range
float imgSimToIdeal(const FNImage<unsigned char>& image, float clip);

} // namespace Cmp::B7

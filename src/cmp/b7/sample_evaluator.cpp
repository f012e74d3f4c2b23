#include "cmp/b7/sample_evaluator.h"

#include "fn/deployment/leaf_values.h"
#include "img/local_filters.h"

#include <cmath>

namespace Cmp::B7 {

using namespace Fn::Deployment;

namespace {

/// A measure's badness: a logistic curve, cut to 0 to 1. Fitted to the errors of comparisons.
struct Logistic {
    float height, slope, middle, shift;

    float operator()(float measure) const {
        return std::clamp(height / (1 + std::exp(slope * (measure - middle))) + shift, 0.0f, 1.0f);
    }
};

constexpr Logistic sharpnessBadness{0.30613106f, 0.41564256f, 0.24185032f, -0.12914619f};
constexpr Logistic deviationBadness{0.055431534f, -1.6272262f, 1.1306449f, 0};
constexpr Logistic paddingBadness{0.052539192f, -16.09079f, 0.10749001f, -0.0079144435f};
constexpr Logistic motionBadness{0.229098f, -7.5728683f, 0.34522232f, -0.015629584f};

bool flag(const Component& component, const char* key) {
    return Value<Bool>::get(component.subComponent(key));
}

} // namespace

SampleEvaluator::SampleEvaluator(const Component& component)
    : regarded_{flag(component, "RegardSharpness"), flag(component, "RegardDeviationFromFrontalPose"),
                flag(component, "RegardMotionBlurStrength"), flag(component, "RegardPaddingRatio"),
                flag(component, "RegardSimToIdeal")},
      simToIdealThreshold_(Value<Float>::get(component.subComponent("SimToIdealThreshold"))) {}

Type SampleEvaluator::define() {
    const auto flag = [](const char* key, const std::string& measure) {
        return propertyWithDefault<Bool>::create(key, true, "Whether the quality regards " + measure + ".");
    };
    return Type(
        typeId(), "B7 Sample evaluator facility",
        properties(flag("RegardSharpness", "sharpness"),
                   flag("RegardDeviationFromFrontalPose", "the deviation from a frontal pose"),
                   flag("RegardMotionBlurStrength", "the strength of motion blur"),
                   flag("RegardPaddingRatio", "how much of the face is outside of the image"),
                   flag("RegardSimToIdeal", "the similarity of the gray values' histogram to an even one"),
                   propertyWithDefault<Float>::create("SimToIdealThreshold", 0.3f,
                                                      "Least similarity to an even histogram.")),
        "", false);
}

float SampleEvaluator::quality(double const& sharpness, float const& deviation, float const& motion,
                               float const& padding, float const& simToIdeal) const {
    float sum = 0;
    int count = 0;
    const auto add = [&](bool regarded, float badness) {
        if (!regarded) return;
        sum += badness;
        ++count;
    };
    add(regarded_.sharpness, sharpnessBadness(static_cast<float>(sharpness)));
    add(regarded_.deviationFromFrontalPose, deviationBadness(deviation));
    add(regarded_.paddingRatio, paddingBadness(padding));
    add(regarded_.motionBlurStrength, motionBadness(motion));
    add(regarded_.simToIdeal, simToIdeal < simToIdealThreshold_ ? 1.0f : 0.0f);
    const float badness = count == 0 ? 0 : sum / static_cast<float>(count);
    return (std::exp((1 - badness) * 27.725887f) - 1) * 8.987831e-13f;
}

float imgSimToIdeal(const FNImage<unsigned char>& image, float clip) {
    const auto histogram = imgGrayHistogram(image);
    const auto spare = static_cast<double>(clip) * image.size();
    auto first = histogram.begin(), last = histogram.end();
    // Both ends move inwards over what is empty or may be left out.
    for (double left = 0; first != last && left + *first <= spare; ++first) left += *first;
    for (double left = 0; first != last && left + *std::prev(last) <= spare; --last) left += *std::prev(last);
    double sum = 0, squares = 0;
    for (auto bin = first; bin != last; ++bin) {
        sum += *bin;
        squares += static_cast<double>(*bin) * *bin;
    }
    const double denominator = std::sqrt(squares * static_cast<double>(last - first));
    return denominator == 0 ? 0.0f : static_cast<float>(sum / denominator);
}

} // namespace Cmp::B7

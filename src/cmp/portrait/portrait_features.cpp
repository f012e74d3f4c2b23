#include "cmp/portrait/portrait_features.h"

#include "img/affine/turns.h"

namespace Cmp::Portrait {

namespace {

using Params = Pcld::GaborPyrProcessor::Params;

constexpr float twoPi = 6.2831855f, narrow = 3.4557519f; // widths of the filters

constexpr Params glassesParams{72, 40, 1, 5, 8, 4.0f, 4, 4, 0, 0, twoPi};
constexpr Params poseParams{108, 108, 2, 9, 8, 4.0f, 18, 18, 0, 0.003068f, twoPi};
constexpr Params mouthParams{80, 64, 1, 8, 5, 1.8f, 20, 22, 0, 0, narrow};
constexpr Params headParams{80, 96, 3, 9, 8, 5.7f, 4, 4, 0, 0.003068f, twoPi};
constexpr Params genderAndAgeParams{160, 160, 3, 9, 8, 5.7f, 16, 16, 0, 0.00115f, twoPi};

FNImage<float> patchOf(const FNImage<float>& portrait, PortraitFeatures::Eye eye) {
    if (eye == PortraitFeatures::Eye::eye1) return windowOf(portrait, Window::eye1);
    return Img::Affine::vertReflection(portrait, Window::eye0);
}

} // namespace

FNVector<float> PortraitFeatures::glasses(const FNImage<float>& portrait) const {
    return glasses_.get(mutex_, [] { return Pcld::GaborPyrProcessor(glassesParams); })(
        windowOf(portrait, Window::glasses));
}

FNVector<float> PortraitFeatures::pose(const FNImage<float>& portrait) const {
    return pose_.get(mutex_, [] { return Pcld::GPyrPreprocessor(poseParams, "Pose"); })(
        windowOf(portrait, Window::pose));
}

FNVector<float> PortraitFeatures::mouth(const FNImage<float>& portrait) const {
    return mouth_.get(mutex_, [] { return Pcld::GPyrPreprocessor(mouthParams, "Mouth"); })(
        windowOf(portrait, Window::mouth));
}

FNVector<float> PortraitFeatures::head(const FNImage<float>& portrait) const {
    return head_.get(mutex_,
                     [] { return Pcld::GaborPyrProcessor(headParams); })(windowOf(portrait, Window::head));
}

FNVector<float> PortraitFeatures::closedEye(const FNImage<float>& portrait, Eye eye) const {
    return closedEye_.get(mutex_, [] { return ClosedEyeFeatureExtractor(); }).extract(patchOf(portrait, eye));
}

FNVector<float> PortraitFeatures::gazeAway(const FNImage<float>& portrait, Eye eye) const {
    return gazeAway_.get(mutex_, [] { return GazeAwayFeatureExtractor(); }).extract(patchOf(portrait, eye));
}

FNVector<float> PortraitFeatures::genderOrAge(const FNImage<float>& portrait) const {
    return genderOrAge_.get(mutex_, [] { return Pcld::GPyrPreprocessor(genderAndAgeParams, "GenderOrAge"); })(
        portrait);
}

FNVector<float> PortraitFeatures::ethnicity(const FNImage<float>& portrait) const {
    const Pcld::Normalizer& normalizer = ethnicity_.get(mutex_, [] {
        return Pcld::Normalizer(ethnicityPortrait.side, ethnicityPortrait.side, Pcld::Normalization::global);
    });
    return FNVector<float>(normalizer(portrait).span());
}

const SharpnessMeter& PortraitFeatures::sharpnessMeter() const {
    return sharpness_.get(mutex_, [] { return SharpnessMeter(); });
}

} // namespace Cmp::Portrait

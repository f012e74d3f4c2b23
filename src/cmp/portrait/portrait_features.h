#pragma once

#include "cmp/pcld/preprocessor.h"
#include "cmp/portrait/eye_features.h"
#include "cmp/portrait/made_on_demand.h"
#include "cmp/portrait/portrait_geometry.h"
#include "cmp/portrait/sharpness.h"

namespace Cmp::Portrait {

/// The feature vectors that the trained measures are computed from. Each extractor is made when it is first
/// needed. May be used by any number of threads.
///
/// `portrait` is the standard portrait, which is 108 by 108 pixels.
class PortraitFeatures {
public:
    enum class Eye { eye0, eye1 };

    /// @param mutex held while an extractor is made
    explicit PortraitFeatures(const FNMutex& mutex) : mutex_(mutex) {}

    FNVector<float> glasses(const FNImage<float>& portrait) const;
    FNVector<float> pose(const FNImage<float>& portrait) const;
    FNVector<float> mouth(const FNImage<float>& portrait) const;
    /// For the extent of the head: chin, crown and ears.
    FNVector<float> head(const FNImage<float>& portrait) const;
    /// Both eyes look like the one on the image's left: the other is mirrored.
    FNVector<float> closedEye(const FNImage<float>& portrait, Eye eye) const;
    FNVector<float> gazeAway(const FNImage<float>& portrait, Eye eye) const;
    /// @param portrait in the format of gender or age
    FNVector<float> genderOrAge(const FNImage<float>& portrait) const;
    /// @param portrait in the format of ethnicity
    FNVector<float> ethnicity(const FNImage<float>& portrait) const;

    const SharpnessMeter& sharpnessMeter() const;

private:
    FNMutex mutex_;
    MadeOnDemand<Pcld::GaborPyrProcessor> glasses_, head_;
    MadeOnDemand<Pcld::GPyrPreprocessor> pose_, mouth_, genderOrAge_;
    MadeOnDemand<ClosedEyeFeatureExtractor> closedEye_;
    MadeOnDemand<GazeAwayFeatureExtractor> gazeAway_;
    MadeOnDemand<Pcld::Normalizer> ethnicity_;
    MadeOnDemand<SharpnessMeter> sharpness_;
};

} // namespace Cmp::Portrait

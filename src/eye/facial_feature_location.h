#pragma once

#include "fn/geometry.h"

/// Where a facial feature (an eye, the mouth, the bridge of the nose) was found.
struct FacialFeatureLocation {
    FNPos pos;            ///< image pixels
    float size = 0;       ///< eye distance that the feature's scale stands for, image pixels
    float confidence = 0; ///< larger is better
};

#pragma once

#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"

namespace Eye::Ojo::T8 {

/// What becomes the patch of a search, in image pixels.
struct SearchArea {
    FNPos origin; ///< its upper left corner, or upper right one if it is mirrored
    FNPos u;      ///< along its rows
    FNPos v;      ///< along its columns
};

/// The squares around both eyes; the second is mirrored, so that all eyes look like first ones.
struct EyeSearchAreas {
    SearchArea first, second;

    /// Side of a square in eye distances.
    static constexpr float relPatchSize = 1.6f;

    /// Where the eyes of a face are expected.
    static EyeSearchAreas of(const FaceFinder::Location& face);
    /// Around known eyes at distinct positions.
    static EyeSearchAreas of(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2);
};

/// Where a feature lies with respect to the eyes, in eye distances.
struct Placement {
    float along;  ///< side of the area along the line from the first eye to the second
    float across; ///< side across it
    float below;  ///< from the midpoint of the eyes to the middle of the area

    SearchArea area(FNPos eye1, FNPos eye2) const;
};

} // namespace Eye::Ojo::T8

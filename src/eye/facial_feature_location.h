#pragma once

#include "fn/geometry.h"
#include "fn/serialize.h"

/// Where a facial feature (an eye, the mouth, the bridge of the nose) was found.
struct FacialFeatureLocation {
    FNPos pos;            ///< image pixels
    float size = 0;       ///< eye distance that the feature's scale stands for, image pixels
    float confidence = 0; ///< larger is better
};

/// A list of the position, itself a list of x and y, the size and the confidence.
template <> struct Fn::Serializer<FacialFeatureLocation> {
    using Position = FNPair<float, float>;

    static Package pack(const FacialFeatureLocation& location) {
        return Package(FNTriple<Position, float, float>({location.pos.x, location.pos.y}, location.size,
                                                        location.confidence));
    }
    /// @throws FNEBadArg
    static FacialFeatureLocation unpack(const Package& package) {
        const FNTriple<Position, float, float> fields(package);
        return {{fields.first.first, fields.first.second}, fields.second, fields.third};
    }
};

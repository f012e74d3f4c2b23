#pragma once

#include "cmp/pcld/floating_point_feature.h"
#include "fn/matrix.h"

#include <string>

namespace Cmp::Pcld {

/// The trained projection from raw vectors to features: (raw - average) * matrix. Its file holds both as
/// packages, one behind the other.
struct Transformation {
    Fn::Matrix<float> matrix; ///< a row for each raw component, a column for each component of a feature
    FNVector<float> average;  ///< of the raw vectors

    FNVector<float> operator()(const FNVector<float>& raw) const { return (raw - average) * matrix; }

    /// @throws FNEIOError if the file cannot be opened, is cut, or does not fit vectors of `rawSize`
    /// components; FNEBadArg for a package of another form
    static Transformation read(const std::string& path, std::size_t rawSize);
    /// @throws FNEIOError
    void write(const std::string& path) const;
};

/// Reads a list of vectors, and scales each of them to length 1.
/// @throws FNEIOError if the file cannot be opened or is cut; FNEBadArg for a vector of length 0
IsotropisationData readIsotropisationData(const std::string& path);

} // namespace Cmp::Pcld

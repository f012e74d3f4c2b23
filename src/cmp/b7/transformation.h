#pragma once

#include "cmp/multiply_digitized.h"

#include <iosfwd>
#include <string>

namespace Cmp::B7 {

/// The trained projection from raw vectors to features: about (raw - average) * (matrix * factor) +
/// translation. Its file holds the factor, the matrix and the vectors as packages, one behind the other.
struct Transformation {
    float factor;
    /// A row for each raw component, a column for each component of a feature.
    Fn::Matrix<signed char> matrix;
    FNVector<float> average;     ///< of the raw vectors
    FNVector<float> translation; ///< added to features
    FNVector<float> base;        ///< of multiplyDigitized()

    /// @throws FNEBadArg for a vector of another size
    FNVector<float> operator()(FNVector<float> const& raw) const {
        return multiplyDigitized(raw - average, matrix, factor, base) + translation;
    }

    /// Into memory of this process: the file may change or go afterwards, as it does when a new version is
    /// copied over it. Mapping it would cost nothing instead of 17 ms and 122 MB, but then writing to the
    /// file changes scores in all processes, and cutting it off ends them.
    /// @param rawSize of raw vectors @param components of features
    /// @throws FNEIOError if the file cannot be opened, changes meanwhile or does not hold what it should
    static Transformation read(const std::string& path, std::size_t rawSize, std::size_t components);
    void write(std::ostream& stream) const;
    /// The same to a file, in place of what is there. @throws FNEIOError
    void write(const std::string& path) const;
};

} // namespace Cmp::B7

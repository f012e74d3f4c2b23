#pragma once

#include "fn/image.h"
#include "fn/matrix.h"

#include <iosfwd>

namespace Cmp::Portrait {

/// Estimates the light on a face as 9 coefficients of spherical harmonics, from faces whose light is known:
/// the mean of the coefficients of the most similar ones, weighted by how similar they are. Immutable.
class SpharTransformator {
public:
    static constexpr std::uint32_t side = 64; ///< of the images, pixels
    static constexpr std::size_t coefficients = 9;

    /// What the file holds.
    struct Data {
        FNVector<float> sigmas;            ///< by image: how fast its weight falls with the distance
        Fn::Matrix<float> images;          ///< one in each row, columns of pixels one after another
        Fn::Matrix<float> coefficientRows; ///< one row for each image
    };

    /// Images are scaled to unit length. @throws FNEBadArg if the sizes do not fit
    explicit SpharTransformator(const Data& data);
    /// Reads a package: a list of the sigmas, the three numbers of images, of their columns and of their
    /// rows, and the two matrices. @throws FNEBadArg, FNEIOError
    explicit SpharTransformator(std::istream& stream);
    static void write(const Data& data, std::ostream& stream);

    /// @return the coefficients, all 0 if no image is similar. @throws FNEBadArg for an image of another size
    FNVector<float> operator()(const FNImage<float>& image) const;

private:
    FNVector<float> sigmas_;
    Fn::Matrix<float> images_; ///< one of unit length in each column
    Fn::Matrix<float> coefficientRows_;
};

} // namespace Cmp::Portrait

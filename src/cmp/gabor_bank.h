#pragma once

#include "fn/sparse_image.h"
#include "img/fft/img_fft.h"

#include <vector>

namespace Cmp::Implementation {

/// A bank of Gabor filters, some scales in some orientations k * pi / angles each, that responds to images of
/// one size. Immutable; may be used by any number of threads.
///
/// Filters are cut off below a threshold in the frequency domain, and responses are computed in the columns
/// that are asked for only, so that a filter costs a fraction of a transform.
class GaborBank {
public:
    struct Scale {
        double waveNumber; ///< radians per pixel
        /// Of the image, ascending, in which the responses are needed.
        std::vector<std::uint32_t> columns;
    };

    /// Squared magnitudes of all filters' responses to one image, times the squared number of its pixels.
    /// Must not outlive the bank.
    class Responses {
    public:
        /// @param scale,angle of the filter @param x image column of those of the scale @param y image row
        float operator()(std::size_t scale, std::size_t angle, unsigned int x, unsigned int y) const {
            return filter(scale, angle).row(y)[bank_->columnIndex_[scale][x]];
        }
        /// In the columns of the scale, one next to the other.
        const FNImage<float>& filter(std::size_t scale, std::size_t angle) const {
            return filters_[scale * bank_->angles_ + angle];
        }

    private:
        friend class GaborBank;
        explicit Responses(const GaborBank& bank) : bank_(&bank) {}

        const GaborBank* bank_;
        std::vector<FNImage<float>> filters_;
    };

    /// @param sigma width of the filters, see Img::gaborInFourier()
    /// @param threshold what is below in magnitude is cut off the filters
    /// @throws FNEBadArg for a size that has no transform
    GaborBank(unsigned int width, unsigned int height, const std::vector<Scale>& scales, unsigned int angles,
              double sigma, float threshold);

    /// @throws FNEBadArg for an image of another size
    Responses respond(const FNImage<float>& image) const;
    /// The same by full transforms with the pruned filters.
    Responses respondPlain(const FNImage<float>& image) const;

    unsigned int angles() const { return angles_; }
    /// Index of an image column among those of a scale.
    std::uint32_t columnIndex(std::size_t scale, unsigned int x) const { return columnIndex_[scale][x]; }

private:
    ImgFFTFloat fft_;
    unsigned int angles_;
    std::vector<Scale> scales_;
    std::vector<std::vector<std::uint32_t>> columnIndex_; ///< by scale, of each image column
    std::vector<SparseImage<float>> filters_;
};

} // namespace Cmp::Implementation

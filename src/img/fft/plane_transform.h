#pragma once

#include "fn/complex.h"
#include "fn/sparse_image.h"
#include "img/fft/line_kernels.h"

namespace Img::Fft {

/// The two-dimensional transform of images of one size: rows, then columns. Sizes are the caller's business.
template <class T> class PlaneTransform {
public:
    using Complex = FNImage<FNComplex<T>>;

    /// @throws FNEBadArg as LinePlan does.
    PlaneTransform(std::uint32_t w, std::uint32_t h);

    std::uint32_t w() const { return rows_.n; }
    std::uint32_t h() const { return columns_.n; }
    /// What a transform and its inverse multiply an image with.
    double constantFactor() const;

    Complex transform(const FNImage<T>& image, Workspace<T>& workspace) const;
    Complex transform(const SparseImage<T>& image, Workspace<T>& workspace) const;
    Complex transform(const Complex& image, bool inverse, Workspace<T>& workspace) const;
    /// @param columns ascending; all if there are none. The result has these columns only.
    Complex transform(const SparseImage<FNComplex<T>>& image, bool inverse,
                      std::span<const std::uint32_t> columns, Workspace<T>& workspace) const;

private:
    /// Rows, then columns.
    Complex run(const RowSource<T>& source, std::span<const std::uint32_t> lines,
                std::span<const std::uint32_t> columns, std::uint32_t outWidth,
                Workspace<T>& workspace) const;
    Complex runReal(const RowSource<T>& source, std::span<const std::uint32_t> lines,
                    Workspace<T>& workspace) const;

    LinePlan<T> rows_, columns_;
    std::vector<std::uint32_t> allLines_;
    std::vector<std::uint32_t>
        halfOfColumns_; ///< those that are no mirror image of others if the image is real
};

} // namespace Img::Fft

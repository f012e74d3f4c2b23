#pragma once

#include "img/affine/transform.h"

#include <list>
#include <vector>

namespace Img {

/// An image and where its pixels lie in the image that it was made from.
template <class T> struct ScaledImage {
    FNImage<T> image;
    Affine::Mapping mapping; ///< from `image` to the source
};

/// Makes levels of a pyramid from the source itself.
template <class T> struct PyramidScaling {
    using Pixel = T;

    /// A level that is smaller than the source by `factor`; an empty one if nothing is left.
    static ScaledImage<T> level(const FNImage<T>& source, float factor) {
        ScaledImage<T> result{{size(source.w(), factor), size(source.h(), factor)}, {}};
        result.mapping = Affine::transform(source, result.image);
        return result;
    }

private:
    static std::uint32_t size(std::uint32_t n, float factor) {
        const float scaled = static_cast<float>(n) / factor + 0.5f;
        if (!(factor > 0 && scaled < 1 << 16)) FN_THROW(FNEBadArg, "invalid scale factor for a pyramid");
        return static_cast<std::uint32_t>(scaled);
    }
};

/// One level for each of a list of scale factors, in its order and independent of each other.
template <class Scaling, int>
class SuccessiveScaledPyramid : public std::vector<ScaledImage<typename Scaling::Pixel>> {
public:
    using Pixel = typename Scaling::Pixel;

    /// @throws FNEBadArg for a factor that is not positive, or makes a level of 65536 or more columns or rows
    SuccessiveScaledPyramid(const FNImage<Pixel>& source, const std::list<float>& factors) {
        this->reserve(factors.size());
        for (const float factor : factors) this->push_back(Scaling::level(source, factor));
    }
};

/// Levels of which each is made from the one before by a scaling of a fixed factor; the first is the source
/// scaled to a given size. Mappings lead to the source.
template <class T, class Step> class FixedScaleFactorPyramid : public std::vector<ScaledImage<T>> {
public:
    /// @param firstFactor how much smaller than the source the first level is
    /// @param levels number of levels; none at all if the first one has no pixels
    FixedScaleFactorPyramid(const FNImage<T>& source, float firstFactor, std::size_t levels) {
        this->reserve(levels);
        ScaledImage<T> level = PyramidScaling<T>::level(source, firstFactor);
        if (level.image.empty()) return;
        this->push_back(level);
        while (this->size() < levels) {
            const ScaledImage<T>& larger = this->back();
            ScaledImage<T> smaller{Step::createDst(larger.image.w(), larger.image.h()), {}};
            smaller.mapping = Step::scale(larger.image, smaller.image).compose(larger.mapping);
            this->push_back(smaller);
        }
    }
};

/// How many source pixels one pixel of a level spans, the mean of both axes.
template <class T> float averageEffectiveFactor(const ScaledImage<T>& level) {
    return (level.mapping.m0 + level.mapping.m3) / 2;
}

} // namespace Img

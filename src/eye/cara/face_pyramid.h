#pragma once

#include "fn/image.h"
#include "img/affine/primitives.h"
#include "img/pyramid.h"

#include <list>
#include <vector>

namespace Img {

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

namespace Eye::Cara::T8 {

using Pyramid =
    Img::FixedScaleFactorPyramid<unsigned short, Img::Affine::Primitives::FourToThreeFractionalAveraging>;

/// The part of a level in which windows can have their centre in the search box, with a border of 8 zero
/// pixels around the level so that faces at the edge of the image can be found. Empty if there is nothing to
/// search.
/// @param searchBox pixels of the source image
Img::ScaledImage<unsigned short> addBorder(const Img::ScaledImage<unsigned short>& level,
                                           const FNBox& searchBox);

} // namespace Eye::Cara::T8

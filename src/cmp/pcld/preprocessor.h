#pragma once

#include "cmp/pcld/gabor_processors.h"
#include "img/whitening_filter.h"

#include <string>

namespace Cmp::Pcld {

/// From a float image of a fixed size to a raw feature vector. Immutable.
class Preprocessor {
public:
    virtual ~Preprocessor() = default;
    /// @throws FNEBadArg for an image of another size
    virtual FNVector<float> operator()(const FNImage<float>& image) const = 0;
    virtual std::string algorithmName() const = 0;
    virtual std::size_t featureSize() const = 0;
};

/// What is done to an image before the pyramid.
enum class Normalization {
    none,
    global,        ///< whitening, equalization to -1..1, and unit length
    localAndGlobal ///< whitening, local equalization in tiles of 16 pixels, and the rest of `global`
};

/// Normalizes images of one size. Immutable.
class Normalizer {
public:
    /// @throws FNEBadArg for a size below 2
    Normalizer(unsigned int width, unsigned int height, Normalization normalization);
    /// @throws FNEBadArg for an image of another size, or one that has no room for a tile
    FNImage<float> operator()(const FNImage<float>& image) const;

private:
    Normalization normalization_;
    ImgWhiteningFilter whitening_;
};

/// A pyramid processor behind a normalization.
template <class Processor, Normalization normalization>
class NormalizingPreprocessor final : public Preprocessor {
public:
    using Params = typename Processor::Params;

    NormalizingPreprocessor(const Params& params, const std::string& name)
        : normalizer_(params.width, params.height, normalization), processor_(params), name_(name) {}

    FNVector<float> operator()(const FNImage<float>& image) const override {
        return processor_(normalizer_(image));
    }
    std::string algorithmName() const override { return name_; }
    std::size_t featureSize() const override { return processor_.featureSize(); }

private:
    Normalizer normalizer_;
    Processor processor_;
    std::string name_;
};

using GPyrNoPreprocessor = NormalizingPreprocessor<GaborPyrProcessor, Normalization::none>;
using GPyrPreprocessor = NormalizingPreprocessor<GaborPyrProcessor, Normalization::global>;
using GPyrNRLHPreprocessor = NormalizingPreprocessor<GaborPyrProcessor, Normalization::localAndGlobal>;
using GPyrRankNormNoPreprocessor = NormalizingPreprocessor<GaborPyrRankNormProcessor, Normalization::none>;
using B4Preprocessor = NormalizingPreprocessor<GaborPyrRankNormProcessor, Normalization::localAndGlobal>;

} // namespace Cmp::Pcld

#include "cmp/pcld/gabor_pyramid.h"

#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>
#include <set>

namespace Cmp::Pcld {

namespace {

constexpr double magnitudeFloor = 1e-6;
constexpr unsigned int scaleLimit = 40; // wave lengths of two million pixels

double waveNumber(unsigned int scale) {
    return std::numbers::pi * std::pow(std::numbers::sqrt2, -static_cast<double>(scale));
}

SparseImage<FNComplex<float>> multiply(const FNImage<FNComplex<float>>& spectrum,
                                       const SparseImage<float>& filter) {
    FNImage<FNComplex<float>> product(filter.data().w(), filter.data().h());
    FNComplex<float>* out = product.getExclusive();
    for (ConstSparseImageIterator<float> i(filter); !i.atEnd(); ++i) *out++ = spectrum(i.x(), i.y()) * *i;
    return {product, filter.pixels(), filter.lines(), filter.w(), filter.h()};
}

} // namespace

GaborPyramid::GaborPyramid(const GaborPyramidParams& params)
    : params_(params), fft_(params.width, params.height) {
    if (params.firstScale >= params.endScale || params.endScale > scaleLimit || params.angles == 0 ||
        !(params.gridScale >= 1) || !(params.sigma > 0))
        FN_THROW(FNEBadArg, "Gabor pyramid: invalid parameters");
    makeGrids();
    makeFilters();
}

void GaborPyramid::makeGrids() {
    std::set<std::uint32_t> columns;
    const auto axis = [](unsigned int size, unsigned int margin, unsigned int step) {
        return Axis{step / 2 + margin, step, size > margin ? size - margin : 0};
    };
    for (unsigned int s = params_.firstScale; s < params_.endScale; ++s) {
        const double ratio = waveNumber(params_.firstScale) / waveNumber(s);
        // Powers of two come out a little too small.
        const auto step = static_cast<unsigned int>(params_.gridScale * ratio * (1 + 1e-12));
        grids_.push_back(
            {axis(params_.width, params_.marginX, step), axis(params_.height, params_.marginY, step)});
        for (unsigned int i = 0; i < grids_.back().x.count(); ++i) columns.insert(grids_.back().x.place(i));
    }
    columns_.assign(columns.begin(), columns.end());
    columnIndex_.resize(params_.width);
    for (unsigned int i = 0; i < columns_.size(); ++i) columnIndex_[columns_[i]] = i;
}

void GaborPyramid::makeFilters() {
    for (unsigned int s = params_.firstScale; s < params_.endScale; ++s)
        for (unsigned int a = 0; a < params_.angles; ++a) {
            const double angle = a * std::numbers::pi / params_.angles;
            FNImage<FNComplex<float>> filter(params_.width, params_.height);
            Img::gaborInFourier(params_.sigma,
                                FN2Vector<double>(std::cos(angle), std::sin(angle)) * waveNumber(s), filter,
                                magnitudeFloor);
            filters_.push_back(Img::pruneGaborImage(filter, params_.filterThreshold));
        }
}

std::size_t GaborPyramid::featureSize() const {
    std::size_t places = 0;
    for (const Grid& grid : grids_) places += std::size_t{grid.x.count()} * grid.y.count();
    return places * params_.angles;
}

GaborPyramid::Responses GaborPyramid::respond(const FNImage<float>& image) const {
    const auto temporary = fft_.create();
    const FNImage<FNComplex<float>> spectrum = fft_.transformReal(image, temporary);
    Responses responses(columnIndex_, params_.angles);
    for (const SparseImage<float>& filter : filters_) {
        const auto columns = fft_.processColumnsSparse(multiply(spectrum, filter), columns_, temporary);
        FNImage<float> magnitudes(columns.w(), columns.h());
        float* out = magnitudes.getExclusive();
        for (const FNComplex<float>* c = columns.data(); c != columns.data() + columns.size(); ++c)
            *out++ = c->re * c->re + c->im * c->im;
        responses.filters_.push_back(magnitudes);
    }
    return responses;
}

} // namespace Cmp::Pcld

#include "cmp/portrait/sphar_transformator.h"

#include "fn/serialize.h"

#include <algorithm>
#include <cmath>
#include <istream>

namespace Cmp::Portrait {

namespace {

constexpr std::size_t pixels = std::size_t{SpharTransformator::side} * SpharTransformator::side;

FNVector<float> ofUnitLength(const FNVector<float>& vector) {
    const float length = std::sqrt(vector * vector);
    return length > 0 ? vector / length : vector;
}

void requireFinite(std::span<const float> values) {
    if (!std::all_of(values.begin(), values.end(), [](float v) { return std::isfinite(v); }))
        FN_THROW(FNEBadArg, "SpharTransformator: value that is no number");
}

FNVector<float> columnsOf(const FNImage<float>& image) {
    FNVector<float> columns(image.size());
    float* out = columns.getExclusive();
    for (std::uint32_t x = 0; x < image.w(); ++x)
        for (std::uint32_t y = 0; y < image.h(); ++y) *out++ = image(x, y);
    return columns;
}

SpharTransformator::Data read(std::istream& stream) {
    Fn::PackageReader list{Fn::Package(stream)};
    const auto sigmas = list.next<FNVector<float>>();
    const auto sizes = list.next<FNVector<unsigned int>>();
    const auto images = list.next<Fn::Matrix<float>>();
    const auto coefficientRows = list.next<Fn::Matrix<float>>();
    if (sizes.size() != 3 || sizes[0] != images.rows() || std::size_t{sizes[1]} * sizes[2] != images.cols())
        FN_THROW(FNEBadArg, "SpharTransformator: sizes that do not fit the images");
    return {sigmas, images, coefficientRows};
}

} // namespace

SpharTransformator::SpharTransformator(const Data& data)
    : sigmas_(data.sigmas), images_(pixels, data.images.rows()), coefficientRows_(data.coefficientRows) {
    const std::size_t n = data.images.rows();
    if (data.images.cols() != pixels || sigmas_.size() != n || coefficientRows_.rows() != n ||
        coefficientRows_.cols() != coefficients)
        FN_THROW(FNEBadArg, "SpharTransformator: images, sigmas and coefficients that do not fit each other");
    requireFinite(sigmas_.span());
    requireFinite({data.images.get(), data.images.size()});
    requireFinite({coefficientRows_.get(), coefficientRows_.size()});
    for (std::size_t i = 0; i < n; ++i) images_.column(i, ofUnitLength(data.images.row(i)));
}

SpharTransformator::SpharTransformator(std::istream& stream) : SpharTransformator(read(stream)) {}

void SpharTransformator::write(const Data& data, std::ostream& stream) {
    const std::vector<unsigned int> sizes{static_cast<unsigned int>(data.images.rows()), side, side};
    Fn::Package(std::list<Fn::Package>{Fn::serialize(data.sigmas),
                                       Fn::serialize(FNVector<unsigned int>(sizes)),
                                       Fn::serialize(data.images), Fn::serialize(data.coefficientRows)})
        .write(stream);
}

FNVector<float> SpharTransformator::operator()(const FNImage<float>& image) const {
    constexpr double nearest = 0.1; // share of the images that count
    if (image.w() != side || image.h() != side)
        FN_THROW(FNEBadArg, "SpharTransformator: image of another size");
    FNVector<float> result(coefficients, 0.0f);
    const std::size_t n = images_.cols();
    if (n == 0) return result;

    const FNVector<float> products = ofUnitLength(columnsOf(image)) * images_;
    std::vector<float> distances(n); // of two unit vectors
    for (std::size_t i = 0; i < n; ++i) distances[i] = std::sqrt(std::max(2 * (1 - products.get()[i]), 0.0f));
    std::vector<float> sorted(distances);
    const auto limit = sorted.begin() + static_cast<std::ptrdiff_t>(nearest * static_cast<double>(n));
    std::nth_element(sorted.begin(), limit, sorted.end());

    float total = 0;
    for (std::size_t i = 0; i < n; ++i) {
        if (!(distances[i] < *limit)) continue;
        const float sigma = sigmas_.get()[i], ratio = distances[i] / sigma;
        const float weight = sigma > 0 ? std::exp(-0.5f * ratio * ratio) : distances[i] > 0 ? 0.0f : 1.0f;
        for (std::size_t k = 0; k < coefficients; ++k) result[k] += weight * coefficientRows_(i, k);
        total += weight;
    }
    if (total > 0) return result / total;
    result.fill(0);
    return result;
}

} // namespace Cmp::Portrait

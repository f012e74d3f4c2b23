#include "cmp/multiply_digitized.h"

#include "fn/numeric/vector_primitives.h"

#include <cmath>

namespace Cmp {

namespace {

short digitized(float value) {
    // A greatest element just above 32767 would come from rounding, one that is not a number from a constant
    // vector.
    constexpr float limit = 32767;
    if (std::isnan(value)) return 0;
    return static_cast<short>(std::clamp(std::round(value), -limit, limit));
}

} // namespace

DigitizedVector::DigitizedVector(FNVector<float> const& v, std::size_t size) : digits(size) {
    if (size < v.size()) FN_THROW(FNEBadArg, "Invalid Size for digitized vector");
    float least = 1e7f, greatest = -1e7f;
    for (const float value : v) {
        least = std::min(least, value);
        greatest = std::max(greatest, value);
    }
    offset = (least + greatest) / 2;
    scale = 32767 / ((greatest - least) / 2);
    short* const out = digits.getExclusive();
    std::transform(v.begin(), v.end(), out, [&](float value) { return digitized((value - offset) * scale); });
    std::fill(out + v.size(), out + size, short{0});
}

FNVector<int> FPMatVecMultiplier::leftMultiplyPlain(FNVector<short> const& v,
                                                    Fn::Matrix<signed char> const& m) const {
    if (v.size() != m.rows()) FN_THROW(FNEBadArg, "Invalid Size for digitized vector");
    FNVector<int> products(m.cols());
    int* const out = products.getExclusive();
    for (std::size_t c = 0; c < m.cols(); ++c)
        out[c] = static_cast<int>(Fn::Numeric::dot(m.get() + m.colidx(c), v.get(), v.size()));
    return products;
}

FNVector<float> multiplyDigitized(FNVector<float> const& v, Fn::Matrix<signed char> const& m,
                                  float const& factor, FNVector<float> const& base) {
    if (base.size() != m.cols()) FN_THROW(FNEBadArg, "Invalid Size for digitized vector");
    const DigitizedVector digitized(v, m.rows());
    const FNVector<int> products = FPMatVecMultiplier().leftMultiply(digitized.digits, m);
    const float unit = factor / digitized.scale;
    FNVector<float> result(m.cols());
    std::transform(products.begin(), products.end(), base.begin(), result.getExclusive(),
                   [&](int product, float weightSum) {
                       return static_cast<float>(product) * unit + weightSum * digitized.offset;
                   });
    return result;
}

} // namespace Cmp

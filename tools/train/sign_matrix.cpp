#include "train/sign_matrix.h"

namespace Train {

std::vector<float> expanded(const std::vector<Signs>& vectors, const std::vector<std::size_t>& chosen) {
    if (chosen.empty()) return {};
    const std::uint32_t d = vectors[chosen.front()].size();
    std::vector<float> matrix(std::size_t{d} * chosen.size());
    float* column = matrix.data();
    for (const std::size_t i : chosen) {
        const unsigned char* const bytes = vectors[i].bytes();
        for (std::uint32_t k = 0; k < d; ++k) *column++ = bytes[k / 8] >> k % 8 & 1 ? 1.0f : -1.0f;
    }
    return matrix;
}

Signs signsOf(const float* values, std::uint32_t n) {
    Fn::SVVectorSequentialBuilder<int> builder(n);
    for (std::uint32_t i = 0; i < n; ++i) builder.setNextSign(values[i] >= 0);
    return builder.vector();
}

} // namespace Train

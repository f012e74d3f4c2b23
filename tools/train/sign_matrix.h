#pragma once

#include "fn/sign_value_vector.h"

#include <cstdint>
#include <random>
#include <vector>

namespace Train {

using Signs = Fn::SignValueVector<int>;
using Random = std::mt19937_64;

/// Sign vectors with their labels: what a discriminator learns from.
struct SignSet {
    std::vector<Signs> vectors;
    std::vector<float> labels; ///< 1 for a face, 0 for anything else

    void add(const Signs& vector, bool isFace) {
        vectors.push_back(vector);
        labels.push_back(isFace ? 1.0f : 0.0f);
    }
    std::size_t size() const { return vectors.size(); }
    std::uint32_t dimension() const { return vectors.front().size(); }
};

/// The chosen vectors as floats of +1 and -1, one column for each.
std::vector<float> expanded(const std::vector<Signs>& vectors, const std::vector<std::size_t>& chosen);
/// A vector from the signs of numbers.
Signs signsOf(const float* values, std::uint32_t n);

} // namespace Train

#pragma once

#include <algorithm>

namespace Eye::Implementation {

/// Sorts indices of support vectors by their alphas, which are numbers: the positive ones descending, then
/// the others ascending. So a sum of non-negative kernel values first climbs as far as it can, and then
/// cannot rise any more. Of equal alphas, the later vector is first among the positive ones, the earlier
/// among the others.
template <class Iterator> void sortByAlpha(Iterator first, Iterator last, const float* alphas) {
    std::sort(first, last, [=](auto i, auto j) {
        const bool positive = alphas[i] > 0;
        if (positive != (alphas[j] > 0)) return positive;
        if (alphas[i] != alphas[j]) return positive ? alphas[i] > alphas[j] : alphas[i] < alphas[j];
        return positive ? i > j : i < j;
    });
}

} // namespace Eye::Implementation

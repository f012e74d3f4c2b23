#include "img/affine/overlap.h"

#include <algorithm>

namespace Img::Affine {

Overlap::Overlap(std::span<const std::uint32_t> sourceWidths, std::span<const std::uint32_t> resultWidths)
    : first(resultWidths.size()), count(resultWidths.size()),
      width(resultWidths.begin(), resultWidths.end()) {
    // Walks both axes at once; `left` is what remains of source pixel j.
    std::vector<std::uint32_t> packed;
    std::size_t j = 0;
    std::uint32_t left = sourceWidths.empty() ? 0 : sourceWidths[0];
    for (std::size_t x = 0; x < resultWidths.size(); ++x) {
        while (left == 0 && j + 1 < sourceWidths.size()) left = sourceWidths[++j];
        first[x] = static_cast<std::uint32_t>(j);
        std::uint32_t wanted = resultWidths[x], n = 0;
        do {
            const std::uint32_t common = std::min(wanted, left);
            packed.push_back(common);
            ++n;
            wanted -= common;
            left -= common;
            if (left == 0 && wanted != 0) {
                if (j + 1 >= sourceWidths.size()) break;
                left = sourceWidths[++j];
            }
        } while (wanted != 0);
        count[x] = n;
        taps = std::max(taps, n);
    }

    weights.assign(std::uint64_t{taps} * resultWidths.size(), 0);
    auto from = packed.begin();
    for (std::uint32_t x = 0; x < size(); ++x) {
        std::copy_n(from, count[x], weights.begin() + std::uint64_t{x} * taps);
        from += count[x];
    }
}

} // namespace Img::Affine

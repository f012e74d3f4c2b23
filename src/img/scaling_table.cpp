#include "img/scaling_table.h"

#include "fn/exception.h"

#include <cmath>
#include <sstream>

namespace Img {

std::list<float> createScalingTable(double const& reference, double const& factor, double const& minSize,
                                    double const& maxSize, double const& overlap, bool clampToOne) {
    constexpr double mostLevels = 10000;
    const double step = std::pow(factor, 2 * (1 - overlap));
    const double levels = std::log(maxSize / minSize) / std::log(step), rounded = std::ceil(levels);
    const bool valid = reference > 0 && factor > 1 && overlap >= 0 && overlap < 1 && minSize > 0 &&
                       minSize <= maxSize && rounded < mostLevels;
    if (!valid) {
        std::ostringstream message;
        message << "Img::createScalingTable parameter error: " << reference << ", " << factor << ", "
                << overlap << ", " << minSize << ", " << maxSize;
        FN_THROW(FNEBadArg, message.str());
    }

    std::list<float> table;
    double current = std::pow(step, (levels - rounded) / 2) * minSize / reference;
    for (int round = 0; round <= static_cast<int>(rounded); ++round) {
        const bool enlarges = current < 1;
        if (!enlarges) table.push_back(static_cast<float>(current));
        current *= step;
        if (enlarges && clampToOne && current > 1) {
            table.push_back(1.0f);
            current = step;
        }
    }
    return table;
}

} // namespace Img

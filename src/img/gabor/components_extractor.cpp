#include "img/gabor/components_extractor.h"

#include "fn/exception.h"

namespace Img::Gabor {

void MRIComponentsExtractor::appendBlock(const ResponseImages& responses, FNGridPos pos, std::uint32_t width,
                                         std::uint32_t height, std::vector<float>& features) {
    double energy = 0;
    for (const auto& response : responses) {
        if (response.w() != width || response.h() != height)
            FN_THROW(FNEBadArg, "MRIComponentsExtractor: response of another size than the grid's block");
        energy += static_cast<double>(norm(response.get(pos)));
    }
    const float scale = energy > 0 ? static_cast<float>(1 / std::sqrt(energy)) : 0;
    for (const auto& response : responses) features.push_back(std::sqrt(norm(response.get(pos))) * scale);
    for (const auto& response : responses) features.push_back(response.get(pos).re * scale);
    for (const auto& response : responses) features.push_back(response.get(pos).im * scale);
}

} // namespace Img::Gabor

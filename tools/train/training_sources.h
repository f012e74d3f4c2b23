#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Where the samples of a training come from and are kept.
struct TrainingSources {
    std::filesystem::path data;  ///< root of the labelled images
    std::filesystem::path etc;   ///< unpacked models of the finders
    std::filesystem::path cache; ///< keeps extracted features
    std::uint64_t seed = 1;
};

} // namespace Train

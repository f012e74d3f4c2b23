#pragma once

#include <array>
#include <cstddef>

namespace Cmp::Pcld {

/// Size of the neighbourhood that a filter response is ranked in: 3 scales, 3 angles and 3 by 3 places.
inline constexpr std::size_t rankTableSize = 81;

/// What stands for a response that so many of its neighbours exceed: about the mean of such responses over
/// images of 3D data seen along one axis. Trained.
extern const std::array<float, rankTableSize> rankTableX;
extern const std::array<float, rankTableSize> rankTableZ;

} // namespace Cmp::Pcld

#pragma once

#include <cstdint>
#include <vector>

/// Spreads `p` units as evenly as possible over `q` slots (Rothstein's code of a straight line): each slot
/// gets floor(p / q) units or one more.
/// @return the units of each slot; their sum is `p`.
/// @throws FNEBadArg if p < q.
std::vector<std::uint32_t> imgRothsteinCode(std::uint64_t p, std::uint32_t q);

#pragma once

#include "eye/neighbour_clustering.h"

#include <list>

namespace Eye::Cara::T8 {

/// The faces of which none covers too much of a more confident one, in descending order of confidence. A face
/// reaches one eye distance across and 1.2 eye distances along its own upright axis.
std::list<::FaceFinder::Location>
removeOverlaps(const std::multiset<::FaceFinder::Location, MoreConfident>& candidates);

} // namespace Eye::Cara::T8

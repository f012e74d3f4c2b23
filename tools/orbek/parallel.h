#pragma once

#include <cstddef>
#include <functional>

namespace Orbek::Tool {

/// Calls `work(thread, item)` for each item once, items in order and threads counted from 0. After an
/// exception no further item is begun, and the first exception comes out when all threads have ended.
/// @param threads at most that many, the calling one among them
void inParallel(std::size_t threads, std::size_t items,
                const std::function<void(std::size_t thread, std::size_t item)>& work);

} // namespace Orbek::Tool

#include "parallel.h"

#include <algorithm>
#include <atomic>
#include <exception>
#include <mutex>
#include <thread>
#include <vector>

namespace Orbek::Tool {

void inParallel(std::size_t threads, std::size_t items,
                const std::function<void(std::size_t thread, std::size_t item)>& work) {
    std::atomic<std::size_t> next = 0;
    std::mutex mutex; // guards the failure
    std::exception_ptr failure;
    const auto run = [&](std::size_t thread) {
        try {
            for (std::size_t item; (item = next++) < items;) work(thread, item);
        } catch (...) {
            const std::lock_guard lock(mutex);
            if (!failure) failure = std::current_exception();
            next = items;
        }
    };
    std::vector<std::jthread> others;
    for (std::size_t thread = 1; thread < std::min(threads, items); ++thread)
        others.emplace_back(run, thread);
    run(0);
    others.clear(); // waits for them
    if (failure) std::rethrow_exception(failure);
}

} // namespace Orbek::Tool

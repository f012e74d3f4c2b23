#pragma once

#include "cmp/population.h"
#include "fn/thread/mutex.h"
#include "fn/view.h"

#include <deque>
#include <optional>

namespace Cmp::Implementation {

/// Deals out the records of populations in parts of about equal size. Several iterators on several threads
/// take from one of these.
///
/// @tparam T class of the records
template <class T> class Partitionizer {
public:
    /// Records [begin, end) of a population, which lives as long as this does.
    struct Partition {
        Population population;
        const FeatureSets<T>* records;
        std::size_t begin, end;
    };

    /// @param partitions number of parts of each population, at least 1
    Partitionizer(const Fn::View<Population>::Iterator& populations, unsigned int partitions)
        : populations_(populations), partitions_(partitions) {}

    /// The next part, none at the end. @throws std::bad_cast for a population of other records
    std::optional<Partition> getPartition() {
        const FNMutexLock lock(mutex_);
        if (queue_.empty()) {
            if (populations_.atEnd()) return {};
            divide(*populations_);
            ++populations_;
        }
        const Partition partition = queue_.front();
        queue_.pop_front();
        return partition;
    }

private:
    /// A population with less records than parts stays whole.
    void divide(const Population& population) {
        const auto& records = dynamic_cast<const FeatureSets<T>&>(*population.body());
        const std::size_t count = records.items().size(), size = count / partitions_;
        if (size == 0) {
            queue_.push_back({population, &records, 0, count});
            return;
        }
        for (unsigned int i = 0; i < partitions_; ++i)
            queue_.push_back({population, &records, i * size, i + 1 == partitions_ ? count : (i + 1) * size});
    }

    FNMutex mutex_{FNMutex::recursive}; ///< guards the rest
    Fn::View<Population>::Iterator populations_;
    const unsigned int partitions_;
    std::deque<Partition> queue_;
};

} // namespace Cmp::Implementation

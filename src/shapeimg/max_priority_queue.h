#pragma once

#include <cstddef>
#include <utility>
#include <vector>

namespace ShapeImage {

/// Keeps those of the values put into it that have the least priorities, up to a fixed number; the one with
/// the greatest priority lies on top and is the next to be replaced (a binary heap).
template <class Value, class Priority> class MaxPriorityQueue {
public:
    struct Entry {
        Value value;
        Priority priority;
    };

    explicit MaxPriorityQueue(std::size_t capacity) : capacity_(capacity) { heap_.reserve(capacity); }

    std::size_t capacity() const noexcept { return capacity_; }
    bool full() const noexcept { return heap_.size() == capacity_; }
    /// The entry with the greatest priority; there must be one.
    const Entry& top() const noexcept { return heap_.front(); }
    /// In no order.
    const std::vector<Entry>& entries() const noexcept { return heap_; }

    /// Adds an entry. A full queue drops the top, or the new entry if its priority is not less than the
    /// top's.
    void push(const Value& value, const Priority& priority) {
        if (!full()) {
            heap_.push_back({value, priority});
            siftUp();
        } else if (capacity_ != 0 && priority < top().priority) {
            siftDown({value, priority});
        }
    }

private:
    void siftUp() {
        std::size_t i = heap_.size() - 1;
        for (std::size_t parent; i != 0 && heap_[parent = (i - 1) / 2].priority < heap_[i].priority;
             i = parent)
            std::swap(heap_[i], heap_[parent]);
    }
    /// Puts the entry in place of the top.
    void siftDown(const Entry& entry) {
        const std::size_t n = heap_.size();
        std::size_t i = 0;
        for (std::size_t child = 1; child < n; child = 2 * i + 1) {
            if (child + 1 < n && heap_[child].priority < heap_[child + 1].priority) ++child;
            if (!(entry.priority < heap_[child].priority)) break;
            heap_[i] = heap_[child];
            i = child;
        }
        heap_[i] = entry;
    }

    std::size_t capacity_;
    std::vector<Entry> heap_;
};

} // namespace ShapeImage

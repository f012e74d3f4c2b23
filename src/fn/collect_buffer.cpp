#include "fn/collect_buffer.h"

#include "fn/exception.h"

#include <cstring>

void FNCollectBuffer::add(const unsigned char* data, std::size_t size) {
    if (size > largestCollected) {
        flush();
        pass(data, size);
    } else {
        if (size > capacity - used_) flush();
        collect(data, size);
    }
}

void FNCollectBuffer::flush() {
    if (used_ == 0) return;
    const std::size_t size = used_;
    used_ = 0;
    pass(buffer_.get(), size);
}

void FNCollectBuffer::collect(const unsigned char* data, std::size_t size) {
    if (used_ > capacity) FN_THROW(FNEIOError, "FNCollectBuffer: buffer size corrupted");
    if (size > capacity - used_) FN_THROW(FNEIOError, "FNCollectBuffer: size too large");
    if (size != 0) std::memcpy(buffer_.get() + used_, data, size);
    used_ += size;
}

void FNCollectBuffer::pass(const unsigned char* data, std::size_t size) {
    if (sink_.write(data, size) != size)
        FN_THROW(FNEIOError, "FNCollectBuffer: error writing data to stream");
}

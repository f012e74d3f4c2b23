#pragma once

#include <cstddef>
#include <memory>

/// Collects small pieces of output, so that the many cores of a typical record do not cost a system call
/// each. Pieces above a size are passed on as they are.
class FNCollectBuffer {
public:
    /// Where the bytes go.
    class Sink {
    public:
        virtual ~Sink() = default;
        /// @return the number of bytes taken; anything but `size` is a failure.
        virtual std::size_t write(const unsigned char* data, std::size_t size) = 0;
    };

    static constexpr std::size_t capacity = 8192;
    /// Largest piece that is collected, bytes.
    static constexpr std::size_t largestCollected = 4096;

    explicit FNCollectBuffer(Sink& sink) : sink_(sink), buffer_(new unsigned char[capacity]) {}

    /// Adds a piece of any size. @throws FNEIOError if the sink does not take all bytes.
    void add(const unsigned char* data, std::size_t size);
    /// Hands what is collected to the sink; needed once at the end.
    void flush();

private:
    void collect(const unsigned char* data, std::size_t size);
    void pass(const unsigned char* data, std::size_t size);

    Sink& sink_;
    std::unique_ptr<unsigned char[]> buffer_;
    std::size_t used_ = 0;
};

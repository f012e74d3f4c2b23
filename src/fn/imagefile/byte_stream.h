#pragma once

#include "fn/rmem.h"

#include <fstream>
#include <istream>
#include <ostream>
#include <span>
#include <streambuf>
#include <string>

/// Access to the bytes of a stream, as the readers of image files need it.

namespace Fn {

/// Up to `n` next bytes (fewer at the end of the stream), which are put back.
/// @throws FNEIOError with the text "<caller>: cannot read from stream" if the stream is bad already or
/// cannot go back.
std::string peekBytes(std::istream& stream, std::size_t n, const char* caller);

/// Up to `n` next bytes, fewer at the end of the stream; memory follows what has arrived. @throws FNEIOError
/// if the stream is bad.
FNRMem<unsigned char> readUpTo(std::istream& stream, std::uint64_t n, const char* caller);

/// Everything from the present position. @throws FNEBadFormat if that is more than `maxBytes`; FNEIOError if
/// the stream is bad.
FNRMem<unsigned char> readRest(std::istream& stream, std::uint64_t maxBytes, const char* caller);

/// Opens for binary reading. @throws FNEIOError with `failure` and the name.
std::ifstream openForReading(const std::string& fileName, const char* failure = "Could not open file: ");

/// Writes and flushes. @throws FNEIOError with the text `failure` if the stream does not take all.
void writeBytes(std::ostream& stream, std::span<const unsigned char> bytes, const char* failure);

/// Reads from memory without a copy: from bytes that somebody else keeps alive, or from a shared block.
class MemoryStream : public std::istream {
public:
    MemoryStream(const char* data, std::size_t size) : std::istream(nullptr), buffer_(data, size) {
        rdbuf(&buffer_);
    }
    explicit MemoryStream(const FNRMem<unsigned char>& bytes)
        : MemoryStream(reinterpret_cast<const char*>(bytes.data()), bytes.size()) {
        kept_ = bytes;
    }

private:
    class Buffer : public std::streambuf {
    public:
        Buffer(const char* data, std::size_t size);

    private:
        pos_type seekoff(off_type offset, std::ios_base::seekdir from,
                         std::ios_base::openmode which) override;
        pos_type seekpos(pos_type pos, std::ios_base::openmode which) override;
    };

    Buffer buffer_;
    FNRMem<unsigned char> kept_;
};

} // namespace Fn

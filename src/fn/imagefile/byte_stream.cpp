#include "fn/imagefile/byte_stream.h"

#include <algorithm>
#include <filesystem>
#include <memory>
#include <vector>

namespace Fn {

namespace {

[[noreturn]] void refuse(const char* caller) {
    FN_THROW(FNEIOError, std::string(caller) + ": cannot read from stream");
}

} // namespace

std::string peekBytes(std::istream& stream, std::size_t n, const char* caller) {
    if (!stream) refuse(caller);
    const std::istream::pos_type start = stream.tellg();
    std::string bytes(n, '\0');
    stream.read(bytes.data(), static_cast<std::streamsize>(n));
    bytes.resize(static_cast<std::size_t>(stream.gcount()));
    if (stream.bad()) refuse(caller);
    stream.clear();
    if (start != std::istream::pos_type(-1)) {
        stream.seekg(start);
    } else {
        for (std::size_t i = 0; i < bytes.size(); ++i) stream.unget();
    }
    if (!stream) refuse(caller);
    return bytes;
}

FNRMem<unsigned char> readUpTo(std::istream& stream, std::uint64_t n, const char* caller) {
    if (!stream) refuse(caller);
    struct Block {
        std::unique_ptr<char[]> bytes;
        std::size_t size;
    };
    constexpr std::uint64_t firstStep = 1u << 16, greatestStep = 1u << 26;
    // Memory follows what has arrived: each block is twice as large as the one before.
    std::vector<Block> blocks;
    std::uint64_t size = 0;
    for (std::uint64_t step = firstStep; stream && size < n; step = std::min(2 * step, greatestStep)) {
        step = std::min(step, n - size);
        Block& block = blocks.emplace_back(std::make_unique_for_overwrite<char[]>(step), 0);
        stream.read(block.bytes.get(), static_cast<std::streamsize>(step));
        block.size = static_cast<std::size_t>(stream.gcount());
        size += block.size;
    }
    if (stream.bad()) refuse(caller);
    FNRMem<unsigned char> result(size);
    unsigned char* to = result.getExclusive();
    for (Block& block : blocks) { // so that there is never a second copy of all
        to = std::copy_n(block.bytes.get(), block.size, to);
        block.bytes.reset();
    }
    return result;
}

FNRMem<unsigned char> readRest(std::istream& stream, std::uint64_t maxBytes, const char* caller) {
    const FNRMem<unsigned char> bytes =
        readUpTo(stream, std::max(maxBytes, maxBytes + 1), caller); // one more tells that there are more
    if (bytes.size() > maxBytes)
        FN_THROW(FNEBadFormat, std::string(caller) + ": the file exceeds the limit of " +
                                   std::to_string(maxBytes) + " bytes for decoding");
    return bytes;
}

std::ifstream openForReading(const std::string& fileName, const char* failure) {
    std::ifstream file(fileName, std::ios::binary);
    std::error_code ignored;
    if (!file || std::filesystem::is_directory(fileName, ignored)) FN_THROW(FNEIOError, failure + fileName);
    return file;
}

void writeBytes(std::ostream& stream, std::span<const unsigned char> bytes, const char* failure) {
    stream.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    if (!stream.flush()) FN_THROW(FNEIOError, failure);
}

MemoryStream::Buffer::Buffer(const char* data, std::size_t size) {
    char* const begin = const_cast<char*>(data); // only ever read
    setg(begin, begin, begin + size);
}

std::streambuf::pos_type MemoryStream::Buffer::seekoff(off_type offset, std::ios_base::seekdir from,
                                                       std::ios_base::openmode) {
    const off_type size = egptr() - eback();
    const off_type base = from == std::ios_base::beg   ? 0
                          : from == std::ios_base::cur ? gptr() - eback()
                                                       : size;
    if (offset < -base || offset > size - base) return pos_type(off_type(-1));
    setg(eback(), eback() + base + offset, egptr());
    return pos_type(base + offset);
}

std::streambuf::pos_type MemoryStream::Buffer::seekpos(pos_type pos, std::ios_base::openmode which) {
    return seekoff(off_type(pos), std::ios_base::beg, which);
}

} // namespace Fn

#include "fn/package.h"

#include "fn/byte_order.h"
#include "fn/collect_buffer.h"

#include <algorithm>
#include <bit>
#include <istream>
#include <ostream>
#include <vector>

namespace Fn {
namespace {

using Core = Package::Core;

constexpr std::size_t countSize = 4;

/// Largest sum of sizes of consecutive cores that are read at once.
constexpr std::uint64_t longestRun = 8192;

/// What a count announces is allocated in steps that start at this size and double, so that a false count
/// costs no more memory than the data that really comes.
constexpr std::uint64_t firstStep = 1 << 20;

template <class Value, class Store> Core scalarCoreOf(Value value, std::size_t size, Store store) {
    Core core(size);
    store(value, core.getExclusive());
    return core;
}

Core countCore(std::size_t count) {
    return scalarCoreOf(static_cast<std::uint32_t>(count), countSize, storeUInt32);
}

/// Where a package is read from, and how its failures read.
class Source {
public:
    virtual ~Source() = default;
    /// @return whether all `size` bytes were read.
    virtual bool read(unsigned char* memory, std::size_t size) = 0;
    virtual const char* countText() const = 0;
    virtual const char* sizesText() const = 0;
    /// The number of bytes wanted and " bytes" follow.
    virtual const char* coresText() const = 0;
};

class IstreamSource final : public Source {
public:
    explicit IstreamSource(std::istream& stream) : stream_(stream) {}
    bool read(unsigned char* memory, std::size_t size) override {
        stream_.read(reinterpret_cast<char*>(memory), static_cast<std::streamsize>(size));
        return !stream_.fail();
    }
    const char* countText() const override { return "Package: error reading number of cores from istream"; }
    const char* sizesText() const override { return "Package: error reading sizes of cores from istream"; }
    const char* coresText() const override {
        return "Package: error reading core from istream: got error reading ";
    }

private:
    std::istream& stream_;
};

class FileSource final : public Source {
public:
    explicit FileSource(std::FILE* file) : file_(file) {}
    bool read(unsigned char* memory, std::size_t size) override {
        return std::fread(memory, 1, size, file_) == size;
    }
    const char* countText() const override { return "Package: error reading size from FILE"; }
    const char* sizesText() const override { return "Package: error reading sizes from FILE"; }
    const char* coresText() const override { return "Package: error reading from FILE: got error reading "; }

private:
    std::FILE* file_;
};

std::vector<std::uint32_t> readSizes(Source& source) {
    unsigned char stored[countSize];
    if (!source.read(stored, countSize)) FN_THROW(FNEIOError, source.countText());
    const std::uint64_t count = loadUInt32(stored);

    std::vector<std::uint32_t> sizes;
    std::vector<unsigned char> bytes;
    std::uint64_t step = firstStep / countSize;
    while (sizes.size() < count) {
        const std::uint64_t n = std::min(step, count - sizes.size());
        bytes.resize(n * countSize);
        if (!source.read(bytes.data(), bytes.size())) FN_THROW(FNEIOError, source.sizesText());
        for (std::uint64_t i = 0; i < n; ++i) sizes.push_back(loadUInt32(bytes.data() + i * countSize));
        step = std::min(2 * step, std::uint64_t{1} << 24);
    }
    return sizes;
}

Core readBlock(Source& source, std::uint64_t size) {
    const auto readTail = [&](Core& block, std::uint64_t from) {
        if (!source.read(block.getExclusive() + from, block.size() - from))
            FN_THROW(FNEIOError, source.coresText() + std::to_string(size) + " bytes");
    };
    Core block(std::min(size, firstStep));
    if (size != 0) readTail(block, 0);
    while (block.size() < size) {
        Core larger(std::min(size, 2 * block.size()));
        std::copy(block.begin(), block.end(), larger.getExclusive());
        readTail(larger, block.size());
        block = larger;
    }
    return block;
}

Core copiedCore(const unsigned char* data, std::size_t size) {
    Core core(size);
    if (size != 0) std::copy_n(data, size, core.getExclusive());
    return core;
}

std::list<Core> readCores(Source& source) {
    const std::vector<std::uint32_t> sizes = readSizes(source);
    std::list<Core> cores;
    for (std::size_t first = 0; first < sizes.size();) {
        std::uint64_t sum = sizes[first];
        std::size_t end = first + 1;
        while (end < sizes.size() && sum + sizes[end] <= longestRun) sum += sizes[end++];
        const Core run = readBlock(source, sum);
        if (end - first == 1) {
            cores.push_back(run);
        } else {
            const unsigned char* data = run.data();
            for (std::size_t i = first; i < end; data += sizes[i++])
                cores.push_back(copiedCore(data, sizes[i]));
        }
        first = end;
    }
    return cores;
}

void writeCores(const std::list<Core>& cores, FNCollectBuffer::Sink& sink) {
    FNCollectBuffer buffer(sink);
    const auto addCount = [&](std::size_t count) {
        unsigned char stored[countSize];
        storeUInt32(static_cast<std::uint32_t>(count), stored);
        buffer.add(stored, countSize);
    };
    addCount(cores.size());
    for (const Core& core : cores) addCount(core.size());
    for (const Core& core : cores) buffer.add(core.data(), core.size());
    buffer.flush();
}

class OstreamSink final : public FNCollectBuffer::Sink {
public:
    explicit OstreamSink(std::ostream& stream) : stream_(stream) {}
    std::size_t write(const unsigned char* data, std::size_t size) override {
        if (!stream_.write(reinterpret_cast<const char*>(data), static_cast<std::streamsize>(size)))
            FN_THROW(FNEIOError, "Package: error writing to ostream");
        return size;
    }

private:
    std::ostream& stream_;
};

class FileSink final : public FNCollectBuffer::Sink {
public:
    explicit FileSink(std::FILE* file) : file_(file) {}
    std::size_t write(const unsigned char* data, std::size_t size) override {
        const std::size_t written = std::fwrite(data, 1, size, file_);
        if (std::ferror(file_)) FN_THROW(FNEIOError, "Package: error writing to FILE");
        return written;
    }

private:
    std::FILE* file_;
};

class MemorySink final : public FNCollectBuffer::Sink {
public:
    explicit MemorySink(unsigned char* memory) : memory_(memory) {}
    std::size_t write(const unsigned char* data, std::size_t size) override {
        memory_ = std::copy_n(data, size, memory_);
        return size;
    }

private:
    unsigned char* memory_;
};

} // namespace

Package::Package(const std::list<Package>& elements) {
    cores_.push_back(countCore(elements.size()));
    for (const Package& element : elements) {
        cores_.push_back(countCore(element.cores_.size()));
        cores_.insert(cores_.end(), element.cores_.begin(), element.cores_.end());
    }
}

Package::Package(int value) : Package(static_cast<unsigned int>(value)) {}
Package::Package(unsigned int value) : cores_{scalarCoreOf(value, 4, storeUInt32)} {}
Package::Package(long value) : Package(static_cast<unsigned long>(value)) {}
Package::Package(unsigned long value) : cores_{scalarCoreOf(value, 8, storeUInt64)} {}
Package::Package(float value) : Package(std::bit_cast<std::uint32_t>(value)) {}
Package::Package(double value) : Package(std::bit_cast<std::uint64_t>(value)) {}
Package::Package(bool value)
    : cores_{value ? copiedCore(reinterpret_cast<const unsigned char*>("true"), 5)
                   : copiedCore(reinterpret_cast<const unsigned char*>("false"), 6)} {}

Package::Package(const unsigned char* data, unsigned long size) {
    if (size < countSize) FN_THROW(FNEBadArg, "creating Package from memory: reading number of cores");
    const std::uint64_t count = loadUInt32(data);
    const std::uint64_t head = countSize + countSize * count;
    if (head > size) FN_THROW(FNEBadArg, "creating Package from memory: reading sizes of cores");
    std::uint64_t offset = head;
    for (std::uint64_t i = 1; i <= count; ++i) {
        const std::uint32_t coreSize = loadUInt32(data + countSize * i);
        if (coreSize > size - offset) FN_THROW(FNEBadArg, "creating Package from memory: reading core");
        cores_.push_back(copiedCore(data + offset, coreSize));
        offset += coreSize;
    }
}

Package::Package(std::istream& stream) {
    IstreamSource source(stream);
    cores_ = readCores(source);
}

Package::Package(std::FILE* file) {
    FileSource source(file);
    cores_ = readCores(source);
}

void Package::write(unsigned char* memory) const {
    MemorySink sink(memory);
    writeCores(cores_, sink);
}

void Package::write(std::ostream& stream) const {
    OstreamSink sink(stream);
    writeCores(cores_, sink);
}

void Package::write(std::FILE* file) const {
    FileSink sink(file);
    writeCores(cores_, sink);
}

unsigned int Package::size() const noexcept {
    std::uint64_t size = countSize;
    for (const Core& core : cores_) size += countSize + core.size();
    return static_cast<unsigned int>(size);
}

/// The bytes of the only core, which must have `size` of them.
const unsigned char* Package::scalarCore(std::size_t size, const char* name) const {
    if (cores_.size() != 1 || cores_.front().size() != size)
        FN_THROW(FNEBadArg, std::string("converting to ") + name + " from an invalid package");
    return cores_.front().data();
}

int Package::toInt32() const {
    return static_cast<int>(loadUInt32(scalarCore(4, "FNInt32")));
}
unsigned int Package::toUInt32() const {
    return loadUInt32(scalarCore(4, "FNUInt32"));
}
long Package::toInt64() const {
    return static_cast<long>(loadUInt64(scalarCore(8, "FNInt64")));
}
unsigned long Package::toUInt64() const {
    return loadUInt64(scalarCore(8, "FNUInt64"));
}
float Package::toFloat() const {
    return std::bit_cast<float>(loadUInt32(scalarCore(4, "float")));
}
double Package::toDouble() const {
    return std::bit_cast<double>(loadUInt64(scalarCore(8, "double")));
}

bool Package::toBool() const {
    if (*this == Package(true)) return true;
    if (*this == Package(false)) return false;
    FN_THROW(FNEBadArg, "converting to bool from an invalid package");
}

Package::operator std::list<Package>() const {
    if (!valid()) FN_THROW(FNEBadArg, "converting to list<Package> from an invalid package");
    const auto countIn = [](const Core& core) { return Package(std::list<Core>{core}).toUInt32(); };

    auto core = cores_.begin();
    const std::uint32_t announced = countIn(*core++);
    std::list<Package> elements;
    while (core != cores_.end()) {
        Package element;
        for (std::uint32_t missing = countIn(*core++); missing > 0; --missing) {
            if (core == cores_.end())
                FN_THROW(FNEBadArg,
                         "converting to list<Package> from an invalid package(mismatch of number of cores)");
            element.cores_.push_back(*core++);
        }
        if (elements.size() == announced)
            FN_THROW(FNEBadArg, "inconsistency detected converting to list<Package> from an invalid package");
        elements.push_back(element);
    }
    if (elements.size() != announced)
        FN_THROW(FNEBadArg,
                 "converting to list<Package> from an invalid package (mismatch of number of packages)");
    return elements;
}

} // namespace Fn

#pragma once

#include "fn/rmem.h"

#include <cstdio>
#include <iosfwd>
#include <list>

/// The one serialized form of the system: a list of byte blocks, its cores.
///
/// A package has no type tags and no version marks; its reader knows what it reads. Nested structures are
/// flattened into one list of cores with counts in cores of their own. The bytes of a package, in memory, in
/// a file, on a stream and on a connection alike, are: the number of cores, the size of each core, and the
/// bytes of the cores with no padding. Counts are unsigned, 4 bytes, most significant first.
///
///     Fn::Package record(std::list<Fn::Package>{Fn::Package(7), Fn::serialize<std::string>("bob")});
///     record.write(stream);

namespace Fn {

class Package {
public:
    using Core = FNRMem<unsigned char>;

    /// A package without cores: valid() is false, and no conversion accepts it.
    Package() = default;

    /// Over the given cores, which are shared and not copied.
    explicit Package(const std::list<Core>& cores) : cores_(cores) {}
    /// Flattens a list: its length, then for each element its number of cores and its cores.
    explicit Package(const std::list<Package>& elements);

    /// One core that holds the scalar in its stored form (see byte_order.h).
    explicit Package(int value);
    explicit Package(unsigned int value);
    explicit Package(long value);
    explicit Package(unsigned long value);
    explicit Package(float value);
    explicit Package(double value);
    /// One core that holds the text "true" or "false" with its terminating NUL.
    explicit Package(bool value);

    /// Parses the bytes of a package, and copies; bytes behind the last core are ignored.
    /// @throws FNEBadArg if `size` bytes do not hold what the counts announce.
    Package(const unsigned char* data, unsigned long size);
    /// Reads from the present position and stops behind the last core. Memory grows with what has arrived,
    /// not with what the counts announce. @throws FNEIOError
    explicit Package(std::istream& stream);
    explicit Package(std::FILE* file);

    /// Writes size() bytes.
    void write(unsigned char* memory) const;
    /// @throws FNEIOError
    void write(std::ostream& stream) const;
    void write(std::FILE* file) const;

    /// Number of bytes of the serialized form.
    unsigned int size() const noexcept;
    /// Whether there is at least one core.
    bool valid() const noexcept { return !cores_.empty(); }
    const std::list<Core>& cores() const noexcept { return cores_; }

    /// Equal if the numbers of cores are the same and each core is (two different empty cores are not).
    bool operator==(const Package& other) const noexcept { return cores_ == other.cores_; }

    /// @throws FNEBadArg if this is not a package of exactly one core of the right size.
    int toInt32() const;
    unsigned int toUInt32() const;
    long toInt64() const;
    unsigned long toUInt64() const;
    float toFloat() const;
    double toDouble() const;
    bool toBool() const;

    /// Undoes the flattening of a list. @throws FNEBadArg
    operator std::list<Package>() const;

private:
    const unsigned char* scalarCore(std::size_t size, const char* name) const;

    std::list<Core> cores_;
};

} // namespace Fn

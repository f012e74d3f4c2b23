#include "cmp/b7/transformation.h"

#include "fn/byte_order.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <optional>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Cmp::B7 {

namespace {

using Weights = Fn::Matrix<signed char>;

struct Factor {
    explicit Factor(const Fn::Package& package) : value(package.toFloat()) {}
    float value;
};

std::size_t sizeOf(const Factor&) {
    return 1;
}
std::size_t sizeOf(const FNVector<float>& vector) {
    return vector.size();
}

[[noreturn]] void failInvalid(const std::string& before, const std::string& path, const char* behind) {
    FN_THROW(FNEIOError, "CmpAlgorithm: invalid " + before + path + behind);
}

/// @param before,behind what a failure says around the name of the file
/// @param size of a vector, which has so many elements
template <class T>
T readPackage(std::istream& stream, const std::string& path, const char* before, const char* behind,
              std::size_t size) {
    try {
        const T value{Fn::Package(stream)};
        if (sizeOf(value) == size) return value;
    } catch (const FNException&) {
    }
    failInvalid(before, path, behind);
}

std::uint32_t readCount(std::istream& stream) {
    unsigned char bytes[4] = {};
    stream.read(reinterpret_cast<char*>(bytes), sizeof bytes);
    return Fn::loadUInt32(bytes);
}

/// A regular file, for reading it at once.
class File {
public:
    /// @throws FNEIOError if there is no such regular file
    explicit File(const std::string& path) : path_(path) {
        handle_.file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK); // nothing to wait for
        if (handle_.file < 0 || ::fstat(handle_.file, &status_) != 0 || !S_ISREG(status_.st_mode)) fail();
    }

    /// Its first bytes, at most so many. @throws FNEIOError if it changes meanwhile
    FNRMem<char> read(std::uint64_t most) const {
        const auto size = std::min(most, static_cast<std::uint64_t>(status_.st_size));
        FNRMemCore bytes(size, hugePage);
        if (size >= hugePage) ::madvise(bytes.writable(), size, MADV_HUGEPAGE); // a quarter of the time
        for (std::uint64_t done = 0; done < size;) {
            const ssize_t count =
                ::pread(handle_.file, bytes.writable() + done, size - done, static_cast<off_t>(done));
            if (count < 0 && errno == EINTR) continue;
            if (count < 0) fail();
            if (count == 0) failChanged();
            done += static_cast<std::uint64_t>(count);
        }
        struct stat now = {};
        if (::fstat(handle_.file, &now) != 0 || now.st_size != status_.st_size ||
            now.st_mtim.tv_sec != status_.st_mtim.tv_sec || now.st_mtim.tv_nsec != status_.st_mtim.tv_nsec)
            failChanged();
        return FNRMem<char>(bytes);
    }

private:
    static constexpr std::uint32_t hugePage = 1 << 21;

    [[noreturn]] void fail() const {
        FN_THROW(FNEIOError, "CmpAlgorithm: File '" + path_ + "' could not be opened for reading.");
    }

    [[noreturn]] void failChanged() const {
        FN_THROW(FNEIOError, "CmpAlgorithm: File '" + path_ + "' was changed while it was read.");
    }

    struct Handle {
        Handle() = default;
        ~Handle() {
            if (file >= 0) ::close(file);
        }
        Handle(const Handle&) = delete;
        Handle& operator=(const Handle&) = delete;
        int file = -1;
    };

    std::string path_;
    Handle handle_;
    struct stat status_ = {};
};

/// Reads what is in memory.
class MemoryStream final : std::streambuf, public std::istream {
public:
    explicit MemoryStream(const FNRMem<char>& bytes) : std::istream(this), bytes_(bytes) {
        char* const first = const_cast<char*>(bytes_.data()); // nothing is put back
        setg(first, first, first + bytes_.size());
    }
    /// The next bytes, where they are; nothing if there are not as many.
    template <class T> std::optional<FNRMem<T>> take(std::size_t size) {
        if (static_cast<std::size_t>(egptr() - gptr()) < size) return {};
        const FNRMem<T> all(bytes_.core());
        const FNRMem<T> taken(all, static_cast<std::uint64_t>(gptr() - eback()), size);
        setg(eback(), gptr() + size, egptr());
        return taken;
    }

private:
    FNRMem<char> bytes_;
};

/// What a transformation of these sizes has at most in its file, with room for the heads of packages.
std::uint64_t greatestFile(std::uint64_t rawSize, std::uint64_t components) {
    return rawSize * components + sizeof(float) * (rawSize + 2 * components) + 65536;
}

/// The package of a matrix, which stays where it was read.
/// @return an empty matrix if it is not one of so many rows, or ends early
Weights matrixIn(MemoryStream& stream, std::size_t rows, std::size_t components) {
    const std::uint32_t cores = readCount(stream), dimensions = readCount(stream), size = readCount(stream);
    const std::uint32_t storedRows = readCount(stream), cols = readCount(stream);
    if (!stream || cores != 2 || dimensions != 8 || storedRows != rows || size != std::uint64_t{rows} * cols)
        return Weights(0, 0);
    if (cols != components) return Weights(0, cols);
    const std::optional<FNRMem<signed char>> weights = stream.take<signed char>(size);
    return weights ? Weights(*weights, rows, cols) : Weights(0, 0);
}

} // namespace

Transformation Transformation::read(const std::string& path, std::size_t rawSize, std::size_t components) {
    MemoryStream stream(File(path).read(greatestFile(rawSize, components)));
    const auto vector = [&](const char* before, std::size_t size) {
        return readPackage<FNVector<float>>(stream, path, before, "", size);
    };
    const float factor =
        readPackage<Factor>(stream, path, "float factor package reading file '", "'", 1).value;
    const Weights matrix = matrixIn(stream, rawSize, components);
    if (matrix.cols() != components && matrix.cols() != 0)
        FN_THROW(FNEIOError, "PCLD: incompatible number of vector components.  Matrix cols = " +
                                 std::to_string(matrix.cols()) +
                                 " EncodedFeature components = " + std::to_string(components) + "\n");
    if (matrix.size() == 0) failInvalid("matrix package reading file '", path, "'");
    const FNVector<float> average = vector("average vector package ", rawSize);
    const FNVector<float> translation = vector("translation vector package ", components);
    const FNVector<float> base = vector("transformed gabor base vector package ", components);
    return {factor, matrix, average, translation, base};
}

void Transformation::write(std::ostream& stream) const {
    Fn::Package(factor).write(stream);
    static_cast<Fn::Package>(matrix).write(stream);
    for (const FNVector<float>& vector : {average, translation, base})
        static_cast<Fn::Package>(vector).write(stream);
}

void Transformation::write(const std::string& path) const {
    const std::string unfinished = path + ".part"; // nobody reads half of it
    std::ofstream stream(unfinished, std::ios::binary);
    write(stream);
    stream.close();
    std::error_code error;
    if (stream) std::filesystem::rename(unfinished, path, error);
    if (stream && !error) return;
    std::filesystem::remove(unfinished, error);
    FN_THROW(FNEIOError, "Cannot write the transformation '" + path + "'");
}

} // namespace Cmp::B7

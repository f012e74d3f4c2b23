#include "cmp/b7/transformation.h"

#include "fn/byte_order.h"

#include <filesystem>
#include <fstream>
#include <optional>
#include <span>

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

/// A file where the system has it: nothing is copied, and all processes share it. It may be replaced
/// meanwhile, but not be written over.
class MappedFile final : public FNRMemCore::Dtor {
public:
    /// @throws FNEIOError
    explicit MappedFile(const std::string& path) {
        const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
        struct stat status = {};
        if (file >= 0 && ::fstat(file, &status) == 0 && S_ISREG(status.st_mode)) {
            size_ = static_cast<std::size_t>(status.st_size);
            if (size_ != 0) start_ = ::mmap(nullptr, size_, PROT_READ, MAP_SHARED, file, 0);
        }
        if (file >= 0) ::close(file);
        if (!S_ISREG(status.st_mode) || start_ == MAP_FAILED)
            FN_THROW(FNEIOError, "CmpAlgorithm: File '" + path + "' could not be opened for reading.");
        if (start_) ::madvise(start_, size_, MADV_WILLNEED); // without it is slower, no more
    }
    std::span<char> bytes() const { return {static_cast<char*>(start_), size_}; }
    void del(void*) const override {} // what is left of the file stays
    ~MappedFile() override {
        if (start_) ::munmap(start_, size_);
    }

private:
    void* start_ = nullptr;
    std::size_t size_ = 0;
};

/// Reads a mapped file.
class MappedStream final : std::streambuf, public std::istream {
public:
    explicit MappedStream(const FNCountedPtr<MappedFile>& file) : std::istream(this), file_(file) {
        const std::span<char> bytes = file_->bytes();
        setg(bytes.data(), bytes.data(), bytes.data() + bytes.size());
    }
    /// The next bytes, where they are; nothing if there are not as many.
    std::optional<FNRMemCore> take(std::size_t size) {
        if (static_cast<std::size_t>(egptr() - gptr()) < size) return {};
        const FNRMemCore bytes(static_cast<const void*>(gptr()), size, file_, false);
        setg(eback(), gptr() + size, egptr());
        return bytes;
    }

private:
    FNCountedPtr<MappedFile> file_;
};

/// The package of a matrix, which stays in the file.
/// @return an empty matrix if it is not one of so many rows, or ends early
Weights matrixIn(MappedStream& stream, std::size_t rows, std::size_t components) {
    const std::uint32_t cores = readCount(stream), dimensions = readCount(stream), size = readCount(stream);
    const std::uint32_t storedRows = readCount(stream), cols = readCount(stream);
    if (!stream || cores != 2 || dimensions != 8 || storedRows != rows || size != std::uint64_t{rows} * cols)
        return Weights(0, 0);
    if (cols != components) return Weights(0, cols);
    const std::optional<FNRMemCore> weights = stream.take(size);
    return weights ? Weights(FNRMem<signed char>(*weights), rows, cols) : Weights(0, 0);
}

} // namespace

Transformation Transformation::read(const std::string& path, std::size_t rawSize, std::size_t components) {
    MappedStream stream(FNCountedPtr<MappedFile>(new MappedFile(path)));
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
    const std::string unfinished = path + ".part"; // what others have mapped stays as it is
    std::ofstream stream(unfinished, std::ios::binary);
    write(stream);
    stream.close();
    std::error_code error;
    if (stream) std::filesystem::rename(unfinished, path, error);
    if (!stream || error) FN_THROW(FNEIOError, "Cannot write the transformation '" + path + "'");
}

} // namespace Cmp::B7

#include "cmp/b7/transformation.h"

#include "fn/byte_order.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>

#include <fcntl.h>
#include <sys/mman.h>
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

/// Bytes of a file where the system has them: nothing is copied, and all processes share them. The file may
/// be replaced meanwhile, but not be written over.
class MappedBytes final : public FNRMemCore::Dtor {
public:
    /// @throws FNESysError
    MappedBytes(const std::string& path, std::size_t offset, std::size_t size) {
        const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
        if (file < 0) FN_THROW(FNESysError, path + ": " + std::strerror(errno));
        const std::size_t before = offset % static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
        length_ = before + size;
        start_ = ::mmap(nullptr, length_, PROT_READ, MAP_SHARED, file, static_cast<off_t>(offset - before));
        const int error = errno;
        ::close(file);
        if (start_ == MAP_FAILED) FN_THROW(FNESysError, path + ": " + std::strerror(error));
        ::madvise(start_, length_, MADV_WILLNEED); // without it is slower, no more
        bytes_ = static_cast<const unsigned char*>(start_) + before;
    }
    const unsigned char* bytes() const { return bytes_; }
    void del(void*) const override { ::munmap(start_, length_); }

private:
    void* start_;
    std::size_t length_;
    const unsigned char* bytes_;
};

/// The package of a matrix, which stays in the file.
/// @return an empty matrix if it is not one of so many rows, or ends early
Weights mapMatrix(std::istream& stream, const std::string& path, std::size_t rows, std::size_t components) {
    const std::uint32_t cores = readCount(stream), dimensions = readCount(stream), size = readCount(stream);
    const std::uint32_t storedRows = readCount(stream), cols = readCount(stream);
    if (!stream || cores != 2 || dimensions != 8 || storedRows != rows || size != std::uint64_t{rows} * cols)
        return Weights(0, 0);
    if (cols != components) return Weights(0, cols);
    const auto begin = static_cast<std::size_t>(stream.tellg());
    if (size == 0 || std::filesystem::file_size(path) < begin + size) return Weights(0, 0);
    stream.seekg(size, std::ios::cur);
    const FNCountedPtr<MappedBytes> file(new MappedBytes(path, begin, size));
    return Weights(FNRMem<signed char>(FNRMemCore(file->bytes(), size, file, false)), rows, cols);
}

} // namespace

Transformation Transformation::read(const std::string& path, std::size_t rawSize, std::size_t components) {
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "CmpAlgorithm: File '" + path + "' could not be opened for reading.");
    const auto vector = [&](const char* before, std::size_t size) {
        return readPackage<FNVector<float>>(stream, path, before, "", size);
    };
    const float factor =
        readPackage<Factor>(stream, path, "float factor package reading file '", "'", 1).value;
    const Weights matrix = mapMatrix(stream, path, rawSize, components);
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

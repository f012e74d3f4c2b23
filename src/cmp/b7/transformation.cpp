#include "cmp/b7/transformation.h"

#include "fn/byte_order.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>

#include <sys/mman.h>

namespace Cmp::B7 {

namespace {

/// Vectors are loaded from whole multiples of so many weights.
constexpr std::size_t rowUnit = 16;

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

/// Memory in large pages, where the system has them: a projection goes over all of it, and most of the time
/// that fresh memory takes is that of its pages.
FNRMemCore largeBlock(std::size_t size) {
    struct Free final : FNRMemCore::Dtor {
        void del(void* memory) const override { std::free(memory); }
    };
    constexpr std::size_t largePage = std::size_t{2} << 20;
    const std::size_t whole = (size + largePage - 1) / largePage * largePage;
    void* const memory = std::aligned_alloc(largePage, whole);
    if (!memory) throw std::bad_alloc();
    madvise(memory, whole, MADV_HUGEPAGE); // without them it is slower, no more
    return FNRMemCore(memory, size, FNCountedPtr<FNRMemCore::Dtor>(new Free));
}

std::uint32_t readCount(std::istream& stream) {
    unsigned char bytes[4] = {};
    stream.read(reinterpret_cast<char*>(bytes), sizeof bytes);
    return Fn::loadUInt32(bytes);
}

/// The package of a matrix, each column read straight to where it stays.
/// @return an empty matrix if it is not one of so many rows, or ends early
Weights readMatrix(std::istream& stream, std::size_t rows, std::size_t components) {
    const std::uint32_t cores = readCount(stream), dimensions = readCount(stream), size = readCount(stream);
    const std::uint32_t storedRows = readCount(stream), cols = readCount(stream);
    if (!stream || cores != 2 || dimensions != 8 || storedRows != rows || size != std::uint64_t{rows} * cols)
        return Weights(0, 0);
    if (cols != components) return Weights(0, cols);
    const std::size_t stride = (rows + rowUnit - 1) / rowUnit * rowUnit;
    Weights result(FNRMem<signed char>(largeBlock(std::max<std::size_t>(stride * cols, 1))), stride, cols);
    signed char* column = result.getExclusive();
    for (std::size_t c = 0; c < cols && stream; ++c, column += stride) {
        stream.read(reinterpret_cast<char*>(column), static_cast<std::streamsize>(rows));
        std::fill(column + rows, column + stride, static_cast<signed char>(0));
    }
    return stream ? result : Weights(0, 0);
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
    const Weights matrix = readMatrix(stream, rawSize, components);
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
    const Weights unpadded = matrix.rows() == average.size()
                                 ? matrix
                                 : Weights(matrix, 0, 0, average.size() - 1, matrix.cols() - 1);
    static_cast<Fn::Package>(unpadded).write(stream);
    for (const FNVector<float>& vector : {average, translation, base})
        static_cast<Fn::Package>(vector).write(stream);
}

void Transformation::write(const std::string& path) const {
    std::ofstream stream(path, std::ios::binary);
    write(stream);
    stream.close();
    if (!stream) FN_THROW(FNEIOError, "Cannot write the transformation '" + path + "'");
}

} // namespace Cmp::B7

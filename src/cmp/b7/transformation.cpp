#include "cmp/b7/transformation.h"

#include <cstring>
#include <fstream>

namespace Cmp::B7 {

namespace {

/// Vectors are loaded from whole multiples of so many weights.
constexpr std::size_t rowUnit = 16;

using Weights = Fn::Matrix<signed char>;

/// One number, as a column is.
struct Factor {
    explicit Factor(const Fn::Package& package) : value(package.toFloat()) {}
    float value;
};

std::size_t rowsOf(const Factor&) {
    return 1;
}
std::size_t rowsOf(const Weights& matrix) {
    return matrix.rows();
}
std::size_t rowsOf(const FNVector<float>& vector) {
    return vector.size();
}

/// @param before,behind what a failure says around the name of the file
/// @param rows of a matrix or vector, which have so many
template <class T>
T readPackage(std::istream& stream, const std::string& path, const char* before, const char* behind,
              std::size_t rows) {
    try {
        const T value{Fn::Package(stream)};
        if (rowsOf(value) == rows) return value;
    } catch (const FNException&) {
    }
    FN_THROW(FNEIOError, "CmpAlgorithm: invalid " + (before + path) + behind);
}

Weights padded(const Weights& matrix) {
    const std::size_t rows = (matrix.rows() + rowUnit - 1) / rowUnit * rowUnit;
    if (rows == matrix.rows()) return matrix;
    Weights result(rows, matrix.cols());
    signed char* const out = result.getExclusive();
    for (std::size_t c = 0; c < matrix.cols(); ++c) {
        std::memcpy(out + result.colidx(c), matrix.get() + matrix.colidx(c), matrix.rows());
        std::memset(out + result.colidx(c) + matrix.rows(), 0, rows - matrix.rows());
    }
    return result;
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
    const auto matrix = readPackage<Weights>(stream, path, "matrix package reading file '", "'", rawSize);
    if (matrix.cols() != components)
        FN_THROW(FNEIOError, "PCLD: incompatible number of vector components.  Matrix cols = " +
                                 std::to_string(matrix.cols()) +
                                 " EncodedFeature components = " + std::to_string(components) + "\n");
    const FNVector<float> average = vector("average vector package ", rawSize);
    const FNVector<float> translation = vector("translation vector package ", components);
    const FNVector<float> base = vector("transformed gabor base vector package ", components);
    return {factor, padded(matrix), average, translation, base};
}

void Transformation::write(const std::string& path) const {
    std::ofstream stream(path, std::ios::binary);
    Fn::Package(factor).write(stream);
    const Weights unpadded = matrix.rows() == average.size()
                                 ? matrix
                                 : Weights(matrix, 0, 0, average.size() - 1, matrix.cols() - 1);
    static_cast<Fn::Package>(unpadded).write(stream);
    for (const FNVector<float>& vector : {average, translation, base})
        static_cast<Fn::Package>(vector).write(stream);
    stream.close();
    if (!stream) FN_THROW(FNEIOError, "Cannot write the transformation '" + path + "'");
}

} // namespace Cmp::B7

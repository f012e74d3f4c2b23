#include "cmp/pcld/transformation.h"

#include "fn/serialize.h"

#include <cmath>
#include <fstream>

namespace Cmp::Pcld {

namespace {

std::ifstream open(const std::string& path) {
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "PCLD: File `" + path + "' could not be opened for reading.");
    return stream;
}

[[noreturn]] void failInvalid(const char* what, const std::string& path) {
    FN_THROW(FNEIOError, std::string("PCLD: invalid ") + what + " package reading file `" + path + "'.");
}

Fn::Package readPackage(std::istream& stream, const char* what, const std::string& path) {
    try {
        return Fn::Package(stream);
    } catch (const FNEIOError&) {
        failInvalid(what, path);
    }
}

} // namespace

Transformation Transformation::read(const std::string& path, std::size_t rawSize) {
    std::ifstream stream = open(path);
    const Fn::Matrix<float> matrix(readPackage(stream, "matrix", path));
    if (matrix.rows() != rawSize) failInvalid("matrix", path);
    const FNVector<float> average(readPackage(stream, "average vector", path));
    if (average.size() != rawSize) failInvalid("average vector", path);
    return {matrix, average};
}

void Transformation::write(const std::string& path) const {
    std::ofstream stream(path, std::ios::binary);
    static_cast<Fn::Package>(matrix).write(stream);
    static_cast<Fn::Package>(average).write(stream);
    stream.close();
    if (!stream) FN_THROW(FNEIOError, "Cannot write the transformation `" + path + "'");
}

IsotropisationData readIsotropisationData(const std::string& path) {
    std::ifstream stream = open(path);
    IsotropisationData data = Fn::SerializableVector<FNVector<float>>(Fn::Package(stream));
    for (FNVector<float>& vector : data) vector /= std::sqrt(vector * vector);
    return data;
}

} // namespace Cmp::Pcld

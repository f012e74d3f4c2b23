#include "fn/matrix_stream.h"

#include "fn/stream_text.h"

#include <algorithm>
#include <istream>
#include <limits>

namespace Fn {
namespace {

template <class T> std::string header() {
    return templateId<T>("Fn::Matrix") + " Little Endian";
}

template <class T> [[noreturn]] void fail(const std::string& reason) {
    FN_THROW(FNEBadArg, header<T>() + " reading from istream: " + reason);
}

/// Elements are read in steps that start at this number and double, so that a false size costs no more memory
/// than the data that really comes.
constexpr std::uint64_t firstStep = 1 << 16;

std::uint64_t product(std::uint64_t rows, std::uint64_t cols) {
    return cols != 0 && rows > std::numeric_limits<std::uint64_t>::max() / cols
               ? std::numeric_limits<std::uint64_t>::max()
               : rows * cols;
}

template <class T> Matrix<T> readBinary(std::istream& stream) {
    std::string version;
    std::uint64_t rows = 0, cols = 0;
    stream >> version;
    if (version != "v2.0") fail<T>("unknown version identifier '" + version + "'");
    if (!(stream >> rows >> cols)) fail<T>("dimensions missing");
    stream.ignore(std::numeric_limits<std::streamsize>::max(), '\n');

    const std::uint64_t count = product(rows, cols);
    std::vector<T> elements;
    for (std::uint64_t step = firstStep; elements.size() < count; step *= 2) {
        const std::size_t old = elements.size(), n = std::min(step, count - old);
        elements.resize(old + n);
        stream.read(reinterpret_cast<char*>(elements.data() + old),
                    static_cast<std::streamsize>(n * sizeof(T)));
        if (stream.fail()) fail<T>("elements missing");
    }
    return Matrix<T>(FNVector<T>(elements).core(), rows, cols);
}

} // namespace

template <class T>
std::vector<T> readText(std::istream& stream, std::uint64_t count, const std::string& text) {
    std::vector<T> elements;
    for (T value; elements.size() < count; elements.push_back(value))
        if (!(stream >> value)) FN_THROW(FNEBadArg, text);
    return elements;
}

template <class T> Matrix<T> readMatrix(std::istream& stream) {
    if (Stream::contains(stream, header<T>())) return readBinary<T>(stream);
    std::uint64_t rows = 0, cols = 0;
    if (!(stream >> rows >> cols)) fail<T>("dimensions missing");
    if (rows == 0 || cols == 0) fail<T>("unsupported format");
    const std::vector<T> rowByRow =
        readText<T>(stream, product(rows, cols), header<T>() + " reading from istream: elements missing");
    Matrix<T> result(FNVector<T>(rowByRow).core(), cols, rows);
    result.transposeInPlace();
    return result;
}

template std::vector<float> readText(std::istream&, std::uint64_t, const std::string&);
template std::vector<double> readText(std::istream&, std::uint64_t, const std::string&);
template Matrix<float> readMatrix(std::istream&);
template Matrix<double> readMatrix(std::istream&);

} // namespace Fn

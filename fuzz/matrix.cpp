// Vectors, matrices and sign vectors from packages, matrices from streams: what is accepted is written back
// and read to the same.

#include "fn/matrix_symmetric.h"
#include "fn/sign_value_vector.h"

#include <cstdlib>
#include <sstream>

namespace {

template <class Read> void tolerate(Read read) {
    try {
        read();
    } catch (const FNException&) {
    }
}

/// Bytes of the package form.
template <class T> std::string packed(const T& value) {
    std::ostringstream stream;
    Fn::Package(value).write(stream);
    return stream.str();
}

template <class T> void readPackage(const Fn::Package& package) {
    tolerate([&] {
        const T value(package);
        if (packed(T(Fn::Package(value))) != packed(value)) std::abort();
    });
}

template <class M> void readStream(const std::string& bytes) {
    tolerate([&] {
        std::istringstream stream(bytes);
        M{stream};
    });
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    readStream<Fn::Matrix<float>>(bytes);
    readStream<Fn::Matrix<double>>(bytes);
    readStream<Fn::SymmMatrix<double>>(bytes);

    Fn::Package package;
    tolerate([&] { package = Fn::Package(data, size); });
    readPackage<FNVector<short>>(package);
    readPackage<FNVector<unsigned int>>(package);
    readPackage<FNVector<unsigned long>>(package);
    readPackage<FNVector<float>>(package);
    readPackage<FNVector<FNComplex<double>>>(package);
    readPackage<FNVector<FNGridPos>>(package);
    readPackage<Fn::Matrix<float>>(package);
    readPackage<Fn::Matrix<double>>(package);
    readPackage<Fn::Matrix<signed char>>(package);
    readPackage<Fn::SignValueVector<int>>(package);
    return 0;
}

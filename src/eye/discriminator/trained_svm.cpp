#include "eye/discriminator/trained_svm.h"

#include <cmath>
#include <iomanip>
#include <istream>
#include <limits>
#include <ostream>

namespace Eye::Implementation {
namespace {

constexpr const char* dotWord = "Dot";
constexpr const char* polynomialWord = "FullPolynomial";
constexpr int polynomialDegree = 2;

/// Longest word that can be a kernel's, with room for a name that is quoted in the failure.
constexpr int longestWord = 64;

/// The next package of the stream, or `failure` if there is none.
Fn::Package readPackage(std::istream& stream, const std::string& failure) {
    try {
        return Fn::Package(stream);
    } catch (const FNException&) {
        FN_THROW(FNEBadFormat, failure);
    }
}

template <class T> T readField(std::istream& stream, const char* name) {
    T value;
    if (!(stream >> value)) FN_THROW(FNEBadFormat, std::string("invalid ") + name);
    return value;
}

void readHeader(std::istream& stream, TrainedSvm& svm) {
    std::string word;
    stream >> std::setw(longestWord) >> word;
    const bool polynomial = svm.kernel == TrainedSvm::Kernel::FullPolynomialDegree2;
    if (word != (polynomial ? polynomialWord : dotWord))
        FN_THROW(FNEBadFormat, "Kernel Type of template file is " + word +
                                   " and does not match the requested kernel type " +
                                   (polynomial ? "FullPolynomialDegree2" : "Dot"));
    if (polynomial) {
        if (readField<int>(stream, "kernel degree") != polynomialDegree)
            FN_THROW(FNEBadFormat, "Kernel degree must be 2!");
        svm.kernelConstant = readField<float>(stream, "kernel constant");
        svm.kernelScale = readField<float>(stream, "kernel scale");
    }
    svm.bias = readField<float>(stream, "bias");
    stream.ignore(std::numeric_limits<std::streamsize>::max(), '\n');
}

} // namespace

TrainedSvm TrainedSvm::read(std::istream& stream, Kernel kernel) {
    TrainedSvm svm;
    svm.kernel = kernel;
    readHeader(stream, svm);
    const FNVector<float> alphas(readPackage(stream, "invalid alphas"));
    svm.alphas.assign(alphas.begin(), alphas.end());
    svm.requireFinite();
    for (std::size_t i = 0; i < svm.alphas.size(); ++i) {
        const std::string failure = "invalid support vector[" + std::to_string(i) + "]";
        svm.supportVectors.emplace_back(readPackage(stream, failure));
        if (svm.supportVectors.back().size() != svm.supportVectors.front().size())
            FN_THROW(FNEBadFormat, failure);
    }
    return svm;
}

void TrainedSvm::write(std::ostream& stream) const {
    if (alphas.size() != supportVectors.size())
        FN_THROW(FNEBadArg, "TrainedSvm: numbers of alphas and of support vectors differ");
    const auto digits = stream.precision(std::numeric_limits<float>::max_digits10);
    if (kernel == Kernel::Dot)
        stream << dotWord;
    else
        stream << polynomialWord << ' ' << polynomialDegree << ' ' << kernelConstant << ' ' << kernelScale;
    stream << ' ' << bias << '\n';
    stream.precision(digits);
    Fn::Package(FNVector<float>(alphas)).write(stream);
    for (const auto& vector : supportVectors) Fn::Package(vector).write(stream);
}

void TrainedSvm::requireFinite() const {
    for (const float alpha : alphas)
        if (!std::isfinite(alpha)) FN_THROW(FNEBadFormat, "invalid alphas");
}

double TrainedSvm::evaluate(const Fn::SignValueVector<int>& x) const {
    double result = -static_cast<double>(bias);
    for (std::size_t i = 0; i < alphas.size(); ++i) {
        double k = x * supportVectors[i];
        if (kernel == Kernel::FullPolynomialDegree2) {
            k = k / static_cast<double>(kernelScale) + static_cast<double>(kernelConstant);
            k *= k;
        }
        result += static_cast<double>(alphas[i]) * k;
    }
    return result;
}

} // namespace Eye::Implementation

#include "eye/discriminator/float_svm.h"

#include "eye/discriminator/template_stream.h"

#include <cmath>

namespace Eye {
namespace {

using Implementation::TemplateReader;
using Implementation::TemplateWriter;

/// The end of the text, and the vectors behind it.
struct Counts {
    std::size_t vectors, dimension;
    explicit Counts(TemplateReader& reader) : vectors(reader.readCount()), dimension(reader.readCount()) {}
};

SupportVectors readVectors(TemplateReader& reader, const Counts& counts) {
    SupportVectors support;
    support.alphas = reader.readVector<float>(counts.vectors);
    for (const float alpha : support.alphas)
        if (!std::isfinite(alpha)) TemplateReader::failCorrupt();
    for (std::size_t i = 0; i < counts.vectors; ++i)
        support.vectors.push_back(reader.readVector<float>(counts.dimension));
    return support;
}

void writeRest(TemplateWriter& writer, const SupportVectors& support, const std::string& name) {
    support.requireConsistent();
    writer.number(support.alphas.size()).number(support.dimension()).name(name).vector(support.alphas);
    for (const auto& vector : support.vectors) writer.vector(vector);
}

} // namespace

void SupportVectors::requireConsistent() const {
    bool consistent = alphas.size() == vectors.size();
    for (const auto& vector : vectors) consistent &= vector.size() == dimension();
    for (const float alpha : alphas) consistent &= std::isfinite(alpha);
    if (!consistent)
        FN_THROW(
            FNEBadArg,
            "Support vectors of different size, or not one for each alpha, or an alpha that is no number");
}

FullPolynomialSvm FullPolynomialSvm::read(std::istream& stream, const std::string& className) {
    TemplateReader reader(stream, className, "FullPolynomial");
    FullPolynomialSvm svm;
    svm.degree = reader.readInt();
    if (svm.degree < 1 || svm.degree > FullPolynomialSvm::highestDegree) TemplateReader::failCorrupt();
    svm.constant = reader.readFloat();
    svm.scale = reader.readFloat();
    svm.bias = reader.readFloat();
    const Counts counts(reader);
    svm.name = reader.readName();
    svm.support = readVectors(reader, counts);
    return svm;
}

void FullPolynomialSvm::write(std::ostream& stream) const {
    TemplateWriter writer(stream, "FullPolynomial");
    writer.number(degree).number(constant).number(scale).number(bias);
    writeRest(writer, support, name);
}

SVMHyperbolicDiscriminator::SVMHyperbolicDiscriminator(const std::string& directory,
                                                       const std::string& file) {
    Implementation::readTemplate(directory, file, "SVMHyperbolicDiscriminator",
                                 [this](std::istream& stream) { read(stream); });
}

void SVMHyperbolicDiscriminator::read(std::istream& stream) {
    TemplateReader reader(stream, "SVMHyperbolicDiscriminator", "Hyperbolic");
    constant = reader.readFloat();
    scale = reader.readFloat();
    bias = reader.readFloat();
    const Counts counts(reader);
    name = reader.readName();
    support = readVectors(reader, counts);
}

void SVMHyperbolicDiscriminator::write(std::ostream& stream) const {
    TemplateWriter writer(stream, "Hyperbolic");
    writer.number(constant).number(scale).number(bias);
    writeRest(writer, support, name);
}

bool SVMHyperbolicDiscriminator::operator()(const Img::FeatureVector<float>& x, double& score) const {
    if (x.size() != support.dimension())
        FN_THROW(FNEBadArg, "SVMHyperbolicDiscriminator: feature vector of " + std::to_string(x.size()) +
                                " instead of " + std::to_string(support.dimension()) + " values");
    const double s = static_cast<double>(scale), c = static_cast<double>(constant);
    score = -static_cast<double>(bias);
    for (std::size_t i = 0; i < support.vectors.size(); ++i) {
        double product = 0, squares = 0;
        for (std::size_t j = 0; j < x.size(); ++j) {
            const double term =
                static_cast<double>(x.values().get()[j]) * static_cast<double>(support.vectors[i].get()[j]);
            product += term;
            squares += term * term;
        }
        const double sum = c + product / s;
        score += static_cast<double>(support.alphas.get()[i]) * (sum * sum - squares / (s * s));
    }
    return score > 0;
}

SVMRBFDiscriminator::SVMRBFDiscriminator(const std::string& directory, const std::string& file) {
    Implementation::readTemplate(directory, file, "SVMRBFDiscriminator",
                                 [this](std::istream& stream) { read(stream); });
}

void SVMRBFDiscriminator::read(std::istream& stream) {
    TemplateReader reader(stream, "SVMRBFDiscriminator", "RBF");
    gamma = reader.readDouble();
    bias = reader.readDouble();
    const Counts counts(reader);
    name = reader.readName();
    support = readVectors(reader, counts);
}

void SVMRBFDiscriminator::write(std::ostream& stream) const {
    TemplateWriter writer(stream, "RBF");
    writer.number(gamma).number(bias);
    writeRest(writer, support, name);
}

} // namespace Eye

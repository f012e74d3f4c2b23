#pragma once

#include "img/feature_vector.h"

#include <iosfwd>
#include <string>
#include <vector>

/// Support vector machines on float features as their files hold them, see template_stream.h.
///
/// Reading throws FNEBadFormat: "<class>: Data file format mismatch!" for another magic word, "Found corrupt
/// template file" for anything else that is wrong. Writing gives the same form.

namespace Eye {

/// What all of them have: score = sum of alpha[i] * K(x, supportVectors[i]) - bias.
struct SupportVectors {
    FNVector<float> alphas;
    std::vector<FNVector<float>> vectors; ///< all of one size

    std::size_t dimension() const { return vectors.empty() ? 0 : vectors.front().size(); }
    /// @throws FNEBadArg for a number of vectors other than that of alphas, vectors of different size, or an
    /// alpha that is no number
    void requireConsistent() const;
};

/// K(x, v) = (x * v / scale + constant)^degree.
struct FullPolynomialSvm {
    /// Files of a higher degree are taken for corrupt.
    static constexpr int highestDegree = 64;

    int degree = 2;
    float constant = 0;
    float scale = 1;
    float bias = 0;
    std::string name;
    SupportVectors support;

    /// @param className names the reader in the failure
    static FullPolynomialSvm read(std::istream& stream, const std::string& className);
    void write(std::ostream& stream) const;
};

/// A polynomial kernel without the terms that depend on one feature alone:
/// K(x, v) = (constant + x * v / scale)^2 - (sum over j of (x[j] * v[j])^2) / scale^2.
class SVMHyperbolicDiscriminator {
public:
    SVMHyperbolicDiscriminator() = default;
    explicit SVMHyperbolicDiscriminator(std::istream& stream) { read(stream); }
    /// @throws FNEIOError if the file cannot be opened
    SVMHyperbolicDiscriminator(const std::string& directory, const std::string& file);
    void read(std::istream& stream);
    void write(std::ostream& stream) const;

    /// @return score > 0. @throws FNEBadArg if `x` has another size than the support vectors
    bool operator()(const Img::FeatureVector<float>& x, double& score) const;

    float constant = 0;
    float scale = 1;
    float bias = 0;
    std::string name;
    SupportVectors support;
};

/// Gaussian kernel. Nothing evaluates one: it is only read and written.
class SVMRBFDiscriminator {
public:
    SVMRBFDiscriminator() = default;
    explicit SVMRBFDiscriminator(std::istream& stream) { read(stream); }
    /// @throws FNEIOError if the file cannot be opened
    SVMRBFDiscriminator(const std::string& directory, const std::string& file);
    void read(std::istream& stream);
    void write(std::ostream& stream) const;

    double gamma = 1;
    double bias = 0;
    std::string name;
    SupportVectors support;
};

} // namespace Eye

#pragma once

#include "eye/discriminator/float_svm.h"
#include "eye/discriminator/linear_discriminator.h"

namespace Eye {

/// Support vector machine with a polynomial kernel on float features.
///
/// The support vectors of positive alpha come first, in descending order, then the others in ascending order;
/// so for an even degree the sum can be left as soon as it is below the threshold and can only fall. A
/// discriminator is immutable and may be used by any number of threads.
class SVMFPDiscriminator {
public:
    /// @throws FNEBadFormat as told in float_svm.h
    SVMFPDiscriminator(std::istream& stream, const double& threshold,
                       const FloatLayout& layout = canonicalLayout());
    /// @throws FNEBadArg if the support vectors do not fit each other
    SVMFPDiscriminator(const FullPolynomialSvm& svm, const double& threshold,
                       const FloatLayout& layout = canonicalLayout());
    /// @throws FNEIOError if the file cannot be opened
    static SVMFPDiscriminator create(const std::string& directory, const std::string& file,
                                     const double& threshold, const FloatLayout& layout = canonicalLayout());

    /// @param score receives the decision value, or what it was when it was clear that it stays below the
    /// threshold
    /// @return score > threshold
    /// @throws FNEBadArg if `x` has another size than the support vectors
    bool operator()(const Img::FeatureVector<float>& x, double& score) const;

    std::size_t dimension() const noexcept { return svm_.support.dimension(); }

private:
    FullPolynomialSvm svm_; ///< in order of evaluation, in canonical layout
    double threshold_;
    FloatLayout layout_;
    std::vector<std::vector<FNVector<float>>> vectors_; ///< for each variant of the layout
};

/// The same machine with support vectors in 8 bits on features in 16 bits.
class SVMFPDiscriminatorFixed {
public:
    /// @throws FNEBadFormat as told in float_svm.h
    SVMFPDiscriminatorFixed(std::istream& stream, const double& threshold);
    SVMFPDiscriminatorFixed(const FullPolynomialSvm& svm, const double& threshold);
    /// @throws FNEIOError if the file cannot be opened
    static SVMFPDiscriminatorFixed create(const std::string& directory, const std::string& file,
                                          const double& threshold);

    /// As SVMFPDiscriminator; the features are the integers themselves.
    bool operator()(const Img::FeatureVector<short>& x, double& score) const;

private:
    /// A support vector is values * 2^exponent / 127.
    struct FixedVector {
        std::vector<signed char> values;
        float unit;
    };

    FullPolynomialSvm svm_;
    double threshold_;
    std::vector<FixedVector> vectors_;
};

/// Numbers in 8 bits.
namespace SvmDisc {

/// 2^exponent.
float ipow2(int exponent);
/// v * 127 / 2^exponent, rounded, where 2^exponent is the lowest power of two above |v|; 0 and exponent 0 for
/// v = 0.
signed char getRepresentation(float v, int& exponent);

} // namespace SvmDisc

} // namespace Eye

#pragma once

#include "img/feature_vector.h"

#include <iosfwd>
#include <string>
#include <vector>

namespace Eye {

/// Layout of the features that a discriminator meets.
using FloatLayout = FNCountedPtr<const Img::FeatureVectorLayout<float>>;

/// Features in canonical order only.
FloatLayout canonicalLayout();

/// Linear discriminator: the scalar product of the features and a vector of weights.
///
/// File (template_stream.h): "ld DIMENSION , NAME", a line feed and the weights in canonical order.
class LdDiscriminator {
public:
    /// @throws FNEBadFormat as told in float_svm.h
    LdDiscriminator(std::istream& stream, const double& threshold,
                    const FloatLayout& layout = canonicalLayout());
    LdDiscriminator(const FNVector<float>& weights, const double& threshold,
                    const FloatLayout& layout = canonicalLayout(), const std::string& name = "");
    /// @throws FNEIOError if the file cannot be opened
    static LdDiscriminator create(const std::string& directory, const std::string& file,
                                  const double& threshold, const FloatLayout& layout = canonicalLayout());
    void write(std::ostream& stream) const;

    /// @return score > threshold. @throws FNEBadArg if `x` has another size than the weights
    bool operator()(const Img::FeatureVector<float>& x, double& score) const;

private:
    double threshold_;
    FloatLayout layout_;
    std::string name_;
    FNVector<float> canonicalWeights_;
    std::vector<FNVector<float>> weights_; ///< one for each variant of the layout
};

/// Coefficients of a quadratic discriminator. Nothing evaluates one: it is only read and written.
///
/// File: as of LdDiscriminator, with doubles, of any number.
class QuadDiscriminator {
public:
    QuadDiscriminator() = default;
    explicit QuadDiscriminator(std::istream& stream) { read(stream); }
    /// @throws FNEIOError if the file cannot be opened
    QuadDiscriminator(const std::string& directory, const std::string& file);
    void read(std::istream& stream);
    void write(std::ostream& stream) const;

    int dimension = 0;
    std::string name;
    FNVector<double> coefficients;
};

/// Two discriminators of which the second is asked only about what the first accepts.
template <class First, class Second> class CompositeDiscriminator {
public:
    CompositeDiscriminator(const First& first, const Second& second) : first_(first), second_(second) {}

    /// `score` is that of the discriminator that decided.
    bool operator()(const Img::FeatureVector<float>& x, double& score) const {
        return first_(x, score) && second_(x, score);
    }

private:
    First first_;
    Second second_;
};

} // namespace Eye

#pragma once

#include "eye/discriminator/trained_svm.h"
#include "train/sign_matrix.h"

#include <vector>

namespace Train {

/// A linear classifier whose weights are approximated by `count` sign vectors, each fitted to what the ones
/// before left.
Eye::Implementation::TrainedSvm trainDot(const SignSet& set, std::size_t count, Random& random);

/// How a machine of degree 2 grows.
struct GrowthSettings {
    std::vector<std::size_t> groups; ///< numbers of vectors at which the machine has to decide alone
    float kernelConstant = 0.1f;     ///< weight of the linear part against the square
    std::size_t batch = 3000;        ///< samples that a new vector is fitted to
    int ascents = 5;                 ///< steps toward the best vector
    double penalty = 2.0;            ///< on alphas, in units of a sample
};

/// Grows a reduced set of sign vectors, one at a time: each is the local optimum of the gain in logistic loss
/// over all sign vectors, found by iterating s <- sign(gradient); alphas of a group are fitted together,
/// those of earlier groups stay.
Eye::Implementation::TrainedSvm growPolynomial(const SignSet& set, const GrowthSettings& settings,
                                               Random& random);

/// The sign vector whose response in a machine of degree 2 goes best with the pulls of samples: the local
/// optimum reached by iterating s <- sign(gradient).
/// @param batch samples as floats of +1 and -1, one column for each
/// @param pulls for each sample, above 0 if the response shall be high there
Signs bestVector(const Eye::Implementation::TrainedSvm& svm, const std::vector<float>& batch,
                 const std::vector<float>& pulls, int ascents, Random& random);

/// n indices, drawn with replacement with probabilities in proportion to the weights.
std::vector<std::size_t> drawn(const std::vector<double>& weights, std::size_t n, Random& random);

} // namespace Train

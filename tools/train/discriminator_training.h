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

} // namespace Train

#pragma once

#include "cmp/matches.h"

/// Takes the distribution of the scores of one search out of them. Nearly all records of a gallery are of
/// other people: their scores are normally distributed, and so are those of the few of the same person, if
/// there are any. Expectation maximization finds both; where they stand tells how scores are to be moved and
/// scaled. Scores are in units in which greater ones are less.

namespace Cmp::B7 {

struct BNormParams {
    float startMean1, startDeviation1; ///< of the person's own scores, where estimation starts
    float startMean2, startDeviation2; ///< of the others'
    float mean1, deviation1;           ///< of the person's own, after estimation
    float fallbackScale, fallbackOffset;
    float least, greatest; ///< where the bounds of the others' scores are looked for
    float binFactor;       ///< from raw scores to the units here
};
/// Of the matches of raw scores. Trained.
extern const BNormParams b7NormParams;

/// Finds the scale and the offset of normalized scores: (score - offset) / scale. Leaves them as they are if
/// there is nothing to estimate them from.
/// @param bins centres, ascending @param counts of the scores in each
template <class T>
void one2ManyBNormalization(FNVector<T> const& bins, FNVector<unsigned int> const& counts, T& offset,
                            T& scale, BNormParams const& params);
extern template void one2ManyBNormalization(FNVector<float> const&, FNVector<unsigned int> const&, float&,
                                            float&, BNormParams const&);

/// The matches of a search with normalized scores. @param histogram of all its scores, in the bins of
/// value_histogram.h
RawMatches normalizeRawScores(const RawMatches& matches, const ScoreHistogram& histogram);

namespace EM {

/// Fits a mixture of two normal distributions to binned values. The parameters are where it starts, and what
/// it ends with. @param weight of the first one, 0 to 1
/// @return false without any bin
template <class T>
bool estimateBinomialGauss(FNVector<T> const& bins, FNVector<unsigned int> const& counts, T& mean1, T& mean2,
                           T& deviation1, T& deviation2, T& weight);
/// About the density of a normal distribution: the exponential function in straight pieces.
template <class T> T linearApproxOfGaussDensity(T const& x, T const& mean, T const& deviation);

extern template bool estimateBinomialGauss(FNVector<float> const&, FNVector<unsigned int> const&, float&,
                                           float&, float&, float&, float&);
extern template float linearApproxOfGaussDensity(float const&, float const&, float const&);

} // namespace EM

} // namespace Cmp::B7

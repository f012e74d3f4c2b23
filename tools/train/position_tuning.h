#pragma once

#include "eye/discriminator/trained_svm.h"
#include "fn/geometry.h"
#include "train/sign_matrix.h"
#include "train/working_point.h"

#include <vector>

namespace Train {

/// A window of a search, in trained order.
struct SearchedWindow {
    Signs signs;
    FNPos offset;   ///< of its centre from the labelled place, eye distances
    float sizeGain; ///< logarithm of the squared size, which the finders weight windows with
};

/// Tunes a machine of degree 2 to where the finders of facial features then see the feature: at the mean of
/// the best windows of a search, weighted with the exponential of their scores. The alphas descend on the
/// bounded error (Geman and McClure 1985) of that place, which wrong labels do not pull at; the support
/// vectors stay as they are.
class PositionTuning {
public:
    /// @param machine its alphas are where the descent begins
    /// @param errorScale where an error counts half as much as the worst, eye distances
    PositionTuning(const Eye::Implementation::TrainedSvm& machine, float errorScale);

    /// Adds a search; of its windows, those with the greatest scores are kept.
    /// @param weight of its error
    void add(std::vector<SearchedWindow> windows, float weight);

    /// The tuned machine. Its scores are scaled as the weighting wants them, so that only bias and earlier
    /// steps are left to set.
    /// @param faces windows that stand for the feature, of which the steps keep their shares
    Eye::Implementation::TrainedSvm tuned(const std::vector<Signs>& faces,
                                          const std::vector<WorkingStep>& steps) const;

private:
    struct Search {
        std::size_t first, count; ///< its windows
        float weight;
    };
    /// The weighted mean of the error, and on request its gradient with respect to the scores.
    double errorOf(const std::vector<float>& scores, std::vector<float>* gradient) const;
    std::vector<float> scoresOf(const std::vector<float>& alphas) const;
    /// Covariance of the responses within searches, damped so that it can be inverted.
    std::vector<double> covariance() const;

    Eye::Implementation::TrainedSvm machine_;
    float errorScale_;
    std::vector<float> responses_; ///< of every window to every support vector, a window in each column
    std::vector<FNPos> offsets_;
    std::vector<float> sizeGains_;
    std::vector<Search> searches_;
};

} // namespace Train

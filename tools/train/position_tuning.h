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
/// the best windows of a search, weighted with the exponential of their scores. The machine grows by vectors
/// that pull that place to the label, and its alphas descend on the bounded error (Geman and McClure 1985) of
/// the place, which wrong labels do not pull at.
class PositionTuning {
public:
    /// @param machine where the tuning begins
    /// @param vectors that the tuned machine has
    /// @param errorScale where an error counts half as much as the worst, eye distances
    PositionTuning(const Eye::Implementation::TrainedSvm& machine, std::size_t vectors, float errorScale);

    /// Adds a search; of its windows, those with the greatest scores are kept.
    /// @param weight of its error
    void add(const std::vector<SearchedWindow>& windows, float weight);

    /// The tuned machine. Its scores are scaled as the weighting wants them, so that only the bias and what
    /// earlier steps need are set then.
    /// @param faces windows that stand for the feature, of which the steps keep their shares
    Eye::Implementation::TrainedSvm tuned(const std::vector<Signs>& faces,
                                          const std::vector<WorkingStep>& steps, Random& random);

private:
    struct Search {
        std::size_t first, count; ///< its windows
        float weight;
    };
    std::size_t present() const { return machine_.supportVectors.size(); }
    /// The weighted mean of the error, and on request its gradient with respect to the scores.
    double errorOf(const std::vector<float>& scores, std::vector<float>* gradient) const;
    std::vector<float> scoresOf(const std::vector<float>& alphas) const;
    /// Covariance within searches of the responses to the present vectors, damped.
    std::vector<double> covariance() const;
    void descend(int descents);
    void addVector(Random& random);
    void separateSteps(const std::vector<Signs>& faces, const std::vector<WorkingStep>& steps);

    Eye::Implementation::TrainedSvm machine_;
    std::size_t vectors_;
    float errorScale_;
    std::vector<Signs> windows_;
    /// Of every window to every support vector, a window in each column; 0 for vectors to come.
    std::vector<float> responses_;
    std::vector<FNPos> offsets_;
    std::vector<float> sizeGains_;
    std::vector<Search> searches_;
};

} // namespace Train

#pragma once

#include "eye/discriminator/cascade_settings.h"
#include "eye/discriminator/trained_svm.h"
#include "train/sign_matrix.h"

#include <filesystem>
#include <vector>

namespace Train {

/// One step of a cascade: how many support vectors have been seen, the threshold that the configuration has
/// there, and the share of faces that has to pass.
struct WorkingStep {
    std::size_t vectors;
    double threshold;
    double keep;
};

/// Scales alphas and bias so that at the given thresholds the given shares of `faces` pass: exactly so at the
/// last step; an earlier step that cannot be met as well lets more pass.
void setWorkingPoint(Eye::Implementation::TrainedSvm& svm, const std::vector<Signs>& faces,
                     const std::vector<WorkingStep>& steps);

/// Multiplies the distance of all scores from a threshold; what passes there stays the same.
void spreadScores(Eye::Implementation::TrainedSvm& svm, double threshold, double gain);

/// As setWorkingPoint, for a machine of degree 2, whose earlier steps can be met exactly: alphas between two
/// steps take up a change that moves the scores of all `windows` alike, as nearly as there is one.
void setWorkingPoints(Eye::Implementation::TrainedSvm& svm, const std::vector<Signs>& faces,
                      const std::vector<WorkingStep>& steps, const std::vector<Signs>& windows);

/// What the sums of the wanted share of faces reach at each step, without the bias.
std::vector<double> reachedSums(const Eye::Implementation::TrainedSvm& svm, const std::vector<Signs>& faces,
                                const std::vector<WorkingStep>& steps);

/// A covariance from the lower triangle of a sum of squares, damped so that it can be inverted.
std::vector<double> damped(const std::vector<float>& lower, std::size_t samples);
/// x in a * x = b, `a` n by n in full, for what machines respond. @throws FNEBadArg if `a` is singular
std::vector<double> solved(std::vector<double> a, std::vector<double> b);
/// The change of weights that raises what they weight by 1 in the mean and changes it least from one to
/// another. @param covariance of what is weighted, n by n, positive definite @param mean n values
std::vector<double> evenRaise(const std::vector<double>& covariance, const std::vector<double>& mean);

/// What a window adds to the score of a machine of degree 2 for each unit of an alpha.
float response(const Eye::Implementation::TrainedSvm& svm, const Signs& window, std::size_t vector);

/// The cascade of these steps.
Eye::Implementation::CascadeSettings settingsOf(const std::string& file,
                                                const std::vector<WorkingStep>& steps);

/// @throws FNEIOError naming the file if it cannot be written
void save(const Eye::Implementation::TrainedSvm& svm, const std::filesystem::path& file);

} // namespace Train

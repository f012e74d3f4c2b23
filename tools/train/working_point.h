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

/// The cascade of these steps.
Eye::Implementation::CascadeSettings settingsOf(const std::string& file,
                                                const std::vector<WorkingStep>& steps);

/// @throws FNEIOError naming the file if it cannot be written
void save(const Eye::Implementation::TrainedSvm& svm, const std::filesystem::path& file);

} // namespace Train

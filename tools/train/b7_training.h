#pragma once

#include "train/training_sources.h"

namespace Train {

/// Trains B7: the factors of its transformation, "trans-b7.dat.factors", the transformation itself, and the
/// files of writeCalibration() for "b7" and "b7-sn", scores that a search normalizes.
///
/// Mappings are calibrated on people of the dev part, the figures that are printed come from the test part.
/// All scores are those of packed records.
/// @param folder gets the files
void trainB7(const TrainingSources& sources, const std::filesystem::path& folder);

/// Makes the mapping files anew for a transformation that is there.
/// @param folder has the transformation and gets the files
void calibrateB7(const TrainingSources& sources, const std::filesystem::path& folder);

} // namespace Train

#pragma once

#include "train/portrait_samples.h"

namespace Train {

/// Trains the files of the portrait analyser, see models/CARD.md.
/// @param folder gets the files
/// @param only the step to run, such as "age" or "mouth"; all if empty
void trainPortrait(const TrainingSources& sources, const std::filesystem::path& folder,
                   const std::string& only);

} // namespace Train

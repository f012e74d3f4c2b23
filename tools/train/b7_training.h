#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// What the training of B7 needs beside the labelled images.
struct B7Folders {
    std::filesystem::path data;
    std::filesystem::path etc;   ///< model files of the finders
    std::filesystem::path cache; ///< where raw vectors are kept
    std::filesystem::path out;   ///< gets the files
};

/// Trains B7: the factors of its transformation, "trans-b7.dat.factors", the transformation itself, and the
/// files of writeCalibration() for "b7" and "b7-sn", scores that a search normalizes.
///
/// Mappings are calibrated on people of the dev part, the figures that are printed come from the test part.
/// All scores are those of packed records.
void trainB7(const B7Folders& folders, std::uint64_t seed);

/// Makes the mapping files anew for a transformation that is there.
void calibrateB7(const B7Folders& folders, std::uint64_t seed);

} // namespace Train

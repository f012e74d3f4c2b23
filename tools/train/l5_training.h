#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Trains the transformation of L5 and its mapping files from images of faces with labelled eyes and known
/// persons, as they are below `data` in people/*: "trans-l5x.dat", the files of writeCalibration() for
/// "b5l5", and a report of the equal error rate on people that training did not see.
///
/// The projection whitens what differs between images of one person (with its mean variance added) inside of
/// the main directions of all images, and keeps the directions that differ most between persons after that.
/// Mappings are calibrated on the dev part, the figures of the report come from the test part.
/// @param folder gets the files
void trainL5(const std::filesystem::path& data, const std::filesystem::path& folder, std::uint64_t seed);

} // namespace Train

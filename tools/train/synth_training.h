#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Learns the model of sample people from near-frontal faces of the train part: mean and directions of shape
/// and texture, those that go with pose, expression and light apart from those in which people differ.
/// @param data root of the labelled images @param out gets portrait.dat.gz
/// @throws FNException naming the file that cannot be read or written
void trainSynth(const std::filesystem::path& data, const std::filesystem::path& out, std::uint64_t seed);

/// Prints how far each sample portrait is from the photo of the train part that is most like it, beside the
/// same distance between photos of different people and between photos of one person.
/// @param samples label file with 68 points of the portraits
void measureSynth(const std::filesystem::path& data, const std::filesystem::path& samples);

} // namespace Train

#pragma once

#include "exif.h"
#include "fn/image_reference.h"
#include "orbek/image.h"

#include <filesystem>
#include <string>
#include <vector>

/// The pictures that a command works on, and those that it writes.

namespace Orbek::Tool {

/// The arguments, with each folder replaced by the image files in it, in the order of their names (numbers in
/// names by their value: frame9 comes before frame10). A file that is named is taken whatever it is.
/// @throws std::runtime_error for a folder that cannot be read or has no image files
std::vector<std::filesystem::path> pictureFiles(const std::vector<std::string>& arguments);

/// The picture turned and mirrored so that it is upright, with 8 bits for each sample; an upright one is left
/// as it is.
FNImageReference upright(const FNImageReference& image, Orientation orientation);

/// Reads a file of any format that the library knows, and turns it upright.
/// @throws std::exception that tells what is wrong
FNImageReference readUpright(const std::filesystem::path& file);
/// The same as a public image, which has the file's name.
Image readPicture(const std::filesystem::path& file);

/// A folder for pictures that are drawn into.
class PictureFolder {
public:
    /// Makes the folder, and a JPEG name in it for each source: its own without the ending, and a number if
    /// that is taken.
    /// @throws std::runtime_error if it cannot be made
    PictureFolder(const std::string& folder, const std::vector<std::filesystem::path>& sources);

    /// Writes the picture that was drawn for a source. @throws std::runtime_error naming the file
    void write(std::size_t source, const FNImageReference& picture) const;

private:
    std::vector<std::filesystem::path> names_;
};

} // namespace Orbek::Tool

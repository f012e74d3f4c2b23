#pragma once

#include "exif.h"
#include "fn/image_reference.h"
#include "orbek/image.h"

#include <filesystem>
#include <mutex>
#include <string>
#include <vector>

/// The pictures that a command works on, and those that it writes.

namespace Orbek::Tool {

/// The arguments, with each folder replaced by the image files in it, in the order of their names (numbers in
/// names by their value: frame9 comes before frame10); hidden files are left out. A file that is named is
/// taken whatever it is.
/// @throws std::runtime_error for a folder that cannot be read or has no image files
std::vector<std::filesystem::path> pictureFiles(const std::vector<std::string>& arguments);

/// The folders below a root that hold image files.
struct PictureTree {
    struct Folder {
        std::string name; ///< path from the root, with slashes
        std::vector<std::filesystem::path> pictures;
    };
    std::vector<Folder> folders;         ///< in the order of their names
    std::vector<std::string> complaints; ///< of what is left out
};

/// Walks all folders but hidden ones and links to folders. Image files in the root itself are left out, and
/// hidden ones.
/// @throws std::runtime_error if the root cannot be read or nothing is below it
PictureTree picturesBelow(const std::filesystem::path& root);

/// The picture turned and mirrored so that it is upright, with 8 bits for each sample; an upright one is left
/// as it is.
FNImageReference upright(const FNImageReference& image, Orientation orientation);

/// Reads a file of any format that the library knows, and turns it upright. "-" is the standard input, which
/// is read once, as pipes are.
/// @throws std::exception that tells what is wrong
FNImageReference readUpright(const std::filesystem::path& file);

/// The upright picture of a file, which is read when its pixels are asked for, and again when they are asked
/// for after forget(). It has the file's name.
class PictureFile final : public ImageBody {
public:
    explicit PictureFile(const std::filesystem::path& file) : file_(file) {}

    /// @throws std::exception that tells what is wrong
    void read() const { (void)picture(); }
    /// Frees the pixels. What a processor was given stays unused once it is at the next picture.
    void forget() const;
    /// From now on it is a black pixel.
    void blank() const;

    bool isColor() const override { return picture()->isColor(); }
    unsigned int width() const override { return picture()->width(); }
    unsigned int height() const override { return picture()->height(); }
    const unsigned char* grayScaleRepresentation() const override {
        return picture()->grayScaleRepresentation();
    }
    const Rgb* colorRepresentation() const override { return picture()->colorRepresentation(); }
    std::string name() const override { return file_.string(); }

private:
    Image picture() const;

    std::filesystem::path file_;
    mutable std::mutex mutex_; ///< guards the next ones
    mutable Image picture_;    ///< null while it is not read
    mutable bool blank_ = false;
};

/// A folder for pictures that are drawn into.
class PictureFolder {
public:
    /// Makes the folder, and a JPEG name in it for each source: its own without the ending, and a number if
    /// that is taken.
    /// @throws std::runtime_error if it cannot be made, or a name in it is that of a source
    PictureFolder(const std::string& folder, const std::vector<std::filesystem::path>& sources);

    /// Writes the picture that was drawn for a source. @throws std::exception naming the file
    void write(std::size_t source, const FNImageReference& picture) const;

    /// The names for all sources.
    const std::vector<std::filesystem::path>& files() const { return names_; }

private:
    std::vector<std::filesystem::path> names_;
};

} // namespace Orbek::Tool

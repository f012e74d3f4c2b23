#include "pictures.h"

#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpeg.h"
#include "img/affine/turns.h"
#include "orbek/implementation/adapt.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstring>
#include <fstream>
#include <set>
#include <stdexcept>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

constexpr int drawnQuality = 92;

constexpr std::array imageEndings{".jpg", ".jpeg", ".png", ".bmp", ".pgm", ".ppm",
                                  ".pnm", ".jp2",  ".j2k", ".jpc", ".tif", ".tiff"};

bool isImageName(const fs::path& file) {
    std::string ending = file.extension().string();
    for (char& c : ending) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return std::find(imageEndings.begin(), imageEndings.end(), ending) != imageEndings.end();
}

std::vector<fs::path> picturesIn(const fs::path& folder) {
    std::vector<fs::path> files;
    std::error_code failure;
    for (fs::directory_iterator entry(folder, failure), end; !failure && entry != end;
         entry.increment(failure))
        if (isImageName(entry->path()) && !entry->is_directory()) files.push_back(entry->path());
    if (failure) throw std::runtime_error(folder.string() + ": " + failure.message());
    if (files.empty()) throw std::runtime_error(folder.string() + ": has no image files");
    std::sort(files.begin(), files.end(), [](const fs::path& a, const fs::path& b) {
        return strverscmp(a.filename().c_str(), b.filename().c_str()) < 0;
    });
    return files;
}

template <class T> FNImageReference turned(const FNImage<T>& image, Orientation orientation) {
    using namespace Img::Affine;
    const auto mirrored = [](const FNImage<T>& i) { return vertReflection(i, i.box()); };
    const auto result = [&]() -> FNImage<T> {
        switch (orientation) {
        case Orientation::Upright:
            return image;
        case Orientation::Mirrored:
            return mirrored(image);
        case Orientation::HalfTurned:
            return mirrored(horReflection(image, image.box()));
        case Orientation::UpsideDown:
            return horReflection(image, image.box());
        case Orientation::Transposed:
            return mirrored(rightRotation(image));
        case Orientation::TurnClockwise:
            return rightRotation(image);
        case Orientation::Transversed:
            return mirrored(leftRotation(image));
        case Orientation::TurnCounterClockwise:
            return leftRotation(image);
        }
        return image;
    };
    return FNImageReferenceFactory::create(result());
}

} // namespace

std::vector<fs::path> pictureFiles(const std::vector<std::string>& arguments) {
    std::vector<fs::path> files;
    for (const std::string& argument : arguments) {
        std::error_code ignored;
        if (!fs::is_directory(argument, ignored)) {
            files.emplace_back(argument);
            continue;
        }
        const std::vector<fs::path> inFolder = picturesIn(argument);
        files.insert(files.end(), inFolder.begin(), inFolder.end());
    }
    return files;
}

FNImageReference upright(const FNImageReference& image, Orientation orientation) {
    if (orientation == Orientation::Upright || image.w() == 0) return image;
    return image.isColor() ? turned(image.toBgra32(), orientation) : turned(image.toMono8(), orientation);
}

FNImageReference readUpright(const fs::path& file) {
    std::ifstream stream(file, std::ios::binary);
    const Orientation orientation = orientationInJpeg(stream);
    return upright(Fn::readImage(file.string()), orientation);
}

Image readPicture(const fs::path& file) {
    return adapt(readUpright(file), file.string());
}

PictureFolder::PictureFolder(const std::string& folder, const std::vector<fs::path>& sources) {
    std::error_code failure;
    fs::create_directories(folder, failure);
    if (failure || !fs::is_directory(folder)) throw std::runtime_error("Cannot make the folder " + folder);
    std::set<std::string> taken;
    for (const fs::path& source : sources) {
        const std::string stem = source.stem().string();
        std::string name = stem;
        for (int i = 2; !taken.insert(name).second; ++i) name = stem + "-" + std::to_string(i);
        names_.push_back(fs::path(folder) / (name + ".jpg"));
    }
}

void PictureFolder::write(std::size_t source, const FNImageReference& picture) const {
    std::error_code ignored;
    std::ofstream file(names_[source], std::ios::binary);
    if (!file) throw std::runtime_error("Cannot write " + names_[source].string());
    Fn::writeJpeg(picture, file, drawnQuality);
}

} // namespace Orbek::Tool

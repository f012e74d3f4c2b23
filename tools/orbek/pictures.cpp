#include "pictures.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/gunzip.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpeg.h"
#include "fn/whole_file.h"
#include "img/affine/turns.h"
#include "orbek/implementation/adapt.h"
#include "whole_file.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstring>
#include <fstream>
#include <map>
#include <set>
#include <stdexcept>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

constexpr int drawnQuality = 92;

/// As a name of a file.
constexpr const char* standardInput = "-";

constexpr std::array imageEndings{".jpg", ".jpeg", ".png", ".bmp", ".pbm", ".pgm", ".ppm",
                                  ".pnm", ".jp2",  ".j2k", ".jpc", ".tif", ".tiff"};

bool isImageName(const fs::path& file) {
    std::string ending = file.extension().string();
    for (char& c : ending) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return std::find(imageEndings.begin(), imageEndings.end(), ending) != imageEndings.end();
}

/// Image files and folders, each in order. Hidden ones, links to folders and what is neither (a pipe would
/// never end) are left out.
struct FolderContent {
    std::vector<fs::path> pictures, folders;
};

FolderContent contentOf(const fs::path& folder) {
    FolderContent content;
    std::error_code failure, ignored;
    for (fs::directory_iterator entry(folder, failure), end; !failure && entry != end;
         entry.increment(failure)) {
        const fs::path& path = entry->path();
        if (path.filename().native().front() == '.') continue;
        if (entry->is_regular_file(ignored)) {
            if (isImageName(path)) content.pictures.push_back(path);
        } else if (entry->is_directory(ignored) && !entry->is_symlink(ignored))
            content.folders.push_back(path);
    }
    if (failure) throw std::runtime_error(folder.string() + ": " + failure.message());
    for (std::vector<fs::path>* const paths : {&content.pictures, &content.folders})
        std::ranges::sort(*paths, [](const fs::path& a, const fs::path& b) {
            return strverscmp(a.filename().c_str(), b.filename().c_str()) < 0;
        });
    return content;
}

std::vector<fs::path> picturesIn(const fs::path& folder) {
    const std::vector<fs::path> files = contentOf(folder).pictures;
    if (files.empty()) throw std::runtime_error(folder.string() + ": has no image files");
    return files;
}

void addFolder(const fs::path& folder, const std::string& name, PictureTree& tree) {
    const FolderContent content = contentOf(folder);
    if (name.empty() && !content.pictures.empty())
        tree.complaints.push_back(folder.string() + ": " + std::to_string(content.pictures.size()) +
                                  " image files outside its folders are left out");
    else if (!content.pictures.empty())
        tree.folders.push_back({name, content.pictures});
    for (const fs::path& below : content.folders) {
        try {
            addFolder(below, (name.empty() ? "" : name + "/") + below.filename().string(), tree);
        } catch (const std::exception& e) {
            tree.complaints.emplace_back(e.what());
        }
    }
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

/// Whether the file can be read only once, from its start to its end.
bool isPipe(const fs::path& file) {
    std::error_code ignored;
    return file == standardInput || (fs::exists(file, ignored) && fs::is_other(file, ignored));
}

/// The content of a pipe is kept, since a picture may be read again.
FNRMem<unsigned char> contentOfPipe(const fs::path& file, const Fn::ImageLimits& limits) {
    static std::mutex mutex; // guards the contents
    static std::map<fs::path, FNRMem<unsigned char>> contents;
    const std::lock_guard lock(mutex);
    if (const auto known = contents.find(file); known != contents.end()) return known->second;
    const fs::path path = file == standardInput ? fs::path("/dev/stdin") : file;
    std::ifstream stream = Fn::openForReading(path.string());
    return contents[file] = Fn::readRest(stream, limits.maxBytes, file.c_str());
}

FNImageReference blackPixel() {
    FNImage<unsigned char> image(1, 1);
    image.fill(0);
    return FNImageReferenceFactory::create(image);
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

PictureTree picturesBelow(const fs::path& root) {
    PictureTree tree;
    addFolder(root, "", tree);
    if (tree.folders.empty()) throw std::runtime_error(root.string() + ": has no folders with image files");
    return tree;
}

FNImageReference upright(const FNImageReference& image, Orientation orientation) {
    if (orientation == Orientation::Upright || image.w() == 0) return image;
    return image.isColor() ? turned(image.toBgra32(), orientation) : turned(image.toMono8(), orientation);
}

FNImageReference readUpright(const fs::path& file) {
    const Fn::ImageLimits limits = Fn::ImageLimits::withRareVariants();
    if (isPipe(file)) {
        const FNRMem<unsigned char> bytes = contentOfPipe(file, limits);
        Fn::MemoryStream stream(bytes), again(bytes);
        const Orientation orientation = orientationIn(stream);
        return upright(Fn::readImage(again, {}, limits), orientation);
    }
    const FNImageReference image = Fn::readImage(file.string(), {}, limits);
    std::ifstream stream(file, std::ios::binary);
    if (Fn::peekBytes(stream, 2, "readUpright") != "\x1F\x8B") return upright(image, orientationIn(stream));
    Fn::GunzipStream content(file.string(), limits);
    return upright(image, orientationIn(content));
}

Image PictureFile::picture() const {
    const std::lock_guard lock(mutex_);
    if (!picture_) picture_ = adapt(blank_ ? blackPixel() : readUpright(file_), file_.string());
    return picture_;
}

void PictureFile::forget() const {
    const std::lock_guard lock(mutex_);
    picture_ = Image();
}

void PictureFile::blank() const {
    const std::lock_guard lock(mutex_);
    blank_ = true;
    picture_ = Image();
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
    refuseInputs(names_, sources);
}

void PictureFolder::write(std::size_t source, const FNImageReference& picture) const {
    Fn::writeWholeFile(names_[source].string(),
                       [&](std::ostream& file) { Fn::writeJpeg(picture, file, drawnQuality); });
}

} // namespace Orbek::Tool

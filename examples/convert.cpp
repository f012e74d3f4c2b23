// Converts an image file into another format: convert <input> <output>
//
// The input is of any format that the library reads, told apart by its first bytes; only JPEG-LS, which
// begins like JPEG, is told by its ending. The ending of the output's name chooses what is written.
// Attributes are kept by PGM and PPM files.

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/jpegls.h"
#include "fn/imagefile/pbm.h"
#include "fn/imagefile/png.h"

#include <algorithm>
#include <array>
#include <fstream>
#include <iostream>
#include <string>

namespace {

struct Format {
    const char* ending;
    void (*write)(const FNImageReference& image, std::ostream& file);
};

constexpr int jpegQuality = 90, pngLevel = 6;

constexpr std::array formats{
    Format{"jpg", [](const auto& image, auto& file) { Fn::writeJpeg(image, file, jpegQuality); }},
    Format{"jpeg", [](const auto& image, auto& file) { Fn::writeJpeg(image, file, jpegQuality); }},
    Format{"png", [](const auto& image, auto& file) { Fn::writePng(image, file, pngLevel); }},
    Format{"jp2", [](const auto& image, auto& file) { Fn::writeJ2k(image, "jp2", file); }},
    Format{"jpc", [](const auto& image, auto& file) { Fn::writeJ2k(image, "jpc", file); }},
    Format{"jls", [](const auto& image, auto& file) { Fn::writeJpegLS(image, file); }},
    Format{"bmp", [](const auto& image, auto& file) { Fn::dumpBMP(image, file); }},
    Format{"pnm", [](const auto& image, auto& file) { Fn::writePbm(image, file, image.box()); }},
    Format{"pgm", [](const auto& image, auto& file) { Fn::writePgm(image, file); }},
    Format{"ppm", [](const auto& image, auto& file) { Fn::writePpm(image, file); }},
};

std::string endingOf(const std::string& fileName) {
    return fileName.substr(fileName.rfind('.') + 1);
}

FNImageReference read(const std::string& fileName) {
    if (endingOf(fileName) != "jls") return Fn::readImage(fileName);
    std::ifstream file(fileName, std::ios::binary);
    if (!file) FN_THROW(FNEBadArg, "Could not open file: " + fileName);
    return Fn::readJpegLS(file);
}

const Format& formatOf(const std::string& fileName) {
    const std::string ending = endingOf(fileName);
    const auto format =
        std::find_if(formats.begin(), formats.end(), [&](const Format& f) { return ending == f.ending; });
    if (format != formats.end()) return *format;
    std::string known;
    for (const Format& f : formats) known += std::string(" ") + f.ending;
    FN_THROW(FNEBadArg, "'" + fileName + "' has none of the endings" + known);
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "usage: convert <input> <output>\n";
        return 2;
    }
    try {
        const Format& format = formatOf(argv[2]);
        const FNImageReference image = read(argv[1]);
        std::ofstream file(argv[2], std::ios::binary);
        if (!file) FN_THROW(FNEIOError, std::string("cannot write ") + argv[2]);
        format.write(image, file);
        std::cout << argv[2] << ": " << image.w() << " x " << image.h()
                  << (image.isColor() ? " color\n" : " gray\n");
        return 0;
    } catch (const std::exception& e) {
        std::cerr << argv[1] << ": " << e.what() << '\n';
        return 1;
    }
}

// orbek-synth: draws portraits of people who do not exist.

#include "fn/exception.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/png.h"
#include "synth/portrait.h"

#include <CLI/CLI.hpp>

#include <cstdio>
#include <fstream>
#include <iostream>
#include <sstream>

namespace {

namespace fs = std::filesystem;

/// "NAME:f:SEED" or "NAME:m:SEED".
struct PersonWish {
    std::string name;
    bool woman;
    std::uint64_t seed;
};

PersonWish parsePerson(const std::string& text) {
    std::istringstream stream(text);
    PersonWish wish{};
    std::string gender, rest;
    if (std::getline(stream, wish.name, ':') && std::getline(stream, gender, ':') && stream >> wish.seed &&
        !(stream >> rest) && !wish.name.empty() && wish.name.find('/') == std::string::npos &&
        (gender == "f" || gender == "m")) {
        wish.woman = gender == "f";
        return wish;
    }
    FN_THROW(FNEBadArg, "Not NAME:f:SEED or NAME:m:SEED: " + text);
}

Synth::Colour parseColour(const std::string& text) {
    unsigned value = 0;
    std::istringstream stream(text);
    if (text.size() != 6 || !(stream >> std::hex >> value) || !stream.eof())
        FN_THROW(FNEBadArg, "Not a colour of the form RRGGBB: " + text);
    return {static_cast<float>(value >> 16), static_cast<float>(value >> 8 & 255),
            static_cast<float>(value & 255)};
}

std::string number(float value) {
    char text[32];
    std::snprintf(text, sizeof text, "%.2f", value);
    return text;
}

constexpr const char* header =
    "file\tperson\teye_left_x\teye_left_y\teye_right_x\teye_right_y\tmouth_x\tmouth_y\t"
    "bridge_x\tbridge_y\tpoints68\tsource_labels\tgender\tglasses\n";

std::string labels(const std::string& file, const Synth::Person& person, const Synth::Points& landmarks) {
    std::string line = file + "\t" + person.name;
    for (const FNPos p :
         {Synth::leftEye(landmarks), Synth::rightEye(landmarks), Synth::mouth(landmarks), landmarks[27]})
        line += "\t" + number(p.x) + "\t" + number(p.y);
    line += "\t";
    for (const FNPos p : landmarks) line += number(p.x) + " " + number(p.y) + " ";
    line.back() = '\t';
    return line + "synthetic\t" + (person.woman ? "f" : "m") + "\t0\n";
}

void write(const FNImage<Fn::Bgra32>& image, const fs::path& path, int quality) {
    std::ofstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "Cannot write " + path.string());
    if (path.extension() == ".png") {
        Fn::writePng(image, stream, 9);
    } else {
        const FNRMem<unsigned char> bytes = FNImageCompressor::compressJpeg(image, quality);
        stream.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    }
    if (!stream.flush()) FN_THROW(FNEIOError, "Cannot write " + path.string());
}

struct Options {
    std::string etc = "etc", out, format = "jpg";
    std::vector<std::string> people;
    int pictures = 4, quality = 90;
    std::uint32_t width = 320;
    float spread = 0.75f;
    Synth::ViewWishes wishes;
};

void run(const Options& options) {
    const Synth::PortraitModel model(fs::path(options.etc) / "synth" / "portrait.dat");
    const fs::path out = options.out;
    fs::create_directories(out);
    std::ofstream table(out / "labels.tsv");
    table << header;
    for (const std::string& text : options.people) {
        const PersonWish wish = parsePerson(text);
        const Synth::Person person =
            Synth::makePerson(model, wish.name, wish.woman, wish.seed, options.spread);
        Synth::Random random(~wish.seed);
        for (int i = 1; i <= options.pictures; ++i) {
            const Synth::Portrait portrait =
                drawPortrait(model, person, Synth::drawView(options.wishes, random), options.width);
            const std::string file = wish.name + std::to_string(i) + "." + options.format;
            write(portrait.image, out / file, options.quality);
            table << labels(file, person, portrait.landmarks);
        }
    }
    if (!table.flush()) FN_THROW(FNEIOError, "Cannot write " + (out / "labels.tsv").string());
}

} // namespace

int main(int argc, char** argv) {
    CLI::App app("Draws portraits of people who do not exist, with their landmarks (labels.tsv).");
    Options options;
    app.add_option("--etc", options.etc, "Folder with the trained content")->capture_default_str();
    app.add_option("--out", options.out, "Folder that gets the pictures")->required();
    app.add_option(
           "--person", options.people,
           "NAME:f:SEED (a woman) or NAME:m:SEED (a man), as often as wanted; the seed decides who it is")
        ->required();
    app.add_option("--pictures", options.pictures, "Pictures of each person")
        ->check(CLI::Range(1, 100000))
        ->capture_default_str();
    app.add_option("--format", options.format, "jpg or png")
        ->check(CLI::IsMember({"jpg", "png"}))
        ->capture_default_str();
    app.add_option("--quality", options.quality, "Of JPEG files")
        ->check(CLI::Range(1, 100))
        ->capture_default_str();
    app.add_option("--width", options.width, "Of the pictures, pixels; the height is 4/3 of it")
        ->check(CLI::Range(90, 3000))
        ->capture_default_str();
    app.add_option("--spread", options.spread, "How much people differ, 0 for the mean face")
        ->check(CLI::Range(0.0, 1.5))
        ->capture_default_str();
    // What is not given is drawn for each picture.
    Synth::ViewWishes& wishes = options.wishes;
    const auto wish = [&](const char* name, std::optional<float>& value, const char* doc, float most) {
        app.add_option(name, value, doc)->check(CLI::Range(-most, most));
    };
    wish("--yaw", wishes.yaw, "Head turned to the image's right, usual deviations", 2);
    wish("--pitch", wishes.pitch, "Head lowered, usual deviations", 2);
    wish("--roll", wishes.roll, "Head tilted clockwise, degrees", 30);
    wish("--smile", wishes.smile, "Corners of the mouth raised, usual deviations", 2);
    wish("--mouth-open", wishes.mouthOpen, "Usual deviations", 2);
    wish("--eyes-open", wishes.eyesOpen, "Usual deviations", 2);
    wish("--light-side", wishes.lightSide, "Light from the image's left, usual deviations", 2);
    wish("--light-above", wishes.lightAbove, "Light from above, usual deviations", 2);
    app.add_option_function<std::string>(
        "--background", [&](const std::string& text) { wishes.background = parseColour(text); }, "RRGGBB");
    try {
        CLI11_PARSE(app, argc, argv);
        run(options);
        return 0;
    } catch (const std::exception& e) {
        std::cerr << "orbek-synth: " << e.what() << "\n";
        return 1;
    }
}

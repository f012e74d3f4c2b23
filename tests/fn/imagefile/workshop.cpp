#include "workshop.h"

#include "fn/image_conversion.h"

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace {

constexpr std::uint32_t width = 13, height = 9;

template <class T, class Make> FNImage<T> made(Make make) {
    FNImage<T> image(width, height);
    for (FNImIter<T> it(image, image.box()); !it.atEnd(); ++it) *it = make(it.x(), it.y());
    return image;
}

template <class T> std::string netpbmOf(const FNImage<T>& image) {
    using Sample = typename Fn::SampleOf<T>::Type;
    std::string file = std::string(Fn::isColorPixel<T> ? "P6\n" : "P5\n") + std::to_string(image.w()) + " " +
                       std::to_string(image.h()) + (sizeof(Sample) == 1 ? "\n255\n" : "\n65535\n");
    const auto append = [&](unsigned v) {
        if (sizeof(Sample) == 2) file += static_cast<char>(v >> 8);
        file += static_cast<char>(v);
    };
    for (const T& p : image.span())
        if constexpr (Fn::isColorPixel<T>) {
            append(p.r);
            append(p.g);
            append(p.b);
        } else {
            append(p);
        }
    return file;
}

} // namespace

bool Workshop::has(const std::string& program) {
    const std::string test = program == "convert" ? "convert -version 2>/dev/null | grep -q ImageMagick"
                                                  : "command -v " + program + " >/dev/null 2>&1";
    return std::system(test.c_str()) == 0;
}

void Workshop::run(const std::string& command) const {
    if (std::system(
            ("cd '" + folder_.path().string() + "' && { " + command + " ; } >/dev/null 2>log").c_str()) != 0)
        throw std::runtime_error(command + " failed: " + folder_.read("log"));
}

std::string bytesOfFile(const std::filesystem::path& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

std::string fixture(const std::string& name) {
    return std::string(ORBEK_SOURCE_DIR "/tests/fn/imagefile/fixtures/") + name;
}

std::vector<std::filesystem::path> fixtures(const std::string& folder) {
    std::vector<std::filesystem::path> files;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(fixture(folder)))
        if (entry.is_regular_file()) files.push_back(entry.path());
    if (files.empty()) throw std::runtime_error("no fixtures in " + fixture(folder));
    return files;
}

bool isRefused(const std::filesystem::path& fixture, const Fn::ImageLimits& limits) {
    return fixture.filename().string().starts_with("refused") &&
           (!limits.rareVariants || fixture.extension() == ".jls");
}

FNImage<Fn::Bgra32> colorPicture() {
    return made<Fn::Bgra32>([](unsigned x, unsigned y) {
        return Fn::Bgra32(static_cast<unsigned char>(x * 19), static_cast<unsigned char>(y * 28),
                          static_cast<unsigned char>(255 - x * 10 - y * 8));
    });
}

FNImage<unsigned char> grayPicture() {
    return made<unsigned char>(
        [](unsigned x, unsigned y) { return static_cast<unsigned char>(x * 17 + y * 5); });
}

FNImage<unsigned char> coarsePicture(unsigned bits) {
    const unsigned greatest = (1u << bits) - 1;
    return made<unsigned char>([&](unsigned x, unsigned y) {
        return static_cast<unsigned char>((x * y + x / 2) % (greatest + 1) * 255 / greatest);
    });
}

FNImage<unsigned short> widePicture() {
    return made<unsigned short>(
        [](unsigned x, unsigned y) { return static_cast<unsigned short>(x * 5000 + y * 331); });
}

FNImage<Fn::Rgb48> wideColorPicture() {
    return made<Fn::Rgb48>([](unsigned x, unsigned y) {
        return Fn::Rgb48(static_cast<unsigned short>(x * 5000), static_cast<unsigned short>(y * 8001),
                         static_cast<unsigned short>(65535 - x * y * 600));
    });
}

std::string netpbm(const FNImage<unsigned char>& image) {
    return netpbmOf(image);
}
std::string netpbm(const FNImage<unsigned short>& image) {
    return netpbmOf(image);
}
std::string netpbm(const FNImage<Fn::Bgra32>& image) {
    return netpbmOf(image);
}
std::string netpbm(const FNImage<Fn::Rgb48>& image) {
    return netpbmOf(image);
}

int largestDifference(const FNImageReference& a, const FNImageReference& b) {
    if (a.w() != b.w() || a.h() != b.h()) return 1000;
    const FNImage<Fn::Bgra32> p = a.toBgra32(), q = b.toBgra32();
    int largest = 0;
    for (std::uint64_t i = 0; i < p.size(); ++i) {
        const Fn::Bgra32 &u = p.data()[i], &v = q.data()[i];
        largest = std::max({largest, std::abs(u.r - v.r), std::abs(u.g - v.g), std::abs(u.b - v.b)});
    }
    return largest;
}

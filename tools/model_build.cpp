#include "model_build.h"

#include "b7_factors.h"
#include "fn/exception.h"
#include "model_sums.h"

#include <algorithm>
#include <fstream>
#include <ostream>
#include <set>
#include <sstream>
#include <vector>

#include <zlib.h>

namespace Orbek::Models {
namespace {

namespace fs = std::filesystem;

constexpr std::size_t blockSize = 1 << 20;

void copy(const fs::path& source, std::ostream& target) {
    std::ifstream file(source, std::ios::binary);
    if (!file) FN_THROW(FNEIOError, source.string() + ": cannot be opened for reading");
    if (file.peek() != std::ifstream::traits_type::eof()) target << file.rdbuf();
    if (file.bad()) FN_THROW(FNEIOError, source.string() + ": error while reading");
}

void inflate(const fs::path& source, std::ostream& target) {
    const std::unique_ptr<gzFile_s, decltype(&gzclose)> file(gzopen(source.c_str(), "rb"), gzclose);
    if (!file) FN_THROW(FNEIOError, source.string() + ": cannot be opened for reading");
    std::vector<char> block(blockSize);
    for (;;) {
        const int n = gzread(file.get(), block.data(), static_cast<unsigned>(block.size()));
        int error = Z_OK;
        if (n <= 0) {
            const std::string text = gzerror(file.get(), &error);
            if (n < 0 || error != Z_OK) FN_THROW(FNEIOError, source.string() + ": damaged: " + text);
            return;
        }
        target.write(block.data(), n);
    }
}

/// A compressed B7Factors, to the file of the transformation.
void multiply(const fs::path& source, std::ostream& target) {
    std::stringstream factors;
    inflate(source, factors);
    try {
        B7Factors::read(factors).unpack().write(target);
    } catch (const FNEBadFormat& e) {
        FN_THROW(FNEBadFormat, source.string() + ": " + e.what());
    }
}

/// How a source becomes a file, by the suffix that is taken off its name.
struct Unpacker {
    const char* suffix;
    void (*unpack)(const fs::path& source, std::ostream& target);
};
constexpr Unpacker unpackers[] = {{".gz", inflate}, {".factors", multiply}};

/// All sources below a folder, sorted, by their path in it.
std::set<fs::path> sourcesOf(const fs::path& models) {
    std::set<fs::path> sources;
    for (const auto& entry : fs::recursive_directory_iterator(models))
        if (entry.is_regular_file() && entry.path().extension() != ".md" &&
            entry.path().filename() != sumsName)
            sources.insert(entry.path().lexically_relative(models));
    return sources;
}

/// Unpacks one source to its place below `etc`. @return its path there
fs::path unpack(const fs::path& models, const fs::path& source, const fs::path& etc,
                const std::map<std::string, std::string>& sums) {
    const auto unpacker = std::find_if(std::begin(unpackers), std::end(unpackers),
                                       [&](const Unpacker& u) { return source.extension() == u.suffix; });
    const bool packed = unpacker != std::end(unpackers);
    const fs::path file = packed ? source.parent_path() / source.stem() : source;
    const auto sum = sums.find(file.generic_string());
    if (sum == sums.end())
        FN_THROW(FNEBadFormat, (models / source).string() + ": " + file.generic_string() + " has no sum in " +
                                   (models / sumsName).string());

    const fs::path target = etc / file, part = target.string() + ".part";
    fs::create_directories(target.parent_path());
    {
        std::ofstream stream(part, std::ios::binary);
        (packed ? unpacker->unpack : copy)(models / source, stream);
        if (!stream.flush()) FN_THROW(FNEIOError, part.string() + ": cannot be written");
    }
    if (const std::string found = sha256(part); found != sum->second) {
        fs::remove(part);
        FN_THROW(FNEBadFormat, (models / source).string() + ": unpacks to a file with the SHA-256 " + found +
                                   " instead of " + sum->second);
    }
    fs::rename(part, target);
    return file;
}

} // namespace

std::size_t build(const fs::path& models, const fs::path& etc, std::ostream& log) {
    auto sums = readSums(models / sumsName);
    std::size_t files = 0;
    for (const fs::path& source : sourcesOf(models)) {
        const fs::path file = unpack(models, source, etc, sums);
        log << (etc / file).string() << '\n';
        sums.erase(file.generic_string());
        ++files;
    }
    if (!sums.empty())
        FN_THROW(FNEBadFormat, (models / sumsName).string() + ": there is no source of " +
                                   sums.begin()->first + " below " + models.string());
    return files;
}

} // namespace Orbek::Models

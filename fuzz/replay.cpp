// Runs a fuzz target without libFuzzer: on every file of the given folders and files, and on simple mutations
// of each (every truncation up to a limit, and single bytes changed), so that the seeds guard the parser in
// every test run.

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size);

namespace {

void run(const std::string& bytes) {
    LLVMFuzzerTestOneInput(reinterpret_cast<const unsigned char*>(bytes.data()), bytes.size());
}

void runWithMutations(const std::filesystem::path& path) {
#ifdef ORBEK_MUTATIONS
    constexpr std::size_t mutations = ORBEK_MUTATIONS; // of a slow target
#else
    constexpr std::size_t mutations = 200;
#endif
    std::ifstream file(path, std::ios::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), {}};
    run(bytes);
    if (bytes.empty()) return;

    const std::size_t step = std::max<std::size_t>(1, bytes.size() / mutations);
    for (std::size_t length = 0; length < bytes.size(); length += step) run(bytes.substr(0, length));

    std::mt19937 random(1);
    for (std::size_t i = 0; i < mutations; ++i) {
        std::string changed = bytes;
        for (unsigned n = random() % 3 + 1; n > 0; --n)
            changed[random() % changed.size()] =
                static_cast<char>(random() % 2 ? random() : 0xFF * (random() % 2));
        run(changed);
    }
}

} // namespace

int main(int argc, char** argv) {
    std::size_t files = 0;
    for (int i = 1; i < argc; ++i) {
        if (!std::filesystem::is_directory(argv[i])) {
            runWithMutations(argv[i]);
            ++files;
            continue;
        }
        for (const auto& entry : std::filesystem::recursive_directory_iterator(argv[i]))
            if (entry.is_regular_file()) {
                runWithMutations(entry.path());
                ++files;
            }
    }
    std::printf("%zu seeds and their mutations passed\n", files);
    return files == 0; // a corpus that is not there proves nothing
}

// Cost of configurations: opening, reading a key, and changes that must not wait for the disk.

#include "orbek/configuration.h"
#include "fn/deployment/app_file_config_db.h"

#include <benchmark/benchmark.h>

#include <filesystem>
#include <fstream>

namespace {

/// A configuration file of 200 lines, gone at the end of the program.
class File {
public:
    File() : name_(std::filesystem::temp_directory_path() / "orbek-bench.conf") {
        std::ofstream file(name_);
        file << "# made by the benchmark\nORBEK.Substitutions.INSTALLDIR = /opt/orbek\nORBEK.CaptureDevices "
                "= ";
        for (int i = 0; i < 98; ++i) file << "Camera" << i << " ";
        file << "\n";
        for (int i = 0; i < 98; ++i)
            file << "ORBEK.CaptureDevices.Camera" << i << " = ImageFiles\nORBEK.CaptureDevices.Camera" << i
                 << ".ImageFiles.CaptureFrameRate = " << i + 1 << "\n";
    }
    ~File() { std::filesystem::remove(name_); }
    std::string name() const { return name_.string(); }

private:
    std::filesystem::path name_;
};

const File file;

void constructConfigurationFrom200Lines(benchmark::State& state) {
    for (auto _ : state) {
        const Orbek::Configuration configuration(file.name());
        benchmark::DoNotOptimize(configuration);
    }
}
BENCHMARK(constructConfigurationFrom200Lines)->Unit(benchmark::kMicrosecond);

void getValueOfADeepKey(benchmark::State& state) {
    const Orbek::Configuration configuration(file.name());
    const std::string key = "ORBEK.CaptureDevices.Camera7.ImageFiles.FileLocation.Directory";
    for (auto _ : state) {
        const std::string value = configuration.getValue(key);
        benchmark::DoNotOptimize(value);
    }
}
BENCHMARK(getValueOfADeepKey)->Unit(benchmark::kMicrosecond);

/// What the caller waits for, of 100000 changes to 1000 keys of a file.
void set100000Values(benchmark::State& state) {
    const std::string name = (std::filesystem::temp_directory_path() / "orbek-bench-set.conf").string();
    for (auto _ : state) {
        auto* const db = new AppFileConfigDB(name.c_str(), true);
        for (int i = 0; i < 100000; ++i) db->set("Key." + std::to_string(i % 1000), std::to_string(i));
        state.PauseTiming();
        delete db;
        state.ResumeTiming();
    }
    std::filesystem::remove(name);
    std::filesystem::remove(name + ".bak");
}
BENCHMARK(set100000Values)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(3);

} // namespace

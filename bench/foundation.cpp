// Cost of the foundation: handles and packages.

#include "fn/cptr.h"
#include "fn/package.h"

#include <benchmark/benchmark.h>

namespace {

const FNCountedPtr<int> sharedHandle(new int(1));

void copyAndReleaseHandle(benchmark::State& state) {
    for (auto _ : state) {
        FNCountedPtr<int> copy(sharedHandle);
        benchmark::DoNotOptimize(copy);
    }
}
BENCHMARK(copyAndReleaseHandle)->Threads(1)->Threads(2)->UseRealTime();

void copyAndReleaseOwnHandle(benchmark::State& state) {
    const FNCountedPtr<int> own(new int(1));
    for (auto _ : state) {
        FNCountedPtr<int> copy(own);
        benchmark::DoNotOptimize(copy);
    }
}
BENCHMARK(copyAndReleaseOwnHandle)->Threads(1)->Threads(2)->UseRealTime();

Fn::Package smallCores() {
    std::list<Fn::Package::Core> cores;
    for (int i = 0; i < 1000; ++i) {
        Fn::Package::Core core(16);
        std::fill_n(core.getExclusive(), 16, static_cast<unsigned char>(i));
        cores.push_back(core);
    }
    return Fn::Package(cores);
}

/// The yardstick of the next one: each core's bytes copied once into a core of its own.
void copyBytesOf1000SmallCores(benchmark::State& state) {
    const Fn::Package package = smallCores();
    for (auto _ : state) {
        std::list<Fn::Package::Core> copies;
        for (const auto& core : package.cores()) {
            Fn::Package::Core copy(core.size());
            std::copy(core.begin(), core.end(), copy.getExclusive());
            copies.push_back(copy);
        }
        benchmark::DoNotOptimize(copies);
    }
}
BENCHMARK(copyBytesOf1000SmallCores);

void writeAndReadPackageOf1000SmallCores(benchmark::State& state) {
    const Fn::Package package = smallCores();
    std::vector<unsigned char> bytes(package.size());
    for (auto _ : state) {
        package.write(bytes.data());
        const Fn::Package read(bytes.data(), bytes.size());
        benchmark::DoNotOptimize(read);
    }
}
BENCHMARK(writeAndReadPackageOf1000SmallCores);

} // namespace

// The yardstick of the resampling benchmarks: the area averages of OpenCV, on one thread.

#include <benchmark/benchmark.h>
#include <opencv2/imgproc.hpp>

namespace {

void resizeArea(benchmark::State& state, int width, int height) {
    cv::setNumThreads(1);
    cv::Mat source(1080, 1920, CV_16UC1), level;
    cv::randu(source, 0, 65536);
    for (auto _ : state) {
        cv::resize(source, level, cv::Size(width, height), 0, 0, cv::INTER_AREA);
        benchmark::DoNotOptimize(level.data);
    }
}

void openCvScale1080p(benchmark::State& state) {
    resizeArea(state, static_cast<int>(19200 / state.range(0)), static_cast<int>(10800 / state.range(0)));
}
BENCHMARK(openCvScale1080p)->Arg(15)->Arg(30)->Arg(90)->Unit(benchmark::kMicrosecond);

void openCvScale1080pFourToThree(benchmark::State& state) {
    resizeArea(state, 1440, 810);
}
BENCHMARK(openCvScale1080pFourToThree)->Unit(benchmark::kMicrosecond);

} // namespace

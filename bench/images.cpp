// Reading JPEG against libjpeg-turbo's own time, and pixel conversions against their plain forms.

#include "fn/image_conversion.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpeg.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <random>
#include <vector>

#include <jpeglib.h>

namespace {

using Fn::Bgra32;

/// A picture with structure and noise, as a camera's.
FNImage<Bgra32> photo(std::uint32_t w, std::uint32_t h) {
    FNImage<Bgra32> image(w, h);
    std::mt19937 random(3);
    for (FNImIter<Bgra32> it(image, image.box()); !it.atEnd(); ++it) {
        const unsigned noise = random() % 16, edge = (it.x() / 37 + it.y() / 53) % 2 * 60;
        *it = Bgra32(static_cast<unsigned char>(it.x() * 160 / w + noise + edge),
                     static_cast<unsigned char>(it.y() * 160 / h + noise + edge / 2),
                     static_cast<unsigned char>((it.x() + it.y()) % 180 + noise));
    }
    return image;
}

const FNImage<Bgra32>& color() {
    static const FNImage<Bgra32> image = photo(1920, 1080);
    return image;
}

const FNRMem<unsigned char>& jpegFile(bool gray) {
    static const FNImageReference image = FNImageReferenceFactory::create(color());
    static const FNRMem<unsigned char> files[] = {Fn::writeJpeg(image, 85),
                                                  FNImageCompressor::compressJpeg(image.toMono8(), 85)};
    return files[gray];
}

/// The library alone: the same options, rows of the whole image in memory that is there.
void libjpegAlone(benchmark::State& state) {
    const FNRMem<unsigned char>& file = jpegFile(state.range(0) != 0);
    const std::size_t pixelSize = state.range(0) != 0 ? 1 : 4;
    std::vector<unsigned char> pixels(1920 * 1080 * pixelSize);
    for (auto _ : state) {
        jpeg_decompress_struct info{};
        jpeg_error_mgr errors;
        info.err = jpeg_std_error(&errors);
        jpeg_create_decompress(&info);
        jpeg_mem_src(&info, file.data(), file.size());
        jpeg_read_header(&info, TRUE);
        if (pixelSize == 4) info.out_color_space = JCS_EXT_BGRA;
        jpeg_start_decompress(&info);
        while (info.output_scanline < info.output_height) {
            JSAMPROW row = pixels.data() + info.output_scanline * 1920 * pixelSize;
            jpeg_read_scanlines(&info, &row, 1);
        }
        jpeg_finish_decompress(&info);
        jpeg_destroy_decompress(&info);
        benchmark::DoNotOptimize(pixels.data());
    }
}
BENCHMARK(libjpegAlone)->ArgName("gray")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);

void readJpeg1080p(benchmark::State& state) {
    const FNRMem<unsigned char>& file = jpegFile(state.range(0) != 0);
    for (auto _ : state)
        benchmark::DoNotOptimize(Fn::readImage(reinterpret_cast<const char*>(file.data()), file.size()));
}
BENCHMARK(readJpeg1080p)->ArgName("gray")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);

template <class From, class To> struct Rows {
    FNImage<From> from = Fn::convertImage<From>(color());
    FNImage<To> to{color().w(), color().h()};
    To* out = to.getExclusive();
};

template <class From, class To> void convertPlain(benchmark::State& state) {
    Rows<From, To> rows;
    for (auto _ : state) {
        for (std::uint64_t i = 0; i < rows.from.size(); ++i)
            rows.out[i] = Fn::convertPixel<To>(rows.from.data()[i]);
        benchmark::ClobberMemory();
    }
}

template <class From, class To> void convert(benchmark::State& state) {
    Rows<From, To> rows;
    for (auto _ : state) {
        Fn::convertPixels(rows.from.data(), rows.out, rows.from.size());
        benchmark::ClobberMemory();
    }
}

template <class From, class To> void addBoth(const char* name) {
    benchmark::RegisterBenchmark((std::string("convertPlain/") + name).c_str(), convertPlain<From, To>)
        ->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark((std::string("convert/") + name).c_str(), convert<From, To>)
        ->Unit(benchmark::kMicrosecond);
}

const bool added = [] {
    addBoth<unsigned char, unsigned short>("mono8_mono16");
    addBoth<unsigned char, float>("mono8_float");
    addBoth<unsigned char, Bgra32>("mono8_bgra32");
    addBoth<unsigned short, unsigned char>("mono16_mono8");
    addBoth<unsigned short, float>("mono16_float");
    addBoth<float, unsigned char>("float_mono8");
    addBoth<float, unsigned short>("float_mono16");
    addBoth<Bgra32, unsigned char>("bgra32_mono8");
    addBoth<Bgra32, unsigned short>("bgra32_mono16");
    addBoth<Bgra32, float>("bgra32_float");
    return true;
}();

} // namespace

// The functions for C: pictures and records of any bytes, eyes anywhere, buffers of any size. Every call ends
// with one of its codes, and writes within its buffer.
//
// An input is a byte that chooses the function, four eye coordinates and a buffer size of two bytes each, and
// the picture or the record.

#include "orbek/corbek.h"

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <iostream>
#include <limits>
#include <vector>

namespace {

void expect(int code, std::initializer_list<int> codes) {
    for (const int allowed : codes)
        if (code == allowed) return;
    std::abort();
}

/// Up to 128 pixels beside the origin, and what is no number of pixels.
float coordinate(const unsigned char* bytes) {
    std::int16_t value;
    std::memcpy(&value, bytes, sizeof value);
    switch (value) {
    case 32767:
        return std::nanf("");
    case 32766:
        return std::numeric_limits<float>::infinity();
    case 32765:
        return -std::numeric_limits<float>::max();
    default:
        return static_cast<float>(value) / 256;
    }
}

/// A caller's buffer that has no byte too many; its size may be told as a negative one.
struct Buffer {
    explicit Buffer(std::int16_t told) : size(told < 0 ? told : 16 * told), bytes(size < 0 ? 0 : size) {}
    int size;
    std::vector<char> bytes;
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    static const bool ready = [] {
        std::cerr.rdbuf(nullptr); // complaints are as many as inputs
        return orbekInit(ORBEK_BINARY_DIR "/orbek.conf") == 0;
    }();
    if (!ready) std::abort();
    constexpr std::size_t header = 11;
    if (size < header) return 0;
    const float x0 = coordinate(data + 1), y0 = coordinate(data + 3), x1 = coordinate(data + 5),
                y1 = coordinate(data + 7);
    std::int16_t told;
    std::memcpy(&told, data + 9, sizeof told);
    Buffer buffer(told);
    const std::vector<unsigned char> payload(data + header, data + size);
    const unsigned char* const record = payload.data();
    const char* const jpeg = reinterpret_cast<const char*>(record);
    const auto length = static_cast<unsigned int>(payload.size());
    float a, b, c, d;
    unsigned int count = 0;
    orbekPortraitResult result;
    orbekMatch matches[2];

    switch (data[0] % 8) {
    case 0:
        expect(orbekGenerateFIR(jpeg, length, x0, y0, x1, y1,
                                reinterpret_cast<unsigned char*>(buffer.bytes.data()), buffer.size, &count),
               {0, 2, 3, 4});
        break;
    case 1:
        expect(orbekFindEyes(jpeg, length, &a, &b, &c, &d), {0, 1, 2, 4});
        break;
    case 2:
        expect(orbekCompare(record, length, record, length, &a), {0, 1});
        break;
    case 3: {
        void* const people = orbekCreatePopulation();
        expect(orbekAppendToPopulation(people, record, length, "somebody"), {0, 1});
        expect(orbekBestMatches(record, length, people, x0, 2, matches, &count), {0, 1});
        if (count > 1) std::abort();
        expect(orbekRemoveFromPopulation(people, "somebody"), {0});
        expect(orbekDeletePopulation(people), {0});
        break;
    }
    case 4:
        expect(orbekAnalyzePortraitExposure(jpeg, length, &result, x0, y0, x1, y1), {0, 1});
        break;
    case 5:
        expect(orbekAnalyzePortraitGlasses(jpeg, length, &result, x0, y0, x1, y1), {0, 1});
        break;
    case 6:
        expect(orbekExtractTokenFaceImageSized(jpeg, length, x0, y0, x1, y1, buffer.bytes.data(), buffer.size,
                                               &count),
               {0, 1, 3});
        break;
    default:
        expect(
            orbekExtractMinimalTokenFaceImage(jpeg, length, x0, y0, x1, y1, buffer.bytes.data(), buffer.size),
            {0, 1, 3});
    }
    return 0;
}

#include "eye/cara/first_test.h"

#define HWY_WANT_AVX3_DL
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "eye/cara/first_test.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include <bit>

HWY_BEFORE_NAMESPACE();
namespace Eye::Cara::T8::HWY_NAMESPACE {

/// For n windows below each other, in how many bits each differs from `vector`.
/// @param bytes the first byte of the first window, readable for a register's length behind the last window
/// @param stride from one column to the next @param counts room for a register's length behind the last
void countDifferingBits(const unsigned char* bytes, std::size_t stride, std::size_t n,
                        const unsigned char* vector, std::uint16_t* counts) {
    constexpr std::size_t size = Implementation::SodImage::windowSize;
    constexpr std::uint8_t low = 0x0f; // the first row and column of a window have no high nibble
#if HWY_TARGET == HWY_SCALAR
    for (std::size_t y = 0; y < n; ++y) {
        int count = 0;
        for (std::size_t column = 0; column < size; ++column)
            for (std::size_t row = 0; row < size; ++row) {
                const std::uint8_t byte = bytes[column * stride + y + row];
                const std::uint8_t kept = column == 0 || row == 0 ? byte & low : byte;
                count += std::popcount(static_cast<std::uint8_t>(kept ^ vector[column * size + row]));
            }
        counts[y] = static_cast<std::uint16_t>(count);
    }
#else
    namespace hn = hwy::HWY_NAMESPACE;
    const hn::ScalableTag<std::uint8_t> d8;
    const hn::Half<decltype(d8)> half;
    const hn::RepartitionToWide<decltype(d8)> d16;
    const auto lowNibbles = hn::Set(d8, low);
    for (std::size_t y = 0; y < n; y += hn::Lanes(d8)) {
        auto lower = hn::Zero(d16), upper = hn::Zero(d16);
        // A byte holds the counts of two columns: 2 * (15 * 8 + 4) at most.
        for (std::size_t pair = 0; pair < size; pair += 2) {
            auto run = hn::Zero(d8);
            for (std::size_t column = pair; column < pair + 2; ++column)
                for (std::size_t row = 0; row < size; ++row) {
                    auto byte = hn::LoadU(d8, bytes + column * stride + y + row);
                    if (column == 0 || row == 0) byte = hn::And(byte, lowNibbles);
                    const auto other = hn::Set(d8, vector[column * size + row]);
                    run = hn::Add(run, hn::PopulationCount(hn::Xor(byte, other)));
                }
            lower = hn::Add(lower, hn::PromoteTo(d16, hn::LowerHalf(half, run)));
            upper = hn::Add(upper, hn::PromoteTo(d16, hn::UpperHalf(half, run)));
        }
        hn::StoreU(lower, d16, counts + y);
        hn::StoreU(upper, d16, counts + y + hn::Lanes(d16));
    }
#endif
}

} // namespace Eye::Cara::T8::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "eye/discriminator/cascade_walk.h"
#include "fn/numeric/sign_bits.h"

#include <algorithm>
#include <array>

namespace Eye::Cara::T8 {

HWY_EXPORT(countDifferingBits);

using Implementation::CascadeTables;
using Implementation::SodImage;

std::vector<unsigned char> acceptedWindows(const SodDotDiscriminator& discriminator, const SodImage& sods) {
    constexpr std::size_t countedVectors = 2; // few windows go further
    const std::size_t w = sods.gridWidth(), h = sods.gridHeight();
    const CascadeTables& tables = discriminator.tables();
    const std::size_t counted = std::min(countedVectors, tables.alphas.size());
    std::array<std::vector<std::uint16_t>, countedVectors> counts;
    counts.fill(std::vector<std::uint16_t>(h + SodImage::readableBehind));
    std::vector<unsigned char> accepted(w * h, 0);
    // Most windows end here: a product below the threshold is a count above this one.
    const int mostDiffering = tables.firstStepShortcut
                                  ? (static_cast<int>(tables.dimension) - tables.firstStepThreshold) / 2
                                  : static_cast<int>(tables.dimension);
    Fn::SignValueVector<int> window(SodImage::windowBits);
    const auto count = [](auto... args) { HWY_DYNAMIC_DISPATCH(countDifferingBits)(args...); };
    const auto vector = [&](std::size_t j) { return tables.vectors.data() + j * tables.stride; };
    for (std::uint32_t x = 0; x < w; ++x) {
        for (std::size_t j = 0; j < counted; ++j)
            count(sods.column(x), sods.stride(), h, vector(j), counts[j].data());
        for (std::uint32_t y = 0; y < h; ++y) {
            if (counts[0][y] > mostDiffering) continue;
            const auto differingBits = [&](std::uint32_t j) -> std::uint32_t {
                if (j < counted) return counts[j][y];
                sods.getWindow(x, y, window.exclusiveBytes());
                return Fn::Numeric::differingBits(window.bytes(), vector(j), SodImage::windowBits / 8);
            };
            std::int64_t sum = 0;
            accepted[y * w + x] = walkCascade(tables, discriminator.kernel(), sum, differingBits);
        }
    }
    return accepted;
}

std::vector<unsigned char> Plain::acceptedWindows(const SodDotDiscriminator& discriminator,
                                                  const SodImage& sods) {
    std::vector<unsigned char> accepted;
    Fn::SignValueVector<int> window(SodImage::windowBits);
    float score;
    for (std::uint32_t y = 0; y < sods.gridHeight(); ++y)
        for (std::uint32_t x = 0; x < sods.gridWidth(); ++x) {
            sods.getWindow(x, y, window.exclusiveBytes());
            accepted.push_back(discriminator(window, score));
        }
    return accepted;
}

} // namespace Eye::Cara::T8
#endif

#include "img/histogram_equalizer.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <functional>
#include <sstream>
#include <utility>

namespace {

template <class T> void demandRange(T min, T max) {
    if (min < max) return;
    std::ostringstream message;
    message << "HistogramEqualizer:  max has to be larger than min: ( min: " << min << ", max: " << max
            << ")";
    FN_THROW(FNEBadArg, message.str());
}

template <class T> std::vector<T> sortedPixels(const FNImage<T>& image, const FNBox& box) {
    const FNBox part = box & image.box();
    std::vector<T> pixels;
    pixels.reserve(std::size_t{part.width()} * part.height());
    for (FNConstImIter<T> it(image, part); !it.atEnd(); it.nextRow())
        for (const T pixel : it.restOfRow())
            if (pixel == pixel) pixels.push_back(pixel); // what is not a number has no rank
    std::ranges::sort(pixels);
    return pixels;
}

/// Distance of ranks in the result. A single pixel has rank 0 only.
double scaleOf(float min, float max, std::size_t pixels) {
    return pixels > 1 ? (double{max} - double{min}) / static_cast<double>(pixels - 1) : 0;
}

/// A pixel and its place. The key orders as the value does.
struct Keyed {
    std::uint32_t key, place;
};

std::uint32_t orderedKey(float value) {
    const auto bits = std::bit_cast<std::uint32_t>(value == 0 ? 0.0f : value); // -0 is 0
    return bits >> 31 ? ~bits : bits | 0x80000000u;
}

/// Radix sort, 11 bits at a time.
void sortByKey(std::vector<Keyed>& pixels) {
    constexpr int digitBits = 11;
    constexpr std::uint32_t digits = 1 << digitBits;
    std::vector<Keyed> other(pixels.size());
    for (int shift = 0; shift < 32; shift += digitBits) {
        std::array<std::uint32_t, digits> starts{};
        for (const Keyed& pixel : pixels) ++starts[pixel.key >> shift & (digits - 1)];
        std::uint32_t sum = 0;
        for (std::uint32_t& start : starts) start = std::exchange(sum, sum + start);
        for (const Keyed& pixel : pixels) other[starts[pixel.key >> shift & (digits - 1)]++] = pixel;
        pixels.swap(other);
    }
}

/// What a HistogramEqualizer over the whole image does to its own pixels, without looking them up. They are
/// all numbers.
FNImage<float> equalizeByOwnRanks(const FNImage<float>& image, float min, float max) {
    std::vector<Keyed> pixels(image.size());
    for (std::uint32_t i = 0; i < image.size(); ++i) pixels[i] = {orderedKey(image.data()[i]), i};
    sortByKey(pixels);
    FNImage<float> result(image.w(), image.h());
    float* const out = result.getExclusive();
    const double scale = scaleOf(min, max, pixels.size());
    for (std::size_t i = 0, end; i < pixels.size(); i = end) {
        for (end = i + 1; end < pixels.size() && pixels[end].key == pixels[i].key;) ++end;
        const double rank = static_cast<double>(i) + 0.5 * static_cast<double>(end - i - 1);
        const auto value = static_cast<float>(rank * scale + double{min});
        for (std::size_t j = i; j < end; ++j) out[pixels[j].place] = value;
    }
    return result;
}

} // namespace

HistogramEqualizer<float>::HistogramEqualizer(const FNImage<float>& image, const FNBox& box, float min,
                                              float max)
    : min_(min), max_(max) {
    demandRange(min, max);
    const std::vector<float> pixels = sortedPixels(image, box);
    for (std::size_t i = 0; i < pixels.size(); ++i)
        if (i > 0 && pixels[i] == items_.back().value)
            items_.back().rank += 0.5;
        else
            items_.push_back({pixels[i], static_cast<double>(i)});
    scale_ = scaleOf(min, max, pixels.size());
}

float HistogramEqualizer<float>::operator()(float value) const {
    if (items_.empty()) return value;
    const auto next = std::ranges::lower_bound(items_, value, {}, &Item::value);
    if (next == items_.end()) return max_;
    double rank = next->rank;
    if (next->value != value) {
        if (next == items_.begin()) return min_;
        const Item& previous = next[-1];
        rank = previous.rank + (double{value} - double{previous.value}) * (next->rank - previous.rank) /
                                   (double{next->value} - double{previous.value});
    }
    return static_cast<float>(rank * scale_ + double{min_});
}

HistogramEqualizer<short>::HistogramEqualizer(const FNImage<short>& image, const FNBox& box, short min,
                                              short max)
    : min_(min), max_(max) {
    demandRange(min, max);
    const std::vector<short> pixels = sortedPixels(image, box);
    for (std::size_t i = 0, end; i < pixels.size(); i = end) {
        for (end = i + 1; end < pixels.size() && pixels[end] == pixels[i];) ++end;
        items_.push_back({pixels[i], static_cast<unsigned>(i + (end - i - 1) / 2)});
    }
    if (std::has_single_bit(pixels.size())) shift_ = std::countr_zero(pixels.size());
}

short HistogramEqualizer<short>::operator()(short value) const {
    if (items_.empty()) return value;
    const auto next = std::ranges::lower_bound(items_, value, {}, &Item::value);
    if (next == items_.end()) return max_;
    std::int64_t result;
    if (next->value == value) {
        result = scaled(next->rank);
    } else {
        if (next == items_.begin()) return min_;
        const Item& previous = next[-1];
        const std::int64_t slope =
            scaled(std::int64_t{next->rank} - previous.rank) / (std::int64_t{next->value} - previous.value);
        result = scaled(previous.rank) + (std::int64_t{value} - previous.value) * slope;
    }
    return static_cast<short>(std::min<std::int64_t>(min_ + result, max_));
}

FNImage<float> imgEqualizeHistogram(const FNImage<float>& image, float min, float max, bool useBox, int x0,
                                    int y0, int x1, int y1) {
    demandRange(min, max);
    const bool allNumbers =
        std::none_of(image.data(), image.data() + image.size(), [](float v) { return v != v; });
    if (!useBox && allNumbers && image.size() <= 0xFFFFFFFFu) return equalizeByOwnRanks(image, min, max);

    const FNBox box =
        useBox ? FNBox{std::min(x0, x1), std::min(y0, y1), std::max(x0, x1), std::max(y0, y1)} : image.box();
    const HistogramEqualizer<float> equalizer(image, box, min, max);
    FNImage<float> result(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), result.getExclusive(), std::cref(equalizer));
    return result;
}

FNImage<short> imgEqualizeHistogram(const FNImage<short>& image, short min, short max) {
    demandRange(min, max);
    const auto bin = [](short value) { return static_cast<std::uint32_t>(value + 32768); };
    std::vector<std::uint64_t> counts(65536);
    for (const short pixel : std::span(image.data(), image.size())) ++counts[bin(pixel)];

    std::vector<short> mapped(65536);
    const std::uint64_t range = static_cast<std::uint64_t>(max - min);
    std::uint64_t below = 0;
    for (std::uint32_t i = 0; i < 65536; ++i) {
        const std::uint64_t upTo = below + counts[i];
        if (counts[i] != 0)
            mapped[i] =
                static_cast<short>(min + static_cast<int>(range * (below + upTo) / (2 * image.size())));
        below = upTo;
    }
    FNImage<short> result(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), result.getExclusive(),
                   [&](short pixel) { return mapped[bin(pixel)]; });
    return result;
}

#pragma once

#include "fn/image.h"

#include <random>

/// Seeded noise, so that a failure can be repeated.
class RandomImages {
public:
    explicit RandomImages(unsigned seed) : engine_(seed) {}

    int number(int low, int high) { return std::uniform_int_distribution(low, high)(engine_); }
    float real(float low, float high) { return std::uniform_real_distribution(low, high)(engine_); }

    /// One pixel in four is the least or the greatest value.
    template <class T> T pixel() {
        if constexpr (std::is_floating_point_v<T>)
            return real(0, 1);
        else if constexpr (std::is_same_v<T, bool>)
            return number(0, 1);
        else if constexpr (std::is_integral_v<T>)
            return extreme() ? (number(0, 1) ? std::numeric_limits<T>::min() : std::numeric_limits<T>::max())
                             : static_cast<T>(engine_());
        else if constexpr (std::is_same_v<T, Fn::Rgb48>)
            return {pixel<unsigned short>(), pixel<unsigned short>(), pixel<unsigned short>()};
        else
            return {pixel<unsigned char>(), pixel<unsigned char>(), pixel<unsigned char>(),
                    pixel<unsigned char>()};
    }

    template <class T> FNImage<T> image(int w, int h) {
        FNImage<T> image(static_cast<std::uint32_t>(w), static_cast<std::uint32_t>(h));
        for (FNImIter<T> it(image, image.box()); !it.atEnd(); ++it) *it = pixel<T>();
        return image;
    }

    /// A box inside of an image, with at least the given size.
    FNBox boxInside(int w, int h, int leastWidth = 1, int leastHeight = 1) {
        const int bw = number(leastWidth, w), bh = number(leastHeight, h);
        const int x = number(0, w - bw), y = number(0, h - bh);
        return {x, y, x + bw, y + bh};
    }

private:
    bool extreme() { return number(0, 3) == 0; }

    std::mt19937 engine_;
};

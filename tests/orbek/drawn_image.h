#pragma once

#include "orbek/image.h"

#include <vector>

/// An application's own image: gray or colour pixels in its own memory.
class DrawnImage final : public Orbek::ImageBody {
public:
    DrawnImage(unsigned int w, unsigned int h, std::vector<unsigned char> gray)
        : w_(w), h_(h), gray_(std::move(gray)) {}
    DrawnImage(unsigned int w, unsigned int h, std::vector<Orbek::Rgb> color)
        : w_(w), h_(h), color_(std::move(color)) {}

    bool isColor() const override { return !color_.empty(); }
    unsigned int width() const override { return w_; }
    unsigned int height() const override { return h_; }
    const unsigned char* grayScaleRepresentation() const override { return gray_.data(); }
    const Orbek::Rgb* colorRepresentation() const override { return color_.data(); }
    std::string name() const override { return "drawn"; }

private:
    unsigned int w_, h_;
    std::vector<unsigned char> gray_;
    std::vector<Orbek::Rgb> color_;
};

/// Gray pixels that all differ from their neighbours.
inline Orbek::Image grayPattern(unsigned int w, unsigned int h) {
    std::vector<unsigned char> pixels(std::size_t{w} * h);
    for (std::size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<unsigned char>(i * 37 + i / w);
    return Orbek::Image(new DrawnImage(w, h, pixels));
}

inline Orbek::Image colorPattern(unsigned int w, unsigned int h) {
    std::vector<Orbek::Rgb> pixels(std::size_t{w} * h);
    for (std::size_t i = 0; i < pixels.size(); ++i)
        pixels[i] = {static_cast<unsigned char>(i * 37), static_cast<unsigned char>(i * 11 + 5),
                     static_cast<unsigned char>(i * 91), static_cast<unsigned char>(255 - i)};
    return Orbek::Image(new DrawnImage(w, h, pixels));
}

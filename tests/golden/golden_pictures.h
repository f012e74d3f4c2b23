#pragma once

#include "golden_facts.h"
#include "orbek/configuration.h"
#include "orbek/image_io.h"

#include <array>
#include <functional>
#include <sstream>
#include <vector>

/// A picture in the memory of this test, to paint on.
class Painting final : public Orbek::ImageBody {
public:
    Painting(unsigned int w, unsigned int h, Orbek::Rgb color)
        : w_(w), h_(h), pixels_(std::size_t{w} * h, color) {
        makeGray();
    }
    explicit Painting(const Orbek::Image& image) : w_(image->width()), h_(image->height()) {
        pixels_.assign(image->colorRepresentation(), image->colorRepresentation() + std::size_t{w_} * h_);
        makeGray();
    }

    bool isColor() const override { return true; }
    unsigned int width() const override { return w_; }
    unsigned int height() const override { return h_; }
    const unsigned char* grayScaleRepresentation() const override { return gray_.data(); }
    const Orbek::Rgb* colorRepresentation() const override { return pixels_.data(); }
    std::string name() const override { return "painting"; }

    /// @param change of a pixel at x and y
    void paint(const std::function<void(int x, int y, Orbek::Rgb& pixel)>& change) {
        for (unsigned int y = 0; y < h_; ++y)
            for (unsigned int x = 0; x < w_; ++x)
                change(static_cast<int>(x), static_cast<int>(y), pixels_[std::size_t{y} * w_ + x]);
        makeGray();
    }
    /// Puts a picture, scaled by nearest pixels, where its upper left corner is given.
    void place(const Orbek::Image& picture, int left, int top, double scale) {
        const auto w = static_cast<int>(picture->width() * scale),
                   h = static_cast<int>(picture->height() * scale);
        const Orbek::Rgb* const from = picture->colorRepresentation();
        paint([&](int x, int y, Orbek::Rgb& pixel) {
            if (x < left || y < top || x >= left + w || y >= top + h) return;
            const auto column = static_cast<std::size_t>((x - left + 0.5) / scale);
            const auto row = static_cast<std::size_t>((y - top + 0.5) / scale);
            pixel = from[row * picture->width() + column];
        });
    }

private:
    void makeGray() {
        gray_.clear();
        for (const Orbek::Rgb& p : pixels_)
            gray_.push_back(static_cast<unsigned char>((29 * p.blue + 150 * p.green + 77 * p.red) >> 8));
    }

    unsigned int w_, h_;
    std::vector<Orbek::Rgb> pixels_;
    std::vector<unsigned char> gray_;
};

/// The configuration of the built tree, with further lines.
inline Orbek::Configuration configured(const std::string& more = {}) {
    std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n" + more);
    return Orbek::Configuration(text);
}

/// Drawn people, see README.md.
inline constexpr std::array drawnPeople{"plain", "open", "turned", "closed", "lit", "tilted"};

inline Orbek::Image drawnPerson(const std::string& name) {
    return Orbek::Jpeg::load((goldenFolder() / "pictures" / (name + ".jpg")).string());
}

/// All faces, large and small.
inline Orbek::Image groupPicture() {
    auto* const group = new Painting(640, 480, {90, 120, 100, 255});
    group->paint([](int x, int y, Orbek::Rgb& pixel) {
        pixel.green = static_cast<unsigned char>(60 + (x * 7 + y * 13 + x * y / 64) % 120);
    });
    const Orbek::Image image(group);
    constexpr std::array<double, 6> scales{0.75, 0.5, 0.4, 0.3, 0.2, 0.125};
    constexpr std::array<std::array<int, 2>, 6> places{
        {{10, 20}, {270, 10}, {480, 30}, {280, 300}, {420, 330}, {530, 370}}};
    for (std::size_t i = 0; i < drawnPeople.size(); ++i)
        group->place(drawnPerson(drawnPeople[i]), places[i][0], places[i][1], scales[i]);
    return image;
}

#pragma once

#include "synth/portrait_model.h"

#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <vector>

/// What a sample portrait shows: who, and how.

namespace Synth {

using Random = std::mt19937_64;

/// Red, green and blue, 0..255 or a factor.
struct Colour {
    float r, g, b;

    friend Colour operator*(Colour c, float f) { return {c.r * f, c.g * f, c.b * f}; }
    friend Colour operator+(Colour c, Colour d) { return {c.r + d.r, c.g + d.g, c.b + d.b}; }
    friend Colour mix(Colour c, Colour d, float share) { return c * (1 - share) + d * share; }
};

enum class HairCut { shortCut, sidePart, bob, longHair };
enum class Neckline { round, vNeck, collar };

/// What stays the same in all pictures of a person.
struct Person {
    std::string name;
    bool woman;
    std::vector<float> identity; ///< standard deviations along the model's ways to differ
    HairCut cut;
    Colour hair;
    float hairline;        ///< height of the hairline above the eyes, as share of the forehead's
    float hairVolume;      ///< how far the hair stands off the skull, eye distances
    float part;            ///< where the hair is parted, -1 (image-left temple) to 1
    std::uint32_t strands; ///< seed of the pattern of the hair
};

/// Somebody who does not exist. The same arguments always give the same person.
/// @param spread how far from the mean face, in usual deviations
Person makePerson(const PortraitModel& model, const std::string& name, bool woman, std::uint64_t seed,
                  float spread);

/// What changes from picture to picture.
struct View {
    Controls controls{};
    float roll = 0; ///< of the head, radians, clockwise
    Colour background{};
    Colour cloth{};
    Neckline neckline = Neckline::round;
    std::uint32_t grain = 0; ///< seed of the picture's noise
};

/// Values that are to be so instead of drawn.
struct ViewWishes {
    std::optional<float> yaw, pitch, smile, mouthOpen, eyesOpen, lightSide, lightAbove; ///< as in Controls
    std::optional<float> roll;                                                          ///< degrees
    std::optional<Colour> background;
};

View drawView(const ViewWishes& wishes, Random& random);

} // namespace Synth

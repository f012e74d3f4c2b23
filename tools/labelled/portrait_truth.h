#pragma once

#include "fn/image.h"
#include "labelled/labels.h"

#include <array>
#include <optional>

/// What labels tell about a portrait, straight or through the geometry of its 68 points.
///
/// Left and right are those of the image; "eye distances" are those of the eyes given or labelled.

namespace Labelled {

enum class Side { left, right };

class Points68 {
public:
    /// Nothing for a row without them.
    static std::optional<Points68> of(const Row& row);

    /// Gap between the inner lips, eye distances.
    float lipGap() const;
    /// Height of the lids' opening over the width of the eye.
    float eyeOpening(Side side) const;
    /// About how far the head is turned, degrees; positive when the nose points to the image's right. It is
    /// told by where the nose lies between the ears, and calibrated on faces with labelled poses.
    float yaw() const;
    /// How far the iris lies beside the middle of the eye, in widths of the eye, positive to the image's
    /// right; nothing if the eye is nearly closed or too small to see it. It is the darkest disc there.
    std::optional<float> irisOffset(const FNImage<float>& image, Side side) const;

    /// Extent of the head from the middle of these eyes, in their distances: where the jaw line ends below
    /// and at both sides.
    struct Extent {
        float chin, left, right;
    };
    Extent extent(FNPos leftEye, FNPos rightEye) const;

    FNPos operator[](std::size_t i) const { return points_[i]; }

private:
    float eyeDistance() const;
    FNPos mean(std::size_t first, std::size_t count) const;

    std::array<FNPos, 68> points_;
};

/// Whether the light comes from the front, up to 25 degrees to a side, or from more than 45 degrees; nothing
/// in between, for light from high above or below, and if it is unknown.
std::optional<bool> frontalLight(const Row& row);

/// Years, the middle of a range where only that is known.
std::optional<double> ageOf(const Row& row);

enum class Ethnicity { white, black, asian, other };
/// East and South-East Asians are asian; nothing if it is unknown.
std::optional<Ethnicity> ethnicityOf(const Row& row);

} // namespace Labelled

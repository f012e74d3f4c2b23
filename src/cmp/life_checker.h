#pragma once

#include "eye/facial_feature_location.h"
#include "fn/image.h"

#include <bit>
#include <vector>

/// The number of bits in which two bytes differ.
constexpr int FNHammingDistance(unsigned char a, unsigned char b) {
    return std::popcount(static_cast<unsigned char>(a ^ b));
}

namespace Cmp {

/// Tells a living face from a flat picture of one, by two images of it.
///
/// A picture that is moved before the camera changes by a plane transform. If one of a set of planes, turned
/// a little about each axis and scaled, explains the change, the face counts as flat; if none does, it has
/// moved in depth. Images are compared by the Hamming distance of census transforms (R. Zabih, J. Woodfill,
/// 1994), so that light makes little difference.
///
/// The test cuts a small face out of the one image, with the eyes in standard places, and looks there for a
/// template out of the other image, seen as each of the planes shows it.
///
/// Has no state of a call; may be used by any number of threads.
class LifeChecker {
public:
    struct Settings {
        int width = 14; ///< of the standard face, pixels
        int height = 14;
        double relEyeDist = 1.2; ///< of the standard face, in its widths
        double relUp = 0.1;      ///< of the eyes, in its heights from above
        int templateWidth = 12;  ///< pixels, at most those of the standard face
        int templateHeight = 12;
        float focalLength = 0; ///< of the camera, pixels; 0 for 10 times the width of the second image
        int threshold = 50;    ///< sums of distances below it count as the same
        unsigned char lossThreshold = 2;   ///< bits of each pixel's distance that do not count
        float translationThreshold = 0.8f; ///< of the eyes' middle, in eye distances; beyond, nothing is told
        float scaleThreshold = 1.2f;       ///< of the eyes' distance, as a factor either way; likewise
    };

    /// @throws FNEBadArg for a template that is empty or larger than the standard face
    explicit LifeChecker(const Settings& settings);

    /// Whether the face has moved in depth between two images.
    template <class T>
    bool test(const FNImage<T>& image0, const FacialFeatureLocation& left0,
              const FacialFeatureLocation& right0, const FNImage<T>& image1,
              const FacialFeatureLocation& left1, const FacialFeatureLocation& right1) const;

private:
    using Census = FNImage<unsigned char>;

    struct Eyes {
        FNPos left, right;
        float distance() const { return length(right - left); }
        FNPos middle() const { return (left + right) / 2; }
    };
    /// An image in which the eyes have a given distance.
    struct Scaled {
        FNImage<float> image;
        Eyes eyes;
    };

    bool comparable(const Eyes& eyes0, const Eyes& eyes1) const;
    template <class T> Scaled scaled(const FNImage<T>& image, const Eyes& eyes, float factor) const;
    std::vector<Census> standardWindows(const Scaled& face) const;
    Census planeTemplate(const Scaled& face, const Eyes& eyesOfTemplate, double horizontalAngle,
                         double verticalAngle, double focalLength) const;
    bool explained(const std::vector<Census>& windows, const Census& plane) const;

    Settings settings_;
    float eyeDistance_; ///< of the standard face, pixels
    Eyes standardEyes_; ///< pixels of the standard face
    Eyes templateEyes_; ///< pixels of the template, which is the middle of the standard face
    FNPos templateSize_, templateCentre_;
};

} // namespace Cmp

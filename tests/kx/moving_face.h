#pragma once

#include "eye/eyes_finder.h"
#include "fn/image_reference.h"

#include <cmath>

/// A drawn face that moves before a camera, and finders that know where its eyes are.
namespace Kx::MovingFace {

constexpr FNPos leftEye{24, 28}, rightEye{48, 28};

/// Structure of some five pixels, without repetition within a face.
inline double paint(double x, double y) {
    return 128 + 40 * std::sin(1.1 * x + 0.31 * y) + 40 * std::sin(0.37 * x - 0.93 * y + 1) +
           30 * std::sin(0.071 * x * y / 8 + 0.6 * x);
}

/// The face as the camera sees it.
/// @param turn moves what lies before the plane of the eyes, most of all the nose, by so many pixels: what no
///        plane does
/// @param tilt leans a plane picture back
inline FNImage<unsigned char> seen(double turn, double tilt = 0, double light = 1) {
    FNImage<unsigned char> image(72, 80);
    unsigned char* out = image.getExclusive();
    for (int y = 0; y < 80; ++y)
        for (int x = 0; x < 72; ++x) {
            const double dx = x + 0.5 - 36, dy = y + 0.5 - 28; // from the middle of the eyes
            const auto bump = [](double x_, double y_) { return std::exp(-(x_ * x_ + y_ * y_) / 30); };
            const double relief = bump(dx, dy - 12) - bump(dx - 8, dy - 6) - bump(dx + 8, dy - 6);
            const double depth = 1 + tilt * dy;
            *out++ = static_cast<unsigned char>(
                std::clamp(light * paint(dx / depth + turn * relief, dy / depth), 0.0, 255.0));
        }
    return image;
}

inline FNImageReference picture(double turn, double tilt = 0) {
    return FNImageReferenceFactory::create(seen(turn, tilt));
}

class Faces final : public FaceFinder::Body {
public:
    bool find(const FNImageReference&, std::list<FaceFinder::Location>& locations, double, double,
              const FNBox&) const override {
        locations = {FaceFinder::Location{}};
        return true;
    }
    std::string processingId() const override { return {}; }
};

class Eyes final : public EyesFinder::Body {
public:
    void find(const FaceFinder::Location&, const FNImageReference&, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const override {
        foundFirst = foundSecond = true;
        first.pos = leftEye;
        second.pos = rightEye;
    }
    void find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&, bool&,
              FacialFeatureLocation&, bool&, FacialFeatureLocation&) const override {}
    std::string processingId() const override { return {}; }
};

inline FaceFinder faceFinder() {
    return FaceFinder(FNCountedPtr<FaceFinder::Body>(new Faces));
}
inline EyesFinder eyesFinder() {
    return EyesFinder(FNCountedPtr<EyesFinder::Body>(new Eyes));
}

} // namespace Kx::MovingFace

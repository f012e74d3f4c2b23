#include "cmp/life_checker.h"

#include "fn/exception.h"
#include "fn/vector3.h"
#include "img/affine/perspective.h"
#include "img/affine/transform.h"
#include "img/local_filters.h"

#include <array>

namespace Cmp {

namespace {

/// Eyes that are nearer to each other show nothing, pixels.
constexpr float leastEyeDistance = 4;

/// Values around a middle, in equal steps.
struct Range {
    double middle;
    double halfWidth;
    int count;

    template <class Visit> bool any(Visit visit) const {
        const double step = count > 1 ? 2 * halfWidth / (count - 1) : 0;
        for (int i = 0; i < count; ++i)
            if (visit(middle - (count > 1 ? halfWidth : 0) + i * step)) return true;
        return false;
    }
};

// The planes that are tried; angles in radians. A picture that a hand holds keeps within.
constexpr Range horizontalAngles{0, 0.3, 3}, verticalAngles{0, 0.3, 3}, rolls{0, 0.1, 3}, scales{1, 0.1, 3};

/// Turns and scales the plane about a point, such that one vector becomes another one.
class Similarity {
public:
    Similarity(FNPos from, FNPos fromVector, FNPos to, FNPos toVector)
        : from_(from), to_(to), cos_(dot(fromVector, toVector) / dot(fromVector, fromVector)),
          sin_((fromVector.x * toVector.y - fromVector.y * toVector.x) / dot(fromVector, fromVector)) {}

    FNPos operator()(FNPos p) const {
        const FNPos d = p - from_;
        return to_ + FNPos(cos_ * d.x - sin_ * d.y, sin_ * d.x + cos_ * d.y);
    }

private:
    FNPos from_, to_;
    float cos_, sin_;
};

std::uint32_t scaledSide(float factor, std::uint32_t side) {
    return std::max(static_cast<std::uint32_t>(factor * static_cast<float>(side) + 0.5f), 1u);
}

/// The middle of the range of a byte's value, which has 256 steps from 0 to 1.
FNImage<float> toUnitRange(const FNImage<unsigned char>& image) {
    FNImage<float> result(image.w(), image.h());
    float* const out = result.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        std::transform(image.row(y), image.row(y) + image.w(), out + std::size_t{y} * image.w(),
                       [](unsigned char v) { return static_cast<float>(v) / 256 + 1.0f / 512; });
    return result;
}

FNImage<unsigned char> census(const FNImage<float>& image) {
    return imgCensusTransform3x3(
        image, FNBox{0, 0, static_cast<std::int32_t>(image.w()), static_cast<std::int32_t>(image.h())});
}

FNImage<unsigned char> part(const FNImage<unsigned char>& image, std::uint32_t x0, std::uint32_t y0,
                            std::uint32_t w, std::uint32_t h) {
    FNImage<unsigned char> result(w, h);
    unsigned char* const out = result.getExclusive();
    for (std::uint32_t y = 0; y < h; ++y) std::copy_n(image.row(y0 + y) + x0, w, out + std::size_t{y} * w);
    return result;
}

/// The sum over all pixels of the bits by which the distance exceeds `free`.
int hammingDistance(const FNImage<unsigned char>& a, const FNImage<unsigned char>& b, int free) {
    if (a.w() != b.w() || a.h() != b.h()) FN_THROW(FNEBadArg, "CmpDistHamming: incompatible image sizes");
    int sum = 0;
    for (std::uint32_t y = 0; y < a.h(); ++y)
        for (std::uint32_t x = 0; x < a.w(); ++x)
            sum += std::max(FNHammingDistance(a.row(y)[x], b.row(y)[x]) - free, 0);
    return sum;
}

} // namespace

LifeChecker::LifeChecker(const Settings& settings)
    : settings_(settings), eyeDistance_(static_cast<float>(settings.width * settings.relEyeDist)),
      templateSize_(static_cast<float>(settings.templateWidth), static_cast<float>(settings.templateHeight)),
      templateCentre_(templateSize_ / 2) {
    if (settings.width < settings.templateWidth || settings.height < settings.templateHeight)
        FN_THROW(FNEBadArg, "CensusDisparity: standard face dim(s) smaller than template dim(s)");
    if (settings.templateWidth < 1 || settings.templateHeight < 1)
        FN_THROW(FNEBadArg, "CensusDisparity: template without pixels");
    const FNPos size(static_cast<float>(settings.width), static_cast<float>(settings.height));
    const FNPos left((size.x - eyeDistance_) / 2, static_cast<float>(settings.height * settings.relUp));
    standardEyes_ = {left, left + FNPos(eyeDistance_, 0)};
    const FNPos margin = (size - templateSize_) / 2;
    templateEyes_ = {standardEyes_.left - margin, standardEyes_.right - margin};
}

bool LifeChecker::comparable(const Eyes& eyes0, const Eyes& eyes1) const {
    const float d0 = eyes0.distance(), d1 = eyes1.distance();
    // Written such that what is no number is not comparable.
    if (!(d0 >= leastEyeDistance && d1 >= leastEyeDistance)) return false;
    if (!(length(eyes1.middle() - eyes0.middle()) / std::sqrt(d0 * d1) <= settings_.translationThreshold))
        return false;
    return d0 / d1 <= settings_.scaleThreshold && d0 / d1 >= 1 / settings_.scaleThreshold;
}

template <class T>
LifeChecker::Scaled LifeChecker::scaled(const FNImage<T>& image, const Eyes& eyes, float factor) const {
    FNImage<float> result(scaledSide(factor, image.w()), scaledSide(factor, image.h()));
    const Img::Affine::Mapping toResult = Img::Affine::transform(toUnitRange(image), result).inverse();
    return {result, {toResult(eyes.left), toResult(eyes.right)}};
}

std::vector<LifeChecker::Census> LifeChecker::standardWindows(const Scaled& face) const {
    const Similarity toFace(standardEyes_.left, standardEyes_.right - standardEyes_.left, face.eyes.left,
                            face.eyes.right - face.eyes.left);
    FNImage<float> standard(static_cast<std::uint32_t>(settings_.width),
                            static_cast<std::uint32_t>(settings_.height));
    const FNPos origin = toFace({});
    Img::Affine::transform(face.image, standard, origin,
                           toFace({static_cast<float>(settings_.width), 0}) - origin,
                           toFace({0, static_cast<float>(settings_.height)}) - origin, true, 0.0f);
    const Census all = census(standard);
    const auto dx = static_cast<std::uint32_t>(settings_.width - settings_.templateWidth),
               dy = static_cast<std::uint32_t>(settings_.height - settings_.templateHeight);
    std::vector<Census> windows;
    for (std::uint32_t y = 0; y <= dy; ++y)
        for (std::uint32_t x = 0; x <= dx; ++x)
            windows.push_back(part(all, x, y, all.w() - dx, all.h() - dy));
    return windows;
}

LifeChecker::Census LifeChecker::planeTemplate(const Scaled& face, const Eyes& eyesOfTemplate,
                                               double horizontalAngle, double verticalAngle,
                                               double focalLength) const {
    const double cosH = std::cos(horizontalAngle), sinH = std::sin(horizontalAngle);
    const double cosV = std::cos(verticalAngle), sinV = std::sin(verticalAngle);
    // Turned about the vertical and then about the horizontal axis through the template's centre; the camera
    // looks along z from a distance of its focal length, so that the plane keeps its size at the centre.
    const auto project = [&](FNPos p) {
        const FN2Vector<double> d(p - templateCentre_);
        const FN3Vector<double> turned{d.x * cosH, d.y, d.x * sinH};
        const double y = turned.y * cosV - turned.z * sinV, z = turned.y * sinV + turned.z * cosV;
        return FNPos(FN2Vector<double>(turned.x, y) * (focalLength / (focalLength + z)));
    };
    // However the plane lies, its eyes are those of the face.
    const FNPos left = project(eyesOfTemplate.left), right = project(eyesOfTemplate.right);
    const Similarity toFace(left, right - left, face.eyes.left, face.eyes.right - face.eyes.left);

    const FNPos corners[4] = {{}, {templateSize_.x, 0}, templateSize_, {0, templateSize_.y}};
    FNPos quad[4];
    std::ranges::transform(corners, quad, [&](FNPos corner) { return toFace(project(corner)); });
    FNImage<float> result(static_cast<std::uint32_t>(settings_.templateWidth),
                          static_cast<std::uint32_t>(settings_.templateHeight));
    imgMapQuadToQuad(face.image, result, quad, corners);
    return census(result);
}

bool LifeChecker::explained(const std::vector<Census>& windows, const Census& plane) const {
    return std::ranges::any_of(windows, [&](const Census& window) {
        return hammingDistance(window, plane, settings_.lossThreshold) < settings_.threshold;
    });
}

template <class T>
bool LifeChecker::test(const FNImage<T>& image0, const FacialFeatureLocation& left0,
                       const FacialFeatureLocation& right0, const FNImage<T>& image1,
                       const FacialFeatureLocation& left1, const FacialFeatureLocation& right1) const {
    const Eyes eyes0{left0.pos, right0.pos}, eyes1{left1.pos, right1.pos};
    if (!comparable(eyes0, eyes1)) return false;
    const double focalLength =
        settings_.focalLength > 0 ? settings_.focalLength : 10.0 * static_cast<double>(image1.w());
    const std::vector<Census> windows =
        standardWindows(scaled(image0, eyes0, eyeDistance_ / eyes0.distance()));

    const bool flat = scales.any([&](double scale) {
        const auto s = static_cast<float>(scale);
        const Scaled face = scaled(image1, eyes1, s * eyeDistance_ / eyes1.distance());
        return rolls.any([&](double roll) {
            const FNPos turn(s * static_cast<float>(std::cos(roll)), s * static_cast<float>(std::sin(roll)));
            const Similarity turned(templateCentre_, {1, 0}, templateCentre_, turn);
            const Eyes eyes{turned(templateEyes_.left), turned(templateEyes_.right)};
            return horizontalAngles.any([&](double h) {
                return verticalAngles.any([&](double v) {
                    return explained(windows, planeTemplate(face, eyes, h, v, focalLength));
                });
            });
        });
    });
    return !flat;
}

template bool LifeChecker::test(const FNImage<unsigned char>&, const FacialFeatureLocation&,
                                const FacialFeatureLocation&, const FNImage<unsigned char>&,
                                const FacialFeatureLocation&, const FacialFeatureLocation&) const;

} // namespace Cmp

#include "synth/portrait.h"

#include "fn/exception.h"
#include "synth/painting.h"

#include <algorithm>
#include <cmath>

namespace Synth {
namespace {

/// The mean over a small window, as often as wanted.
FNImage<float> blurred(FNImage<float> image, int times) {
    for (int round = 0; round < times; ++round) {
        FNImage<float> result(image.w(), image.h());
        float* out = result.getExclusive();
        for (std::uint32_t y = 0; y < image.h(); ++y)
            for (std::uint32_t x = 0; x < image.w(); ++x) {
                float sum = 0;
                for (int dy = -1; dy <= 1; ++dy)
                    for (int dx = -1; dx <= 1; ++dx)
                        sum += image(static_cast<std::uint32_t>(std::clamp<int>(
                                         static_cast<int>(x) + dx, 0, static_cast<int>(image.w()) - 1)),
                                     static_cast<std::uint32_t>(std::clamp<int>(
                                         static_cast<int>(y) + dy, 0, static_cast<int>(image.h()) - 1)));
                *out++ = sum / 9;
            }
        image = result;
    }
    return image;
}

/// Gives back what the linear combination of many faces takes from the finest detail.
void sharpen(FNImage<float>& y) {
    constexpr float amount = 1.0f;
    const FNImage<float> smooth = blurred(y, 2);
    float* const out = y.getExclusive();
    for (std::size_t i = 0; i < y.size(); ++i) out[i] += amount * (out[i] - smooth.data()[i]);
}

/// Paints one portrait, layer over layer: background, hair behind, neck, clothes, ears, face, hair before.
///
/// Places are told in eye distances: `head` right of and above the middle of the eyes, tilted with the head;
/// `body` right of and below where the eyes of an upright head are. Those of a picture are pixels.
/// Proportions and shades are set by eye.
class Painter {
public:
    Painter(const PortraitModel& model, const Person& person, const View& view, std::uint32_t width);
    Portrait paint();

private:
    Colour backdrop(FNPos p) const;
    Colour neck(FNPos body) const;
    float neckCover(FNPos body) const;
    float clothCover(FNPos body) const;
    Colour cloth(FNPos body) const;
    Colour skin(FNPos head) const;
    Colour strand(FNPos head, float shade) const;
    float hairBefore(FNPos head) const;
    float hairOutside(FNPos head) const;
    float skull(FNPos head) const;
    float opening(FNPos head) const;
    float strandNumber(FNPos head) const;
    Colour faceAt(FNPos p, float inside) const;
    float light(float x) const {
        return 1 - 0.07f * view_.controls[lightSide] * std::clamp(x / 1.1f, -1.3f, 1.3f);
    }
    FNPos body(FNPos p) const { return {(p.x - middle_.x) / unit_, (p.y - middle_.y) / unit_}; }
    void drawFace(const Texture& texture, const Points& frameMesh);

    const Person& person_;
    const View& view_;
    std::uint32_t w_, h_;
    float unit_;   ///< eye distance, pixels
    FNPos middle_; ///< where the eyes would be if the head were straight
    Points mesh_, outline_;
    std::vector<Triangle> triangles_;
    std::vector<Colour> face_; ///< of every pixel that the mesh covers
    Colour cheek_[2];
    bool covers_;                                ///< whether the hair covers the ears
    float centre_, halfWidth_, chin_, forehead_; ///< of the head, eye distances from the middle of the eyes
    std::optional<HeadAxes> head_;
};

Painter::Painter(const PortraitModel& model, const Person& person, const View& view, std::uint32_t width)
    : person_(person), view_(view), w_(width), h_(width * 4 / 3),
      unit_(static_cast<float>(width) * 0.25f), middle_{static_cast<float>(width) * 0.5f,
                                                        static_cast<float>(width) * 0.58f},
      triangles_(model.frame().triangles()) {
    PortraitModel::Face face = model.face(view.controls, person.identity);
    sharpen(face.texture.y);
    const HeadAxes inFrame(face.landmarks);
    const float modelUnit =
        HeadAxes(std::span<const FNPos>(model.frame().mesh()).first(landmarkCount)).eyeDistance();
    const float jaw = (inFrame.local(face.landmarks[0]).x + inFrame.local(face.landmarks[16]).x) / 2;
    const FNPos pivot{0, 2.3f}; // the neck, below the eyes
    Points landmarks;
    for (const FNPos p : face.landmarks) {
        FNPos local = inFrame.local(p) * (inFrame.eyeDistance() / modelUnit);
        local = FNPos{local.x - jaw, -local.y} - pivot;
        const float c = std::cos(view.roll), s = std::sin(view.roll);
        landmarks.push_back(middle_ +
                            (FNPos{c * local.x - s * local.y, s * local.x + c * local.y} + pivot) * unit_);
    }
    mesh_ = withForehead(landmarks);
    outline_ = smoothed(outline(mesh_));
    head_.emplace(landmarks);
    const FNPos left = head_->local(landmarks[0]), right = head_->local(landmarks[16]);
    centre_ = (left.x + right.x) / 2;
    halfWidth_ = (right.x - left.x) / 2;
    chin_ = head_->local(landmarks[8]).y;
    forehead_ = head_->local(mesh_[landmarkCount + (mesh_.size() - landmarkCount) / 2]).y;
    covers_ = person.cut == HairCut::longHair || person.cut == HairCut::bob;
    drawFace(face.texture, model.frame().mesh());
}

void Painter::drawFace(const Texture& texture, const Points& frameMesh) {
    face_.resize(std::size_t{w_} * h_);
    Colour sum[2] = {{0, 0, 0}, {0, 0, 0}};
    float count[2] = {0, 0};
    forEachPixel(
        triangles_, mesh_, frameMesh, {0, 0, static_cast<std::int32_t>(w_), static_cast<std::int32_t>(h_)},
        [&](FNGridPos at, FNPos from) {
            const float y = bilinear(texture.y, from);
            const float cb = bilinear(texture.cb, from * 0.5f) - 128;
            const float cr = bilinear(texture.cr, from * 0.5f) - 128;
            const std::size_t i = static_cast<std::size_t>(at.y) * w_ + static_cast<std::size_t>(at.x);
            face_[i] = {y + 1.402f * cr, y - 0.344f * cb - 0.714f * cr, y + 1.772f * cb};
            const FNPos local = head_->local(FNPos(at));
            if (local.y > -1.0f && local.y < -0.4f && std::abs(local.x - centre_) > 0.4f &&
                std::abs(local.x - centre_) < 0.75f) {
                const int side = local.x > centre_;
                sum[side] = sum[side] + face_[i];
                count[side] += 1;
            }
        });
    for (int side = 0; side < 2; ++side) cheek_[side] = sum[side] * (1 / std::max(1.0f, count[side]));
}

Colour Painter::backdrop(FNPos p) const {
    const FNPos b = body(p);
    const float glow = 1.06f - 0.05f * (b.x * b.x / 4 + (b.y - 0.4f) * (b.y - 0.4f) / 6);
    return view_.background * (glow * (1 - 0.02f * view_.controls[lightSide] * b.x)) +
           Colour{1, 1, 1} * (1.5f * noise(b.x * 1.3f, b.y * 1.3f, view_.grain));
}

/// Skin between and around the cheeks, darker where the surface turns away.
Colour Painter::skin(FNPos head) const {
    const float x = head.x - centre_;
    const Colour between = mix(cheek_[0], cheek_[1], std::clamp(x / 1.2f + 0.5f, 0.0f, 1.0f));
    return between * (1.0f - 0.3f * smoothStep(0.55f, 1.25f, std::abs(x) / halfWidth_));
}

/// The face, whose rim, where photos show other things too, is continued from further inside.
Colour Painter::faceAt(FNPos p, float inside) const {
    constexpr float rim = 0.13f;
    FNPos from = p;
    if (inside < rim) {
        const FNPos middle = head_->picture({centre_, -0.35f});
        from += (middle - p) * ((rim - inside) * unit_ / std::max(1.0f, length(middle - p)));
    }
    const auto x = static_cast<std::size_t>(std::clamp(from.x, 0.0f, static_cast<float>(w_ - 1)));
    const auto y = static_cast<std::size_t>(std::clamp(from.y, 0.0f, static_cast<float>(h_ - 1)));
    return face_[y * w_ + x] * (1 - 0.16f * smoothStep(0.12f, 0, inside));
}

float Painter::neckCover(FNPos b) const {
    const float half = (person_.woman ? 0.56f : 0.63f) * halfWidth_ + 0.22f * smoothStep(1.9f, 2.7f, b.y) +
                       1.2f * smoothStep(2.3f, 3.4f, b.y);
    return b.y < 0.5f ? 0 : smoothStep(half + 0.012f, half - 0.012f, std::abs(b.x));
}

Colour Painter::neck(FNPos b) const {
    const float half = (person_.woman ? 0.56f : 0.63f) * halfWidth_;
    const Colour between = mix(cheek_[0], cheek_[1], std::clamp(b.x / 1.4f + 0.5f, 0.0f, 1.0f));
    const float round = 1 - 0.3f * std::pow(std::min(1.0f, std::abs(b.x) / (half + 0.1f)), 2.5f);
    const float shadow = 1 - 0.28f * smoothStep(0.65f, 0.0f, b.y + chin_ + 0.12f * b.x * b.x);
    // Tendons and the notch between the collar bones.
    const float relief = 0.035f * noise(b.x * 2.2f, b.y * 0.8f, person_.strands) -
                         0.08f * std::exp(-(b.x * b.x) / 0.02f - (b.y - 2.72f) * (b.y - 2.72f) / 0.03f);
    return between * (0.95f * round * shadow * (1 + relief));
}

float Painter::clothCover(FNPos b) const {
    const float wide = person_.woman ? 1.28f : 1.5f;
    const float t = std::max(0.0f, std::abs(b.x) - 0.5f) / wide;
    const float shoulder = 2.24f + 0.3f * t + 0.42f * t * t * t + (t > 1 ? 2 * (t - 1) * (t - 1) : 0.0f);
    float edge = b.y - shoulder;
    const float x = std::abs(b.x);
    switch (view_.neckline) {
    case Neckline::round:
        edge = std::min(edge, std::hypot(x / 0.82f, (b.y - 2.1f) / 0.62f) * 0.6f - 0.6f);
        break;
    case Neckline::vNeck:
        edge = std::min(edge, (x + 0.62f * (b.y - 3.15f)) * 0.85f);
        break;
    case Neckline::collar:
        edge = std::min(edge, (x + 0.75f * (b.y - 2.82f)) * 0.8f);
        break;
    }
    return smoothStep(-0.012f, 0.012f, edge);
}

Colour Painter::cloth(FNPos b) const {
    const float x = std::abs(b.x);
    const float folds = 0.07f * noise(b.x * 1.7f + 0.5f * b.y, b.y * 1.1f, view_.grain + 1) +
                        0.04f * noise(b.x * 4 - b.y, b.y * 2.5f + b.x, view_.grain + 2);
    const float weave = 0.025f * noise(b.x * 60, b.y * 60, view_.grain + 3);
    float shade = 0.98f - 0.16f * smoothStep(0.6f, 2.1f, x) + folds + weave;
    const auto seam = [&](float distance) { // an edge that is sewn, and what it throws a shadow on
        shade *= 1 - 0.16f * smoothStep(0.03f, 0.0f, std::abs(distance - 0.13f)) +
                 0.06f * smoothStep(0.13f, 0.11f, distance);
    };
    switch (view_.neckline) {
    case Neckline::round:
        seam(std::hypot(x / 0.82f, (b.y - 2.1f) / 0.62f) * 0.6f - 0.6f);
        break;
    case Neckline::vNeck:
        seam((x + 0.62f * (b.y - 3.15f)) * 0.85f);
        break;
    case Neckline::collar: {
        const float outer = (x + 0.75f * (b.y - 2.82f)) * 0.8f - 0.3f + 0.25f * smoothStep(2.6f, 3.0f, b.y);
        shade *= 1 + 0.1f * smoothStep(0.02f, -0.02f, outer) -
                 0.3f * std::exp(-outer * outer / 0.002f) * (outer > 0 ? 1 : 0);
        break;
    }
    }
    return view_.cloth * (shade * light(b.x));
}

/// 1 where hair ends at the outside, 0 at the middle of the head: a squared ellipse above the eyes; below
/// them hair hangs down.
float Painter::skull(FNPos p) const {
    constexpr float power = 2.3f;
    const float top = 1.46f + person_.hairVolume, far = std::abs(p.x - centre_);
    float half = halfWidth_ + (covers_ ? person_.hairVolume : 0.07f);
    if (p.y > 0) return std::pow(std::pow(far / half, power) + std::pow(p.y / top, power), 1 / power);
    if (covers_)
        half += 0.05f * std::sin(p.y * 2.5f + static_cast<float>(person_.strands % 7)) *
                    smoothStep(0, -0.6f, p.y) +
                0.12f * smoothStep(0, -2, p.y);
    return far / half;
}

/// 1 at the hairline, less on the face: the hairline falls from the parting to the temples.
float Painter::opening(FNPos p) const {
    constexpr float power = 2.5f;
    const float x = p.x - centre_, across = x / halfWidth_;
    float line = person_.hairline * forehead_;
    const float off = across - person_.part;
    if (covers_) line *= 1.1f - 0.24f * off * off;
    if (person_.cut == HairCut::sidePart) line *= 1.08f - 0.14f * off * off;
    const float half = halfWidth_ * (covers_ ? 0.97f - 0.1f * smoothStep(0, -1.6f, p.y) : 0.98f);
    return p.y > 0 ? std::pow(std::pow(std::abs(x) / half, power) + std::pow(p.y / line, power), 1 / power)
                   : std::abs(x) / half;
}

/// Hair that nothing is cut out of for the face.
float Painter::hairOutside(FNPos p) const {
    const float fray = 0.02f * noise(p.x * 4, p.y * 4, person_.strands + 5) +
                       (covers_ ? 0.006f : 0.01f) * noise(p.x * 17, p.y * 17, person_.strands + 9);
    const float cover = smoothStep(1.02f, 0.95f, skull(p) + fray);
    if (!covers_) return cover * smoothStep(-0.45f, -0.1f, p.y);
    const float end =
        (person_.cut == HairCut::bob ? -1.75f : -2.75f) + 0.12f * noise(p.x * 9, 0, person_.strands);
    return cover * smoothStep(end - 0.15f, end + 0.1f, p.y);
}

float Painter::hairBefore(FNPos p) const {
    const float fray = (covers_ ? 0.04f : 0.02f) * noise(strandNumber(p) * 26, 2 * p.y, person_.strands + 7) +
                       0.02f * noise(p.x * 9, p.y * 9, person_.strands + 6);
    // Short hair lets the skin through at its ends.
    return hairOutside(p) * smoothStep(covers_ ? 0.93f : 0.87f, covers_ ? 1.07f : 1.13f, opening(p) + fray);
}

/// Which strand a place belongs to. Short hair runs from the crown over the skull, longer hair from the
/// parting around the face and down.
float Painter::strandNumber(FNPos p) const {
    const float x = p.x - centre_;
    if (!covers_) {
        const float up = std::clamp(p.y / (1.6f + person_.hairVolume), 0.0f, 0.985f);
        return 1.5f * (x - person_.part * halfWidth_ * up) /
               (halfWidth_ * std::max(0.25f, std::sqrt(1 - up * up)));
    }
    // Between the hairline and the outline strands keep their share of the way.
    const float inner = opening(p), outer = skull(p);
    const float share = std::clamp((inner - 1) / std::max(0.02f, inner - outer + 0.02f), -1.0f, 1.0f);
    return (x > person_.part * halfWidth_ ? 3.0f : -3.0f) + 0.8f * share;
}

Colour Painter::strand(FNPos p, float shade) const {
    const float x = p.x - centre_;
    const float along = p.y > 0 ? std::atan2(p.y, std::abs(x) + 0.1f) : p.y;
    const float number = strandNumber(p);
    const float q =
        number + 0.04f * std::sin(2.5f * along + 2 * noise(number * 3, along, person_.strands + 8));
    const float shortness = person_.cut == HairCut::shortCut   ? 7.0f
                            : person_.cut == HairCut::sidePart ? 2.5f
                                                               : 1.0f;
    const float pattern = (0.36f * noise(q * 8, along * 1.1f * shortness, person_.strands) +
                           0.32f * noise(q * 22, along * 1.5f * shortness, person_.strands + 1) +
                           0.3f * noise(q * 50, along * 2.2f * shortness, person_.strands + 2)) *
                          (person_.cut == HairCut::shortCut ? 0.6f : 1.0f);
    const float band = std::exp(-(p.y - 1.05f) * (p.y - 1.05f) / 0.08f) +
                       0.5f * std::exp(-(p.y + 0.7f) * (p.y + 0.7f) / 0.3f);
    const float shine = 0.5f * band * std::max(0.0f, 0.5f + pattern);
    const float turned = 1 - 0.4f * smoothStep(0.8f, 1.05f, skull(p));
    const float root = 1 - 0.3f * smoothStep(1.1f, 0.98f, opening(p));
    const float parted = covers_ && p.y > 0
                             ? 1 - 0.35f * std::exp(-std::pow((x - person_.part * halfWidth_) / 0.02f, 2.0f))
                             : 1.0f;
    const Colour base =
        person_.hair * (shade * turned * root * parted * (0.95f + 0.55f * pattern) * light(x));
    return mix(base, Colour{235, 220, 205}, 0.25f * shine * shade);
}

Portrait Painter::paint() {
    FNImage<Fn::Bgra32> image(w_, h_);
    Fn::Bgra32* out = image.getExclusive();
    Random random(view_.grain);
    std::normal_distribution<float> grain(0, 1.3f);
    for (std::uint32_t py = 0; py < h_; ++py)
        for (std::uint32_t px = 0; px < w_; ++px, ++out) {
            const FNPos p{static_cast<float>(px) + 0.5f, static_cast<float>(py) + 0.5f};
            const FNPos b = body(p), h = head_->local(p);
            Colour colour = backdrop(p);
            if (const float cover = hairOutside(h); covers_ && cover > 0)
                colour = mix(colour, strand(h, 0.62f), cover);
            colour = mix(colour, neck(b), neckCover(b));
            if (const float cover = clothCover(b); cover > 0) colour = mix(colour, cloth(b), cover);
            if (!covers_) {
                const float x = std::abs(h.x - centre_) - halfWidth_ - 0.03f, y = h.y + 0.28f;
                const float ear = std::hypot((x - 0.06f * y) / 0.17f, y / 0.4f);
                const float hollow = std::hypot((x - 0.02f) / 0.09f, (y - 0.02f) / 0.24f);
                colour = mix(
                    colour,
                    skin({centre_ + (h.x > centre_ ? 0.8f : -0.8f), 0}) *
                        (0.86f - 0.3f * smoothStep(1.0f, 0.5f, hollow) + 0.08f * smoothStep(0.7f, 0.9f, ear)),
                    smoothStep(1.04f, 0.96f, ear));
            }
            if (const float cover = hairOutside(h); cover > 0 && h.y > 0)
                colour = mix(colour, strand(h, 0.7f), cover);
            if (const float inside = depth(outline_, p) / unit_; inside > -0.02f) {
                colour = mix(colour, faceAt(p, inside), smoothStep(-0.012f, 0.014f, inside));
                // Hair throws a soft shadow on the forehead.
                colour = colour * (1 - 0.22f * hairBefore(h + FNPos{0, covers_ ? 0.08f : 0.04f}));
            }
            if (const float cover = hairBefore(h); cover > 0) colour = mix(colour, strand(h, 1), cover);
            const float noiseHere = grain(random);
            const auto byte = [&](float value) {
                return static_cast<unsigned char>(std::clamp(value + noiseHere, 0.0f, 255.0f) + 0.49f);
            };
            *out = Fn::Bgra32(byte(colour.r), byte(colour.g), byte(colour.b));
        }
    return {image, Points(mesh_.begin(), mesh_.begin() + landmarkCount)};
}

} // namespace

Portrait drawPortrait(const PortraitModel& model, const Person& person, const View& view,
                      std::uint32_t width) {
    constexpr std::uint32_t least = 90, most = 3000;
    if (width < least || width > most)
        FN_THROW(FNEBadArg, "A portrait of width " + std::to_string(width) + " cannot be drawn");
    return Painter(model, person, view, width).paint();
}

} // namespace Synth

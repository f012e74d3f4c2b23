#include "train/synth_samples.h"

#include "fn/exception.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/transform.h"
#include "synth/painting.h"

#include <algorithm>
#include <cmath>
#include <sstream>

namespace Train {
namespace {

using Synth::landmarkCount;
using Synth::Points;
using Synth::shapeSize;

/// The same landmarks seen in a mirror that stands at `width` / 2.
Points mirrored(const Points& points, float width) {
    struct Range {
        std::size_t first, last, sum; // point i becomes point sum - i
    };
    constexpr Range ranges[] = {{0, 16, 16},   {17, 26, 43},  {31, 35, 66}, {36, 39, 81},
                                {40, 41, 87},  {42, 45, 81},  {46, 47, 87}, {48, 54, 102},
                                {55, 59, 114}, {60, 64, 124}, {65, 67, 132}};
    Points result;
    for (const FNPos p : points) result.push_back({width - p.x, p.y});
    Points permuted = result;
    for (const Range& range : ranges)
        for (std::size_t i = range.first; i <= range.last; ++i) permuted[i] = result[range.sum - i];
    return permuted;
}

Points parsePoints(const std::string& text) {
    std::istringstream stream(text);
    Points points;
    for (FNPos p; stream >> p.x >> p.y;) points.push_back(p);
    return points;
}

/// How far the nose's tip is from the middle of the jaw, in half widths of the face.
float turn(const Points& landmarks) {
    const Synth::HeadAxes head(landmarks);
    const float left = head.local(landmarks[0]).x, right = head.local(landmarks[16]).x;
    return (2 * head.local(landmarks[30]).x - left - right) / (right - left);
}

float gap(FNPos a, FNPos b) {
    return length(a - b);
}

/// What the landmarks tell of pose and expression, eye distances.
Synth::Controls measured(const Points& landmarks) {
    const Synth::HeadAxes head(landmarks);
    Points p;
    for (const FNPos landmark : landmarks) p.push_back(head.local(landmark));
    Synth::Controls controls{};
    controls[Synth::yaw] = turn(landmarks);
    controls[Synth::pitch] = (p[27].y - p[30].y) / std::max(0.1f, p[27].y - p[33].y);
    controls[Synth::mouthOpen] = gap(p[62], p[66]);
    controls[Synth::smile] =
        (p[54].x - p[48].x) / (p[16].x - p[0].x) + (p[48].y + p[54].y - p[62].y - p[66].y) / 2;
    controls[Synth::eyesOpen] = (gap(p[37], p[41]) + gap(p[38], p[40])) / gap(p[36], p[39]) +
                                (gap(p[43], p[47]) + gap(p[44], p[46])) / gap(p[42], p[45]);
    return controls;
}

FNImage<float> flipped(const FNImage<float>& image) {
    FNImage<float> result(image.w(), image.h());
    float* out = result.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y, out += image.w())
        std::reverse_copy(image.row(y), image.row(y) + image.w(), out);
    return result;
}

std::vector<std::uint32_t> indexOf(const std::vector<FNGridPos>& pixels, std::uint32_t w, std::uint32_t h) {
    std::vector<std::uint32_t> index(std::size_t{w} * h);
    for (std::uint32_t i = 0; i < pixels.size(); ++i)
        index[static_cast<std::size_t>(pixels[i].y) * w + static_cast<std::size_t>(pixels[i].x)] = i;
    return index;
}

std::vector<FNPos> localPlaces(const std::vector<FNGridPos>& pixels, float scale, const Points& mesh) {
    const Synth::HeadAxes head(std::span<const FNPos>(mesh).first(landmarkCount));
    std::vector<FNPos> places;
    for (const FNGridPos pixel : pixels)
        places.push_back(head.local((FNPos(pixel) + FNPos{0.5f, 0.5f}) * scale));
    return places;
}

bool within(FNPos p, FNPos corner, FNPos opposite) {
    return p.x >= corner.x && p.x < opposite.x && p.y >= corner.y && p.y < opposite.y;
}

} // namespace

std::vector<PointedFace> pointedFaces(const std::filesystem::path& labels, float leastEyeDistance,
                                      std::optional<Labelled::Split> split) {
    constexpr float mostTurn = 0.28f;
    std::vector<PointedFace> faces;
    std::filesystem::path last;
    for (const Labelled::Row& row : Labelled::readLabels(labels)) {
        if (row.image() == last) continue; // further faces of a picture are the annotator's
        last = row.image();
        if ((split && Labelled::splitOf(row.splitKey()) != *split) || row.number("glasses") == 1) continue;
        PointedFace face{row.image(), row.splitKey(), row.text("gender"), parsePoints(row.text("points68"))};
        if (face.landmarks.size() != landmarkCount) continue;
        if (Synth::HeadAxes(face.landmarks).eyeDistance() < leastEyeDistance ||
            std::abs(turn(face.landmarks)) > mostTurn)
            continue;
        faces.push_back(std::move(face));
    }
    return faces;
}

std::vector<PointedFace> pointedFaces(const std::filesystem::path& data, Labelled::Split split,
                                      const std::vector<FaceChoice>& choices) {
    std::vector<PointedFace> faces;
    for (const FaceChoice& choice : choices) {
        const auto chosen = pointedFaces(data / choice.folder / "labels.tsv", choice.leastEyeDistance, split);
        faces.insert(faces.end(), chosen.begin(), chosen.end());
    }
    return faces;
}

const std::vector<FaceChoice>& synthPhotos() {
    static const std::vector<FaceChoice> choices = {{"people/celeba", 46}, {"scenes/faces", 46}};
    return choices;
}

Points meanShape(const std::vector<PointedFace>& faces, float eyeDistance) {
    constexpr int rounds = 3;
    constexpr float margin = 2;
    if (faces.empty()) FN_THROW(FNEBadArg, "There are no faces to learn from");
    Points mean = faces.front().landmarks;
    for (int round = 0; round < rounds; ++round) {
        const Synth::HeadAxes head(mean);
        for (FNPos& p : mean) {
            const FNPos local = head.local(p);
            p = FNPos{local.x, -local.y} * eyeDistance;
        }
        Points sum(landmarkCount);
        for (const PointedFace& face : faces) {
            const Synth::Similarity toMean(face.landmarks, mean);
            Points aligned;
            for (const FNPos p : face.landmarks) aligned.push_back(toMean(p));
            const Points mirror = mirrored(aligned, 0);
            for (std::size_t i = 0; i < landmarkCount; ++i) sum[i] += aligned[i] + mirror[i];
        }
        for (std::size_t i = 0; i < landmarkCount; ++i)
            mean[i] = sum[i] / (2.0f * static_cast<float>(faces.size()));
    }
    FNPos corner;
    for (const FNPos p : Synth::withForehead(mean))
        corner = {std::min(corner.x, p.x), std::min(corner.y, p.y)};
    for (FNPos& p : mean) p += FNPos{margin, margin} - corner;
    return mean;
}

struct PhotoWarper::Planes {
    FNImage<float> y, cb, cr;
    Points landmarks; // in the frame
};

namespace {

constexpr float border = 24; // pixels around the frame

} // namespace

PhotoWarper::PhotoWarper(const Synth::TextureFrame& frame)
    : frame_(frame), lumaIndex_(indexOf(frame.luma(), frame.w(), frame.h())),
      chromaIndex_(indexOf(frame.chroma(), frame.w() / 2, frame.h() / 2)),
      lumaLocal_(localPlaces(frame.luma(), 1, frame.mesh())),
      chromaLocal_(localPlaces(frame.chroma(), 2, frame.mesh())) {}

PhotoWarper::Planes PhotoWarper::aligned(const PointedFace& face) const {
    const Synth::Similarity toFrame(face.landmarks,
                                    std::span<const FNPos>(frame_.mesh()).first(landmarkCount));
    const float w = static_cast<float>(frame_.w()), h = static_cast<float>(frame_.h());
    const FNPos corner = toFrame.inverse({-border, -border});
    FNImage<Fn::Bgra32> cut(frame_.w() + static_cast<std::uint32_t>(2 * border),
                            frame_.h() + static_cast<std::uint32_t>(2 * border));
    Img::Affine::transform(Fn::readImage(face.image.string()).toBgra32(), cut, corner,
                           toFrame.inverse({w + border, -border}) - corner,
                           toFrame.inverse({-border, h + border}) - corner, true, Fn::Bgra32(128, 128, 128));
    Planes planes{FNImage<float>(cut.w(), cut.h()),
                  FNImage<float>(cut.w(), cut.h()),
                  FNImage<float>(cut.w(), cut.h()),
                  {}};
    float *y = planes.y.getExclusive(), *cb = planes.cb.getExclusive(), *cr = planes.cr.getExclusive();
    for (const Fn::Bgra32 p : cut.span()) {
        *y = 0.299f * p.r + 0.587f * p.g + 0.114f * p.b;
        *cb++ = 128 + (p.b - *y) * 0.564f;
        *cr++ = 128 + (p.r - *y) * 0.713f;
        ++y;
    }
    for (const FNPos p : face.landmarks) planes.landmarks.push_back(toFrame(p));
    return planes;
}

SynthSample PhotoWarper::sample(const Planes& planes) const {
    const std::size_t chromaCount = frame_.chroma().size();
    SynthSample result;
    for (const FNPos p : planes.landmarks) {
        result.values.push_back(p.x);
        result.values.push_back(p.y);
    }
    result.values.resize(shapeSize + frame_.textureSize());
    float* const luma = result.values.data() + shapeSize;
    float* const cb = luma + frame_.luma().size();
    const Points mesh = Synth::withForehead(planes.landmarks);
    const FNPos shift{border, border};
    const auto w = static_cast<std::int32_t>(frame_.w()), h = static_cast<std::int32_t>(frame_.h());
    Synth::forEachPixel(frame_.triangles(), frame_.mesh(), mesh, {0, 0, w, h}, [&](FNGridPos at, FNPos from) {
        luma[lumaIndex_[static_cast<std::size_t>(at.y * w + at.x)]] = Synth::bilinear(planes.y, from + shift);
    });
    Points half;
    for (const FNPos p : frame_.mesh()) half.push_back(p * 0.5f);
    Synth::forEachPixel(frame_.triangles(), half, mesh, {0, 0, w / 2, h / 2}, [&](FNGridPos at, FNPos from) {
        const std::size_t i = chromaIndex_[static_cast<std::size_t>(at.y * (w / 2) + at.x)];
        cb[i] = Synth::bilinear(planes.cb, from + shift);
        cb[i + chromaCount] = Synth::bilinear(planes.cr, from + shift);
    });

    result.controls = measured(planes.landmarks);
    float left = 0, right = 0, above = 0, below = 0;
    for (std::size_t i = 0; i < lumaLocal_.size(); ++i) {
        const FNPos p = lumaLocal_[i];
        if (within(p, {-0.9f, -1.0f}, {-0.3f, -0.4f})) left += luma[i];
        if (within(p, {0.3f, -1.0f}, {0.9f, -0.4f})) right += luma[i];
        if (within(p, {-0.3f, 0.45f}, {0.3f, 0.7f})) above += luma[i];
        if (within(p, {-0.3f, -1.7f}, {0.3f, -1.45f})) below += luma[i];
    }
    result.controls[Synth::lightSide] = (left - right) / (left + right + 1);
    result.controls[Synth::lightAbove] = (above - below) / (above + below + 1);
    float blue = 0, red = 0, n = 0;
    for (std::size_t i = 0; i < chromaCount; ++i) {
        const FNPos p = {std::abs(chromaLocal_[i].x), chromaLocal_[i].y};
        if (!within(p, {0.3f, -1.0f}, {0.9f, -0.4f})) continue;
        blue += cb[i];
        red += cb[i + chromaCount];
        n += 1;
    }
    result.controls[Synth::tintBlue] = blue / n;
    result.controls[Synth::tintRed] = red / n;
    return result;
}

std::vector<float> PhotoWarper::patch(const PointedFace& face) const {
    // From the brows to the chin, between the cheeks: hair and background are outside.
    constexpr FNPos corner{-0.95f, 0.55f}, opposite{0.95f, -1.65f};
    constexpr std::uint32_t w = 30, h = 35;
    const Planes planes = aligned(face);
    const Synth::HeadAxes head(std::span<const FNPos>(frame_.mesh()).first(landmarkCount));
    const FNGridPos first(head.picture(corner) + FNPos{border, border});
    const FNGridPos last(head.picture(opposite) + FNPos{border, border});
    FNImage<float> small(w, h);
    Img::Affine::transform(planes.y, small, {first.x, first.y, last.x, last.y});
    return {small.data(), small.data() + small.size()};
}

std::pair<SynthSample, SynthSample> PhotoWarper::samples(const PointedFace& face) const {
    const Planes planes = aligned(face);
    // The mean shape is symmetric about its own middle, which need not be that of the frame.
    float least = static_cast<float>(frame_.w()), most = 0;
    for (const FNPos p : frame_.mesh()) {
        least = std::min(least, p.x);
        most = std::max(most, p.x);
    }
    const float axis = least + most;
    const float off = static_cast<float>(frame_.w()) - axis; // what flipping whole rasters mirrors at
    Planes mirror{flipped(planes.y), flipped(planes.cb), flipped(planes.cr),
                  mirrored(planes.landmarks, static_cast<float>(frame_.w()))};
    SynthSample second = sample(mirror);
    for (std::size_t i = 0; i < shapeSize; i += 2) second.values[i] -= off;
    return {sample(planes), second};
}

struct HairRemoval::Reference {
    float value[3][2]; // of Y, Cb, Cr on the left and the right cheek
    float at(int plane, float x) const {
        constexpr float cheek = 0.6f; // place of the cheeks, eye distances from the middle
        const float t = std::clamp((x + cheek) / (2 * cheek), -0.2f, 1.2f);
        return value[plane][0] * (1 - t) + value[plane][1] * t;
    }
};

namespace {

/// How far a place on the head may be taken for hair: 0 around the eyes, 1 at the rim of the face.
/// @param brows height of the brows there
float hairWeight(FNPos p, float brows) {
    const float above = (p.y - brows - 0.09f) / 0.1f;
    const float aside = std::min((std::abs(p.x) - 0.92f) / 0.12f, (p.y + 1.1f) / 0.4f);
    return std::clamp(std::max(above, aside), 0.0f, 1.0f);
}

/// Height of the brows above the line through the eyes, everything in eye distances.
float browHeight(std::span<const FNPos> landmarks, float x) {
    const Synth::HeadAxes head(landmarks);
    FNPos last = head.local(landmarks[17]);
    for (std::size_t i = 18; i <= 26; ++i) {
        const FNPos next = head.local(landmarks[i]);
        if (x < next.x)
            return std::lerp(last.y, next.y, std::clamp((x - last.x) / (next.x - last.x), 0.0f, 1.0f));
        last = next;
    }
    return last.y;
}

} // namespace

HairRemoval::HairRemoval(const Synth::TextureFrame& frame) : w_(frame.w()), h_(frame.h()) {
    const auto chroma = indexOf(frame.chroma(), w_ / 2, h_ / 2);
    const std::vector<FNPos> places = localPlaces(frame.luma(), 1, frame.mesh());
    const auto landmarks = std::span<const FNPos>(frame.mesh()).first(landmarkCount);
    for (std::size_t i = 0; i < places.size(); ++i) {
        const FNGridPos at = frame.luma()[i];
        const std::size_t colour =
            chroma[static_cast<std::size_t>(at.y / 2) * (w_ / 2) + static_cast<std::size_t>(at.x / 2)];
        const std::size_t cb = shapeSize + places.size() + colour;
        const Pixel pixel{shapeSize + i,
                          cb,
                          cb + frame.chroma().size(),
                          hairWeight(places[i], browHeight(landmarks, places[i].x)),
                          places[i],
                          at};
        const FNPos p = places[i];
        if (pixel.weight > 0) region_.push_back(pixel);
        if (within(p, {-0.75f, -0.85f}, {-0.4f, -0.45f})) cheeks_[0].push_back(pixel);
        if (within(p, {0.4f, -0.85f}, {0.75f, -0.45f})) cheeks_[1].push_back(pixel);
    }
}

HairRemoval::Reference HairRemoval::reference(const SynthSample& sample) const {
    Reference result{};
    for (int side = 0; side < 2; ++side) {
        for (const Pixel& pixel : cheeks_[side]) {
            result.value[0][side] += sample.values[pixel.luma];
            result.value[1][side] += sample.values[pixel.cb];
            result.value[2][side] += sample.values[pixel.cr];
        }
        for (auto& plane : result.value) plane[side] /= static_cast<float>(cheeks_[side].size());
    }
    return result;
}

namespace {

bool isSkin(float y, float cb, float cr, float ratio) {
    constexpr float mostColour = 9, least = 0.75f, most = 1.35f;
    return std::abs(cb) < mostColour && std::abs(cr) < mostColour && y > least * ratio && y < most * ratio;
}

} // namespace

void HairRemoval::learn(const std::vector<SynthSample>& samples) {
    std::vector<float> count(region_.size());
    for (auto& mean : mean_) mean.assign(region_.size(), 0);
    for (const SynthSample& sample : samples) {
        const Reference ref = reference(sample);
        for (std::size_t i = 0; i < region_.size(); ++i) {
            const Pixel& p = region_[i];
            const float y = sample.values[p.luma] / std::max(1.0f, ref.at(0, p.local.x));
            const float cb = sample.values[p.cb] - ref.at(1, p.local.x);
            const float cr = sample.values[p.cr] - ref.at(2, p.local.x);
            if (!isSkin(y, cb, cr, 0.95f)) continue;
            count[i] += 1;
            mean_[0][i] += y;
            mean_[1][i] += cb;
            mean_[2][i] += cr;
        }
    }
    for (auto& mean : mean_)
        for (std::size_t i = 0; i < mean.size(); ++i) mean[i] /= std::max(1.0f, count[i]);
}

void HairRemoval::apply(SynthSample& sample) const {
    const Reference ref = reference(sample);
    FNImage<float> skin(w_, h_);
    skin.fill(1);
    float* const out = skin.getExclusive();
    for (std::size_t i = 0; i < region_.size(); ++i) {
        const Pixel& p = region_[i];
        const float x = p.local.x;
        out[static_cast<std::size_t>(p.at.y) * w_ + static_cast<std::size_t>(p.at.x)] =
            isSkin(sample.values[p.luma] / std::max(1.0f, ref.at(0, x)), sample.values[p.cb] - ref.at(1, x),
                   sample.values[p.cr] - ref.at(2, x), mean_[0][i])
                ? 1.0f
                : 0.0f;
    }
    // A pixel counts as much as its whole neighbourhood is skin, so that no seam is left.
    constexpr int radius = 4;
    std::vector<float> values(sample.values);
    for (std::size_t i = 0; i < region_.size(); ++i) {
        const Pixel& p = region_[i];
        float sum = 0, n = 0;
        for (int y = std::max(0, p.at.y - radius); y <= std::min<int>(h_ - 1, p.at.y + radius); ++y)
            for (int x = std::max(0, p.at.x - radius); x <= std::min<int>(w_ - 1, p.at.x + radius); ++x, ++n)
                sum += skin(static_cast<std::uint32_t>(x), static_cast<std::uint32_t>(y));
        const float fill = p.weight * std::clamp(2 - 2 * sum / n, 0.0f, 1.0f), share = 1 - fill;
        const float x = p.local.x;
        values[p.luma] = share * sample.values[p.luma] + fill * mean_[0][i] * ref.at(0, x);
        values[p.cb] = share * sample.values[p.cb] + fill * (ref.at(1, x) + mean_[1][i]);
        values[p.cr] = share * sample.values[p.cr] + fill * (ref.at(2, x) + mean_[2][i]);
    }
    sample.values = std::move(values);
}

} // namespace Train

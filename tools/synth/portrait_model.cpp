#include "synth/portrait_model.h"

#include "fn/exception.h"
#include "fn/serialize.h"
#include "fn/vector.h"

#include <algorithm>
#include <cmath>
#include <fstream>

namespace Synth {
namespace {

constexpr float mostSide = 512;   // pixels of the frame, more than any training makes
constexpr float mostValue = 1e4f; // of anything: a damaged file must not lead to infinities

bool bounded(float value) {
    return std::abs(value) <= mostValue;
}

Points landmarksOf(std::span<const float> shape) {
    Points points;
    for (std::size_t i = 0; i + 1 < shape.size(); i += 2) points.push_back({shape[i], shape[i + 1]});
    return points;
}

std::vector<FNGridPos> coveredPixels(const TextureFrame& frame, float scale, std::uint32_t w,
                                     std::uint32_t h) {
    Points mesh;
    for (const FNPos p : frame.mesh()) mesh.push_back(p * scale);
    std::vector<FNGridPos> pixels;
    forEachPixel(frame.triangles(), mesh, mesh,
                 {0, 0, static_cast<std::int32_t>(w), static_cast<std::int32_t>(h)},
                 [&](FNGridPos pixel, FNPos) { pixels.push_back(pixel); });
    std::sort(pixels.begin(), pixels.end(),
              [](FNGridPos a, FNGridPos b) { return std::pair(a.y, a.x) < std::pair(b.y, b.x); });
    return pixels;
}

/// A raster from some of its pixels: those beside them take their value, so that interpolation at the rim
/// sees nothing else.
FNImage<float> raster(std::uint32_t w, std::uint32_t h, const std::vector<FNGridPos>& pixels,
                      const float* values) {
    FNImage<float> image(w, h);
    image.fill(0);
    float* const out = image.getExclusive();
    std::vector<char> known(image.size());
    for (std::size_t i = 0; i < pixels.size(); ++i) {
        const std::size_t at =
            static_cast<std::size_t>(pixels[i].y) * w + static_cast<std::size_t>(pixels[i].x);
        out[at] = values[i];
        known[at] = 1;
    }
    for (std::uint32_t y = 0; y < h; ++y) {
        float last = 0;
        bool any = false;
        const auto pass = [&](std::uint32_t x) {
            const std::size_t at = std::size_t{y} * w + x;
            if (known[at] == 1) {
                last = out[at];
                any = true;
            } else if (any && known[at] == 0) {
                out[at] = last;
                known[at] = 2;
            }
        };
        for (std::uint32_t x = 0; x < w; ++x) pass(x);
        any = false;
        for (std::uint32_t x = w; x-- > 0;) pass(x);
    }
    const auto copyRow = [&](std::uint32_t from, std::uint32_t to) {
        for (std::uint32_t x = 0; x < w; ++x)
            if (!known[std::size_t{to} * w + x] && known[std::size_t{from} * w + x]) {
                out[std::size_t{to} * w + x] = out[std::size_t{from} * w + x];
                known[std::size_t{to} * w + x] = 2;
            }
    };
    for (std::uint32_t y = 1; y < h; ++y) copyRow(y - 1, y);
    for (std::uint32_t y = h - 1; y-- > 0;) copyRow(y + 1, y);
    return image;
}

std::vector<Direction> unpackDirections(const Fn::Package& package) {
    return Fn::SerializableVector<Direction>(package);
}

} // namespace

TextureFrame::TextureFrame(const Points& landmarks) : mesh_(withForehead(landmarks)) {
    float right = 0, bottom = 0;
    for (const FNPos p : mesh_) {
        if (!(p.x >= 0 && p.y >= 0 && p.x < mostSide && p.y < mostSide))
            FN_THROW(FNEBadArg, "a point of the mean shape lies outside of the frame");
        right = std::max(right, p.x);
        bottom = std::max(bottom, p.y);
    }
    w_ = 2 * (static_cast<std::uint32_t>(right) / 2 + 2);
    h_ = 2 * (static_cast<std::uint32_t>(bottom) / 2 + 2);
    triangles_ = delaunay(mesh_);
    luma_ = coveredPixels(*this, 1, w_, h_);
    chroma_ = coveredPixels(*this, 0.5f, w_ / 2, h_ / 2);
}

Direction::Part::Part(std::span<const float> from) {
    constexpr float most = 127;
    for (const float value : from) scale = std::max(scale, std::abs(value) / most);
    for (const float value : from)
        values.push_back(static_cast<signed char>(scale > 0 ? std::lround(value / scale) : 0));
}

Direction::Part::Part(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    scale = reader.next<float>();
    const auto bytes = reader.next<Fn::Package>();
    reader.expectEnd();
    if (bytes.cores().size() != 1 || !bounded(scale)) FN_THROW(FNEBadArg, "not a part of a direction");
    const auto span = bytes.cores().front().span();
    values.assign(span.begin(), span.end());
}

Direction::Part::operator Fn::Package() const {
    Fn::Package::Core core(values.size());
    std::copy(values.begin(), values.end(), core.getExclusive());
    return Fn::Package(
        std::list<Fn::Package>{Fn::Package(scale), Fn::Package(std::list<Fn::Package::Core>{core})});
}

void Direction::Part::addTo(std::span<float> sum, float factor) const {
    const float f = factor * scale;
    for (std::size_t i = 0; i < values.size(); ++i) sum[i] += f * static_cast<float>(values[i]);
}

Direction::Direction(std::span<const float> values)
    : shape(values.first(shapeSize)), texture(values.subspan(shapeSize)) {}

Direction::Direction(const Fn::Package& package) {
    const FNPair<Part, Part> parts(package);
    shape = parts.first;
    texture = parts.second;
}

Direction::operator Fn::Package() const {
    return Fn::Package(FNPair<Part, Part>(shape, texture));
}

PortraitModel::PortraitModel(const Points& frame, std::span<const float> mean,
                             std::vector<Direction> controls, std::vector<Direction> identity,
                             std::vector<float> feminine)
    : frame_(frame), mean_(mean.begin(), mean.end()), controls_(std::move(controls)),
      identity_(std::move(identity)), feminine_(std::move(feminine)) {
    check();
}

PortraitModel::PortraitModel(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    const auto frame = reader.next<FNVector<float>>();
    if (frame.size() != shapeSize) FN_THROW(FNEBadArg, "the frame has other landmarks");
    frame_ = TextureFrame(landmarksOf({frame.get(), frame.size()}));
    const auto mean = reader.next<FNVector<float>>();
    mean_.assign(mean.get(), mean.get() + mean.size());
    controls_ = unpackDirections(reader.next<Fn::Package>());
    identity_ = unpackDirections(reader.next<Fn::Package>());
    const auto feminine = reader.next<FNVector<float>>();
    feminine_.assign(feminine.get(), feminine.get() + feminine.size());
    reader.expectEnd();
    check();
}

PortraitModel::PortraitModel(const std::filesystem::path& file) try
    : PortraitModel([&] {
          std::ifstream stream(file, std::ios::binary);
          if (!stream) FN_THROW(FNEIOError, "cannot be opened for reading");
          return Fn::Package(stream);
      }()) {
} catch (const FNEIOError& e) {
    FN_THROW(FNEIOError, file.string() + ": " + e.what());
} catch (const FNException& e) {
    FN_THROW(FNEBadFormat, file.string() + ": " + e.what());
}

PortraitModel::operator Fn::Package() const {
    std::vector<float> frame;
    for (const FNPos p : std::span(frame_.mesh()).first(landmarkCount)) {
        frame.push_back(p.x);
        frame.push_back(p.y);
    }
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(FNVector<float>(frame)),
                                              Fn::serialize(FNVector<float>(mean_)),
                                              Fn::Package(Fn::SerializableVector<Direction>(controls_)),
                                              Fn::Package(Fn::SerializableVector<Direction>(identity_)),
                                              Fn::serialize(FNVector<float>(feminine_))});
}

void PortraitModel::check() const {
    if (mean_.size() != shapeSize + frame_.textureSize())
        FN_THROW(FNEBadArg, "the mean face does not fit its frame");
    if (!std::ranges::all_of(mean_, bounded) || !std::ranges::all_of(feminine_, bounded))
        FN_THROW(FNEBadArg, "there are values beyond all bounds");
    if (controls_.size() != controlCount) FN_THROW(FNEBadArg, "the model has other controls");
    if (feminine_.size() != identity_.size()) FN_THROW(FNEBadArg, "the directions do not go together");
    for (const auto* const directions : {&controls_, &identity_})
        for (const Direction& direction : *directions)
            if (direction.shape.values.size() != shapeSize ||
                direction.texture.values.size() != frame_.textureSize())
                FN_THROW(FNEBadArg, "a direction does not fit the mean face");
}

PortraitModel::Face PortraitModel::face(const Controls& controls, std::span<const float> identity) const {
    std::vector<float> sum = mean_;
    const auto add = [&](const Direction& direction, float factor) {
        direction.shape.addTo(std::span(sum).first(shapeSize), factor);
        direction.texture.addTo(std::span(sum).subspan(shapeSize), factor);
    };
    for (std::size_t i = 0; i < controlCount; ++i) add(controls_[i], controls[i]);
    for (std::size_t i = 0; i < std::min(identity.size(), identity_.size()); ++i)
        add(identity_[i], identity[i]);
    const float* const y = sum.data() + shapeSize;
    const float* const cb = y + frame_.luma().size();
    const float* const cr = cb + frame_.chroma().size();
    return {landmarksOf(std::span(sum).first(shapeSize)),
            {raster(frame_.w(), frame_.h(), frame_.luma(), y),
             raster(frame_.w() / 2, frame_.h() / 2, frame_.chroma(), cb),
             raster(frame_.w() / 2, frame_.h() / 2, frame_.chroma(), cr)}};
}

} // namespace Synth

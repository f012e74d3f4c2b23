#include "cmp/portrait/background_uniformity.h"

#include "cmp/portrait/egg.h"
#include "img/affine/transform.h"

#include <array>
#include <cmath>
#include <map>
#include <numbers>
#include <numeric>

namespace Cmp::Portrait {

namespace {

using Image = BackgroundUniformity::Image;
using Labels = BackgroundUniformity::Labels;
using Region = BackgroundUniformity::Region;

constexpr int masked = BackgroundUniformity::masked;

/// Disjoint sets of numbers, each named by its least one.
class DisjointSets {
public:
    int add() {
        parents_.push_back(static_cast<int>(parents_.size()));
        return parents_.back();
    }
    int find(int i) {
        while (at(i) != i) i = at(i) = at(at(i));
        return i;
    }
    void join(int a, int b) {
        a = find(a);
        b = find(b);
        at(std::max(a, b)) = std::min(a, b);
    }
    std::size_t size() const { return parents_.size(); }

private:
    int& at(int i) { return parents_[static_cast<std::size_t>(i)]; }

    std::vector<int> parents_;
};

/// Labels by position.
class LabelView {
public:
    explicit LabelView(const Labels& labels)
        : labels_(labels), width_(static_cast<std::int32_t>(labels.cols())),
          height_(static_cast<std::int32_t>(labels.rows())) {}
    std::int32_t width() const { return width_; }
    std::int32_t height() const { return height_; }
    bool inside(FNGridPos pos) const { return 0 <= pos.x && pos.x < width_ && 0 <= pos.y && pos.y < height_; }
    int operator()(FNGridPos pos) const {
        return labels_(static_cast<std::size_t>(pos.y), static_cast<std::size_t>(pos.x));
    }
    /// Whether the four pixels at this distance to the sides and above and below exist and have the label.
    bool surroundedBy(int label, FNGridPos pos, std::int32_t distance) const {
        for (const FNGridPos direction : sides)
            if (const FNGridPos neighbour = pos + direction * distance;
                !inside(neighbour) || (*this)(neighbour) != label)
                return false;
        return true;
    }
    bool touches(int label, FNGridPos pos) const {
        for (const FNGridPos direction : sides)
            if (inside(pos + direction) && (*this)(pos + direction) == label) return true;
        return false;
    }

    static constexpr std::array sides{FNGridPos(1, 0), FNGridPos(-1, 0), FNGridPos(0, 1), FNGridPos(0, -1)};

private:
    const Labels& labels_;
    std::int32_t width_, height_;
};

const Fn::Bgra32& pixel(const Image& image, FNGridPos pos) {
    return image(static_cast<std::uint32_t>(pos.x), static_cast<std::uint32_t>(pos.y));
}

int brightness(const Fn::Bgra32& p) {
    return (p.r + p.g + p.b) / 3;
}

/// How brightness changes from the left to the right neighbour, and from the upper to the lower one.
FN2Vector<int> slope(const Image& image, FNGridPos pos, std::int32_t distance) {
    const auto at = [&](std::int32_t x, std::int32_t y) {
        return brightness(pixel(image, pos + FNGridPos(x, y)));
    };
    return {at(distance, 0) - at(-distance, 0), at(0, distance) - at(0, -distance)};
}

bool similar(const Fn::Bgra32& p, const Fn::Bgra32& q, int tolerance) {
    return std::abs(p.r - q.r) < tolerance && std::abs(p.g - q.g) < tolerance &&
           std::abs(p.b - q.b) < tolerance;
}

struct RegionMeans {
    FN2Vector<double> centroid;
    double brightness = 0;

    RegionMeans(const Image& image, const Region& region) {
        for (const FNGridPos pos : region) {
            const Fn::Bgra32& p = pixel(image, pos);
            centroid += FN2Vector<double>(pos);
            brightness += (p.r + p.g + p.b) / 3.0;
        }
        const double n = std::max(static_cast<double>(region.size()), 1.0);
        centroid = centroid / n;
        brightness /= n;
    }
};

std::vector<Region> regionsOf(const Labels& labels) {
    const LabelView view(labels);
    std::vector<Region> regions;
    for (FNGridPos pos; pos.y < view.height(); ++pos.y)
        for (pos.x = 0; pos.x < view.width(); ++pos.x) {
            const int label = view(pos);
            if (label == masked) continue;
            const auto index = static_cast<std::size_t>(label);
            if (index >= regions.size()) regions.resize(index + 1);
            regions[index].push_back(pos);
        }
    return regions;
}

/// The most frequent label of a box, `masked` if there is none; among equals `preferred`, then the lowest.
int mostFrequent(const Labels& labels, const FNBox& box, int preferred) {
    const LabelView view(labels);
    std::map<int, int> counts;
    for (std::int32_t y = box.y0; y < box.y1; ++y)
        for (std::int32_t x = box.x0; x < box.x1; ++x)
            if (const int label = view({x, y}); label != masked) ++counts[label];
    int best = masked, most = 0;
    for (const auto& [label, count] : counts)
        if (count > most || (count == most && label == preferred)) {
            best = label;
            most = count;
        }
    return best;
}

/// The head, and the body below the eyes.
FNImage<unsigned char> maskOf(const Image& image, FNPos eye0, FNPos eye1) {
    constexpr std::uint32_t freeRows = 3;
    const FNPos d = eye1 - eye0, middle = (eye0 + eye1) / 2.0f;
    const Egg head = Egg::ofEyes(eye0, eye1, 1.5f, 2, 1.8f);
    const float bodyLeft = middle.x - 1.5f * d.x + 1.5f * d.x / 6,
                bodyRight = middle.x + 1.5f * d.x - 1.5f * d.x / 6;
    FNImage<unsigned char> mask(image.w(), image.h());
    unsigned char* out = mask.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            const FNPos centre(static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f);
            const bool body = centre.y > middle.y && centre.x >= bodyLeft && centre.x <= bodyRight;
            *out++ = y >= freeRows && (body || head.contains(centre));
        }
    return mask;
}

/// The image at an eye distance of 32 pixels down to the shoulders, with the eyes; empty if it does not reach
/// there.
struct UpperBody {
    Image image;
    FNPos eye0, eye1;

    UpperBody(const Image& source, FNPos sourceEye0, FNPos sourceEye1) {
        constexpr float eyeDistance = 32, below = 48, mostPixels = 1 << 25;
        constexpr std::uint32_t fewestRows = 3;
        const float factor = eyeDistance / length(sourceEye1 - sourceEye0);
        const float w = factor * static_cast<float>(source.w()), h = factor * static_cast<float>(source.h());
        eye0 = sourceEye0 * factor;
        eye1 = sourceEye1 * factor;
        const float lastRow = std::trunc((eye0.y + eye1.y) / 2 + below);
        if (!(w >= 1 && lastRow >= 0 && lastRow + 1 <= std::trunc(h) && w * h <= mostPixels)) return;
        const auto rows = static_cast<std::uint32_t>(lastRow) + 1;
        if (rows < fewestRows) return;
        FNImage<Fn::Bgra32> scaled(static_cast<std::uint32_t>(w), static_cast<std::uint32_t>(h));
        Img::Affine::transform(source, scaled);
        image = Image(scaled.mem(), scaled.w(), rows);
    }
};

class MeanAndVariance {
public:
    void add(double value) {
        ++n_;
        sum_ += value;
        squares_ += value * value;
    }
    double variance() const { return n_ == 0 ? 0 : std::max(squares_ / n_ - sum_ / n_ * sum_ / n_, 0.0); }

private:
    double n_ = 0, sum_ = 0, squares_ = 0;
};

/// Hue as cosine and sine, and saturation (R. Gonzalez, R. Woods, "Digital Image Processing", HSI model); all
/// 0 for a pixel that is nearly gray.
struct HueSaturation {
    double cosine = 0, sine = 0, saturation = 0;

    explicit HueSaturation(const Fn::Bgra32& p) {
        constexpr int gray = 15;
        const int rg = p.r - p.g, rb = p.r - p.b, gb = p.g - p.b;
        if (std::abs(rg) <= gray && std::abs(rb) <= gray) return;
        cosine = std::clamp(0.5 * (rg + rb) / std::sqrt(static_cast<double>(rg * rg + rb * gb)), -1.0, 1.0);
        const double acute = std::acos(cosine);
        sine = std::sin(p.b > p.g ? 2 * std::numbers::pi - acute : acute);
        saturation = 1 - 3.0 * std::min({p.r, p.g, p.b}) / (p.r + p.g + p.b);
    }
};

} // namespace

Labels BackgroundUniformity::segment(const Image& image, const FNImage<unsigned char>& mask, int tolerance) {
    Labels labels(image.h(), image.w());
    int* const out = labels.getExclusive();
    DisjointSets sets;
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            int& label = labels.access(out, y, x);
            label = masked;
            if (mask(x, y)) continue;
            const auto join = [&](std::uint32_t nx, std::uint32_t ny) {
                if (mask(nx, ny) || !similar(image(x, y), image(nx, ny), tolerance)) return;
                const int other = labels.access(out, ny, nx);
                if (label == masked)
                    label = other;
                else
                    sets.join(label, other);
            };
            if (x > 0) join(x - 1, y);
            if (y > 0) join(x, y - 1);
            if (label == masked) label = sets.add();
        }
    // Sets are named by their first label, so final labels go in raster order, too.
    std::vector<int> finals(sets.size());
    int next = 0;
    for (std::size_t i = 0; i < finals.size(); ++i) {
        const auto first = static_cast<std::size_t>(sets.find(static_cast<int>(i)));
        finals[i] = first == i ? next++ : finals[first];
    }
    for (std::size_t i = 0; i < labels.size(); ++i)
        if (out[i] != masked) out[i] = finals[static_cast<std::size_t>(out[i])];
    return labels;
}

std::vector<Region> BackgroundUniformity::mergeRegionsToBackground(const Image& image, Labels& labels,
                                                                   int background) {
    constexpr std::int32_t distance = 5;
    constexpr int fewestPixels = 11;
    constexpr double tolerance = 15;
    std::vector<Region> regions = regionsOf(labels);
    Region& own = regions[static_cast<std::size_t>(background)];
    FN2Vector<double> gradient;
    int count = 0;
    const LabelView view(labels);
    for (const FNGridPos pos : own)
        if (view.surroundedBy(background, pos, distance)) {
            gradient += FN2Vector<double>(slope(image, pos, distance));
            ++count;
        }
    if (count < fewestPixels) return regions;
    gradient = gradient / (2.0 * distance * count);

    const RegionMeans ground(image, own);
    int* const out = labels.getExclusive();
    for (Region& region : regions) {
        if (&region == &own || region.empty()) continue;
        const RegionMeans means(image, region);
        const FN2Vector<double> offset = means.centroid - ground.centroid;
        const auto expected = [&](double change) {
            return std::abs(ground.brightness + change - means.brightness) < tolerance;
        };
        if (!expected(offset.x * gradient.x) || !expected(offset.y * gradient.y)) continue;
        for (const FNGridPos pos : region)
            labels.access(out, static_cast<std::size_t>(pos.y), static_cast<std::size_t>(pos.x)) = background;
        own.splice(own.end(), region);
    }
    return regions;
}

bool BackgroundUniformity::thereAreObjectsTouchingShoulders(const Labels& labels,
                                                            const std::vector<Region>& regions,
                                                            int background, int head) {
    constexpr std::size_t mostPixels = 8;
    const LabelView view(labels);
    std::vector<bool> seen(regions.size());
    for (std::int32_t x = 1; x + 1 < view.width(); ++x) {
        const int label = view({x, view.height() - 1});
        if (label == background || label == head || label == masked) continue;
        const auto index = static_cast<std::size_t>(label);
        if (seen[index]) continue;
        seen[index] = true;
        if (regions[index].size() > mostPixels &&
            !regionsAreConnected(labels, regions, background, label, head))
            return true;
    }
    return false;
}

bool BackgroundUniformity::regionsAreConnected(const Labels& labels, const std::vector<Region>& regions,
                                               int background, int a, int b) {
    if (a == b) return true;
    const LabelView view(labels);
    std::vector<bool> reached(regions.size());
    std::vector<int> growing{a};
    reached[static_cast<std::size_t>(a)] = true;
    while (!growing.empty()) {
        const int label = growing.back();
        growing.pop_back();
        for (const FNGridPos pos : regions[static_cast<std::size_t>(label)]) {
            if (view.touches(b, pos)) return true;
            for (const FNGridPos direction : LabelView::sides) {
                if (!view.inside(pos + direction)) continue;
                const int next = view(pos + direction);
                if (next == masked || next == background || reached[static_cast<std::size_t>(next)]) continue;
                reached[static_cast<std::size_t>(next)] = true;
                growing.push_back(next);
            }
        }
    }
    return false;
}

bool BackgroundUniformity::newRegionGradient(const Image& image, const Region& background,
                                             const Labels& labels) {
    constexpr double mostHueVariance = 0.6, mostSaturationDeviation = 0.2;
    constexpr std::int32_t distance = 4;
    constexpr int flat = 4;
    constexpr double strong = 8, oneSided = 0.4;
    if (background.empty()) return true;
    MeanAndVariance cosine, sine, saturation;
    for (const FNGridPos pos : background) {
        const HueSaturation colour(pixel(image, pos));
        cosine.add(colour.cosine);
        sine.add(colour.sine);
        saturation.add(colour.saturation);
    }
    if (cosine.variance() > mostHueVariance || sine.variance() > mostHueVariance) return false;
    if (std::sqrt(saturation.variance()) > mostSaturationDeviation) return false;

    const LabelView view(labels);
    const int label = view(background.front());
    FN2Vector<std::int64_t> changes, signedChanges;
    std::int64_t n = 0;
    for (const FNGridPos pos : background) {
        if (!view.surroundedBy(label, pos, distance)) continue;
        ++n;
        const FN2Vector<std::int64_t> g(slope(image, pos, distance));
        const FN2Vector<std::int64_t> counted(std::abs(g.x) > flat ? g.x : 0, std::abs(g.y) > flat ? g.y : 0);
        signedChanges += counted;
        changes += {std::abs(counted.x), std::abs(counted.y)};
    }
    const auto textured = [&](std::int64_t change, std::int64_t signedChange) {
        const auto size = static_cast<double>(change);
        return n > 0 && size / static_cast<double>(n) > strong &&
               static_cast<double>(std::abs(signedChange)) / size < oneSided;
    };
    return !textured(changes.x, signedChanges.x) && !textured(changes.y, signedChanges.y);
}

bool BackgroundUniformity::thereAreIsolatedRegionsInsideBackground(const Labels& labels, int background) {
    constexpr int mostPixels = 14;
    const LabelView view(labels);
    DisjointSets sets;
    const auto width = static_cast<std::size_t>(view.width());
    constexpr int none = -1;
    std::vector<int> groups(labels.size(), none);
    const auto group = [&](FNGridPos pos) -> int& {
        return groups[static_cast<std::size_t>(pos.y) * width + static_cast<std::size_t>(pos.x)];
    };
    for (FNGridPos pos; pos.y < view.height(); ++pos.y)
        for (pos.x = 0; pos.x < view.width(); ++pos.x) {
            if (view(pos) == background || view(pos) == masked) continue;
            group(pos) = sets.add();
            for (const FNGridPos direction :
                 {FNGridPos(-1, 0), FNGridPos(-1, -1), FNGridPos(0, -1), FNGridPos(1, -1)})
                if (const FNGridPos before = pos + direction; view.inside(before) && group(before) != none)
                    sets.join(group(before), group(pos));
        }
    struct Group {
        int pixels = 0;
        bool touchesMask = false;
    };
    std::vector<Group> found(sets.size());
    for (FNGridPos pos; pos.y < view.height(); ++pos.y)
        for (pos.x = 0; pos.x < view.width(); ++pos.x) {
            if (group(pos) == none) continue;
            Group& own = found[static_cast<std::size_t>(sets.find(group(pos)))];
            ++own.pixels;
            own.touchesMask |= view.touches(masked, pos);
        }
    return std::any_of(found.begin(), found.end(),
                       [](const Group& g) { return g.pixels > mostPixels && !g.touchesMask; });
}

float backgroundUniformity(const FNImage<Fn::Bgra32>& source, FNPos sourceEye0, FNPos sourceEye1) {
    constexpr int tolerance = 7;
    constexpr std::int32_t corner = 10;
    using Steps = BackgroundUniformity;
    const UpperBody body(source, sourceEye0, sourceEye1);
    if (body.image.empty()) return 0;
    const FNBox all = body.image.box();
    Labels labels = Steps::segment(body.image, maskOf(body.image, body.eye0, body.eye1), tolerance);
    const int background = mostFrequent(labels, FNBox{0, 0, corner, corner} & all, labels(0, 0));
    const std::vector<Region> regions = Steps::mergeRegionsToBackground(body.image, labels, background);
    if (mostFrequent(labels, FNBox{all.x1 - corner, 0, all.x1, corner} & all, background) != background)
        return 0;

    const FNGridPos middle((body.eye0 + body.eye1) / 2.0f);
    const int head = all.contains(middle) ? LabelView(labels)(middle) : masked;
    const bool uniform =
        !Steps::thereAreObjectsTouchingShoulders(labels, regions, background, head) &&
        Steps::newRegionGradient(body.image, regions[static_cast<std::size_t>(background)], labels) &&
        !Steps::thereAreIsolatedRegionsInsideBackground(labels, background);
    return uniform ? 1 : 0;
}

} // namespace Cmp::Portrait

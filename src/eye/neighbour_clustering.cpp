#include "eye/neighbour_clustering.h"

#include "fn/exception.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <numeric>

namespace Eye {
namespace {

/// Largest ratio of the sizes of neighbours.
constexpr float mostSizeRatio = 1.4f;
/// Twice the squared pixel, a hair more so that a diagonal step of one pixel is inside whatever the rounding.
constexpr float twiceSquaredPixel = 2.000002384185791f;

float sizeOf(const FaceFinderClusteringItem& item) {
    return item.width;
}
float sizeOf(const FacialFeatureLocation& item) {
    return item.size;
}

template <class Visit> void forEachVote(const FaceFinderClusteringItem& item, Visit visit) {
    for (const auto& [angle, confidence] : item.votes) visit(angle, confidence);
}
template <class Visit> void forEachVote(const FacialFeatureLocation& item, Visit visit) {
    visit(0.0f, item.confidence);
}

/// Weighted means over the votes of a cluster.
struct Sums {
    double weight = 0, size = 0, angle = 0;
    float x = 0, y = 0;
    float confidence = -std::numeric_limits<float>::infinity();

    template <class Item> void add(const Item& item) {
        forEachVote(item, [&](float voteAngle, float voteConfidence) {
            const double size_ = sizeOf(item);
            const double g = std::exp(double{voteConfidence}) * size_ * size_;
            weight += g;
            size += g * size_;
            angle += g * voteAngle;
            x += static_cast<float>(g) * item.pos.x;
            y += static_cast<float>(g) * item.pos.y;
            confidence = std::max(confidence, voteConfidence);
        });
    }
    FNPos meanPos() const { return {x / static_cast<float>(weight), y / static_cast<float>(weight)}; }
    float meanSize() const { return static_cast<float>(size / weight); }
    float meanAngle() const { return static_cast<float>(angle / weight); }
};

void represent(const Sums& sums, FaceFinder::Location& result) {
    result = {sums.meanPos(), sums.meanSize(), sums.confidence, sums.meanAngle()};
}
void represent(const Sums& sums, FacialFeatureLocation& result) {
    result = {sums.meanPos(), sums.meanSize(), sums.confidence};
}

} // namespace

template <class Item, class Result>
NeighbourClustering<Item, Result>::NeighbourClustering(float distance, std::size_t maxNofElements)
    : distance_(distance), maxNofElements_(maxNofElements) {
    if constexpr (std::is_same_v<Item, FaceFinderClusteringItem>)
        if (maxNofElements != 0)
            FN_THROW(FNEBadArg,
                     "Eye::NeighbourClustering : Do not use input type 'FaceFinderClusteringItem' when you "
                     "set maxNofElements!=0");
}

template <class Item, class Result> void NeighbourClustering<Item, Result>::add(const Item& item) {
    items_.push_back(item);
    if constexpr (std::is_same_v<Item, FacialFeatureLocation>) {
        if (maxNofElements_ == 0 || items_.size() <= maxNofElements_) return;
        std::stable_sort(items_.begin(), items_.end(), MoreConfident());
        items_.pop_back();
    }
}

/// For each item the lowest index of its cluster.
template <class Item, class Result>
std::vector<std::size_t> NeighbourClustering<Item, Result>::rootsOfItems() const {
    std::vector<std::size_t> parent(items_.size());
    std::iota(parent.begin(), parent.end(), std::size_t{0});
    const auto root = [&](std::size_t i) {
        while (parent[i] != i) i = parent[i] = parent[parent[i]];
        return i;
    };

    // A sweep along x: beyond the greatest distance of neighbours nothing has to be compared.
    std::vector<std::size_t> byX(items_.size());
    std::iota(byX.begin(), byX.end(), std::size_t{0});
    std::sort(byX.begin(), byX.end(),
              [&](std::size_t a, std::size_t b) { return items_[a].pos.x < items_[b].pos.x; });
    const float threshold = twiceSquaredPixel / (distance_ * distance_);
    const float reachPerSize = 1.01f * std::sqrt(threshold) * (1 + mostSizeRatio) / 2;
    for (std::size_t first = 0; first < byX.size(); ++first) {
        const Item& a = items_[byX[first]];
        for (std::size_t second = first + 1; second < byX.size(); ++second) {
            const Item& b = items_[byX[second]];
            if (b.pos.x - a.pos.x > reachPerSize * sizeOf(a)) break;
            const auto [smaller, larger] = std::minmax({sizeOf(a), sizeOf(b)});
            const FNPos step = b.pos - a.pos;
            const float mean = (smaller + larger) / 2;
            if (larger > mostSizeRatio * smaller || dot(step, step) > threshold * mean * mean) continue;
            const auto [low, high] = std::minmax({root(byX[first]), root(byX[second])});
            parent[high] = low;
        }
    }
    for (std::size_t i = 0; i < parent.size(); ++i) parent[i] = root(i);
    return parent;
}

template <class Item, class Result>
bool NeighbourClustering<Item, Result>::computeClusterRepresentations(Results& results) const {
    const std::vector<std::size_t> roots = rootsOfItems();
    std::map<std::size_t, Sums> clusters; // by the lowest index of their items
    for (std::size_t i = 0; i < items_.size(); ++i) clusters[roots[i]].add(items_[i]);
    for (const auto& [lowest, sums] : clusters) {
        Result result;
        represent(sums, result);
        results.insert(result);
    }
    return !items_.empty();
}

template class NeighbourClustering<FaceFinderClusteringItem, FaceFinder::Location>;
template class NeighbourClustering<FacialFeatureLocation, FacialFeatureLocation>;

} // namespace Eye

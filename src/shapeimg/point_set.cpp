#include "shapeimg/point_set.h"

#include "shapeimg/kd_tree.h"

#include <algorithm>

namespace ShapeImage {

class PointSet::Impl {
public:
    Impl(const std::vector<Vector>& points, const FNRMem<bool>& mask, unsigned int size, bool removeOutliers)
        : tree(points, mask, removeOutliers), neighbourhoodSize(size) {}

    KdTree tree;
    unsigned int neighbourhoodSize;
};

namespace {

FNRMem<bool> allOf(std::size_t n) {
    FNRMem<bool> mask(n);
    std::fill_n(mask.getExclusive(), n, true);
    return mask;
}

/// A queue that takes no more memory than there are points.
KdTree::Queue queueFor(const KdTree& tree, unsigned int size) {
    return KdTree::Queue(std::min<std::size_t>(size, tree.size()));
}

PointSet::Neighbourhood neighbourhoodOf(const KdTree& tree, const KdTree::Queue& queue) {
    const auto& found = queue.entries();
    FNRMem<PointSet::Neighbour> neighbours(found.size());
    PointSet::Neighbour* const out = neighbours.getExclusive();
    std::transform(found.begin(), found.end(), out, [&](const auto& entry) {
        return PointSet::Neighbour{tree.points()[static_cast<std::size_t>(entry.value)], entry.value,
                                   std::sqrt(entry.priority)};
    });
    std::sort(out, out + found.size(), [](const auto& a, const auto& b) {
        return a.distance < b.distance || (a.distance == b.distance && a.index < b.index);
    });
    return PointSet::Neighbourhood(neighbours);
}

std::span<const TreePoint> validOf(const KdTree& tree) {
    if (tree.size() == 0) FN_THROW(FNEBadFunCall, "PointSet: there are no points");
    return tree.sorted();
}

} // namespace

PointSet::PointSet() : PointSet(std::vector<Vector>()) {}

PointSet::PointSet(const std::vector<Vector>& points, unsigned int neighbourhoodSize, bool removeOutliers)
    : impl_(new Impl(points, allOf(points.size()), neighbourhoodSize, removeOutliers)) {}

PointSet::PointSet(const std::vector<Vector>& points, FNRMem<bool>& mask, unsigned int neighbourhoodSize,
                   bool removeOutliers)
    : impl_(new Impl(points, mask, neighbourhoodSize, removeOutliers)) {
    mask = impl_->tree.visible();
}

PointSet::PointSet(const PointSet&) = default;
PointSet& PointSet::operator=(const PointSet&) = default;
PointSet::~PointSet() = default;

PointSet::Impl& PointSet::writable() {
    if (impl_.count() > 1) impl_ = FNCountedPtr<Impl>(new Impl(*impl_));
    return *impl_;
}

std::size_t PointSet::size() const {
    return impl_->tree.points().size();
}
std::size_t PointSet::validSize() const {
    return impl_->tree.size();
}

const PointSet::Vector& PointSet::point(std::int32_t index) const {
    if (index < 0 || static_cast<std::size_t>(index) >= size())
        FN_THROW(FNEOutOfRange, "PointSet: no such point");
    return impl_->tree.points()[static_cast<std::size_t>(index)];
}
bool PointSet::valid(std::int32_t index) const {
    point(index);
    return mask().data()[index];
}
std::span<const PointSet::Vector> PointSet::points() const {
    return impl_->tree.points();
}
const FNRMem<bool>& PointSet::mask() const {
    return impl_->tree.visible();
}

unsigned int PointSet::neighbourhoodSize() const {
    return impl_->neighbourhoodSize;
}
void PointSet::setNeighbourhoodSize(unsigned int size) {
    writable().neighbourhoodSize = size;
}

PointSet::Neighbourhood PointSet::findClosest(const Vector& point, double radius) const {
    return findClosest(point, radius, impl_->neighbourhoodSize);
}

PointSet::Neighbourhood PointSet::findClosest(const Vector& point, double radius, unsigned int size) const {
    const KdTree& tree = impl_->tree;
    KdTree::Queue queue = queueFor(tree, size);
    tree.findClosest(point, radius, queue);
    return neighbourhoodOf(tree, queue);
}

PointSet::Neighbourhood PointSet::findClosest(const Vector& point, const Filter& filter,
                                              double radius) const {
    const KdTree& tree = impl_->tree;
    KdTree::Queue queue = queueFor(tree, impl_->neighbourhoodSize);
    tree.findClosest(point, radius, filter, queue);
    return neighbourhoodOf(tree, queue);
}

PointSet::Neighbourhood PointSet::findClosestToRay(const Vector& start, const Vector& direction,
                                                   double radius) const {
    const KdTree& tree = impl_->tree;
    KdTree::Queue queue = queueFor(tree, impl_->neighbourhoodSize);
    tree.findClosestToRay(Ray(start, direction), radius, queue);
    return neighbourhoodOf(tree, queue);
}

Fn::Optional<PointSet::Vector> PointSet::estimateRayIntersection(const Vector& start, const Vector& direction,
                                                                 double radius) const {
    struct Hit {
        double along, squaredDistance;
    };
    const Ray ray(start, direction);
    std::vector<Hit> hits;
    double first = std::numeric_limits<double>::infinity();
    impl_->tree.visitTube(ray, radius, [&](const TreePoint& p) {
        const double along = ray.parameter(p.position);
        if (along < 0) return;
        hits.push_back({along, ray.squaredDistance(p.position)});
        first = std::min(first, along);
    });
    if (hits.empty()) return {};

    // The least weight keeps a layer whose points all lie at the radius itself.
    constexpr double leastWeight = 1e-9;
    double sum = 0, weights = 0;
    for (const Hit& hit : hits) {
        if (hit.along > first + 2 * radius) continue;
        const double fall = radius > 0 ? hit.squaredDistance / (radius * radius) : 0;
        const double weight = std::max(1 - fall, leastWeight);
        sum += weight * hit.along;
        weights += weight;
    }
    return ray.at(sum / weights);
}

PointSet::Vector PointSet::center() const {
    return Node::getSpread(validOf(impl_->tree)).mean;
}

PointSet::Vector PointSet::lowBoundingBoxCorner() const {
    return {minXPoint().x, minYPoint().y, minZPoint().z};
}
PointSet::Vector PointSet::highBoundingBoxCorner() const {
    return {maxXPoint().x, maxYPoint().y, maxZPoint().z};
}

/// @param sign 1 for the greatest, -1 for the least
PointSet::Vector PointSet::extremePoint(int axis, double sign) const {
    const auto points = validOf(impl_->tree);
    return std::min_element(points.begin(), points.end(),
                            [&](const TreePoint& a, const TreePoint& b) {
                                const double u = sign * a.position[axis], v = sign * b.position[axis];
                                return u > v || (u == v && a.index < b.index);
                            })
        ->position;
}

PointSet::Vector PointSet::minXPoint() const {
    return extremePoint(0, -1);
}
PointSet::Vector PointSet::maxXPoint() const {
    return extremePoint(0, 1);
}
PointSet::Vector PointSet::minYPoint() const {
    return extremePoint(1, -1);
}
PointSet::Vector PointSet::maxYPoint() const {
    return extremePoint(1, 1);
}
PointSet::Vector PointSet::minZPoint() const {
    return extremePoint(2, -1);
}
PointSet::Vector PointSet::maxZPoint() const {
    return extremePoint(2, 1);
}

void PointSet::affineTransform(const Vector& translation, const FN3Matrix<double>& matrix) {
    writable().tree.affineTransform(translation, matrix);
}

} // namespace ShapeImage

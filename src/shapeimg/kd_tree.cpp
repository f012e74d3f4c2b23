#include "shapeimg/kd_tree.h"

#include <algorithm>

namespace ShapeImage {

namespace {

constexpr std::int32_t leafSize = 8;

struct Box {
    Node::Vector low, high;
};

Box boxOf(std::span<const TreePoint> points) {
    Box box{points[0].position, points[0].position};
    for (const TreePoint& p : points)
        for (int axis = 0; axis < 3; ++axis) {
            box.low[axis] = std::min(box.low[axis], p.position[axis]);
            box.high[axis] = std::max(box.high[axis], p.position[axis]);
        }
    return box;
}

int longestSide(const Box& box) {
    const Node::Vector extent = box.high - box.low;
    return extent.x >= extent.y && extent.x >= extent.z ? 0 : extent.y >= extent.z ? 1 : 2;
}

/// Squares of such coordinates, and sums of them, are finite.
bool isUsable(const Node::Vector& p) {
    constexpr double greatest = 1e100;
    return std::fabs(p.x) <= greatest && std::fabs(p.y) <= greatest && std::fabs(p.z) <= greatest;
}

struct Everything {
    bool operator()(std::int32_t) const { return true; }
};

} // namespace

Node::Spread Node::getSpread(std::span<const TreePoint> points) {
    Spread spread;
    if (points.empty()) return spread;
    const double n = static_cast<double>(points.size());
    for (const TreePoint& p : points) spread.mean += p.position / n;
    for (const TreePoint& p : points)
        for (int axis = 0; axis < 3; ++axis) {
            const double d = p.position[axis] - spread.mean[axis];
            spread.variance[axis] += d * d / n;
        }
    return spread;
}

KdTree::KdTree(const std::vector<Vector>& points, const FNRMem<bool>& visible, bool removeOutliers)
    : points_(points), visible_(visible) {
    if (visible.size() != points.size()) FN_THROW(FNEBadArg, "KdTree: numbers of points and flags differ");
    if (points.size() > static_cast<std::size_t>(std::numeric_limits<std::int32_t>::max()))
        FN_THROW(FNEBadArg, "KdTree: too many points");
    build(removeOutliers);
}

void KdTree::build(bool removeOutliers) {
    createTree();
    if (removeOutliers) maskOutliers();
}

void KdTree::createTree() {
    sorted_.clear();
    nodes_.clear();
    const auto n = static_cast<std::int32_t>(points_.size());
    for (std::int32_t i = 0; i < n; ++i) {
        const Vector& p = points_[static_cast<std::size_t>(i)];
        if (!visible_.data()[i]) continue;
        if (isUsable(p))
            sorted_.push_back({p, i});
        else
            hide(i);
    }
    if (!sorted_.empty()) createNode(0, static_cast<std::int32_t>(sorted_.size()));
}

/// Makes the node of a range of points, and all below it. @return its number
std::int32_t KdTree::createNode(std::int32_t first, std::int32_t count) {
    const auto number = static_cast<std::int32_t>(nodes_.size());
    const std::span<TreePoint> range(sorted_.data() + first, static_cast<std::size_t>(count));
    const Box box = boxOf(range);
    Node node;
    node.first = first;
    node.count = count;
    node.center = box.low + (box.high - box.low) / 2.0;
    // A little more, for rounding.
    node.radius = std::max(length(box.high - node.center), length(node.center - box.low)) * (1 + 1e-12);
    nodes_.push_back(node);

    if (count > leafSize) {
        node.axis = longestSide(box);
        const std::int32_t half = count / 2;
        const auto before = [axis = node.axis](const TreePoint& a, const TreePoint& b) {
            const double u = a.position[axis], v = b.position[axis];
            return u < v || (u == v && a.index < b.index);
        };
        std::nth_element(range.begin(), range.begin() + half, range.end(), before);
        node.rightBegin = range[static_cast<std::size_t>(half)].position[node.axis];
        node.leftEnd = std::max_element(range.begin(), range.begin() + half, before)->position[node.axis];
        createNode(first, half);
        node.right = createNode(first + half, count - half);
    }
    node.end = static_cast<std::int32_t>(nodes_.size());
    nodes_[static_cast<std::size_t>(number)] = node;
    return number;
}

void KdTree::affineTransform(const Vector& translation, const FN3Matrix<double>& matrix) {
    for (Vector& p : points_) p = matrix * p + translation;
    createTree();
}

void KdTree::findClosest(const Vector& point, double radius, Queue& queue) const {
    findClosest(point, radius, Everything(), queue);
}

void KdTree::findClosestToRay(const Ray& ray, double radius, Queue& queue) const {
    if (!hasAnswer(radius, queue)) return;
    double limit = radius * radius;
    // Nodes yet to be looked at, with the least squared distance that a point below can have.
    struct Open {
        std::int32_t node;
        double distance;
    };
    const auto open = [&](std::int32_t i) {
        const Node& n = nodes_[static_cast<std::size_t>(i)];
        const double d = std::max(0.0, std::sqrt(ray.squaredDistance(n.center)) - n.radius);
        return Open{i, d * d};
    };
    std::vector<Open> stack{open(0)};
    while (!stack.empty()) {
        const Open next = stack.back();
        stack.pop_back();
        if (next.distance > limit) continue;
        const Node& n = nodes_[static_cast<std::size_t>(next.node)];
        if (n.axis != Node::leaf) {
            Open nearer = open(next.node + 1), further = open(n.right);
            if (further.distance < nearer.distance) std::swap(nearer, further);
            stack.push_back(further);
            stack.push_back(nearer);
            continue;
        }
        for (std::int32_t i = n.first; i < n.first + n.count; ++i) {
            const TreePoint& p = sorted_[static_cast<std::size_t>(i)];
            const double distance = ray.squaredDistance(p.position);
            if (!(distance <= limit)) continue;
            queue.push(p.index, static_cast<float>(distance));
            if (queue.full()) limit = std::min(limit, static_cast<double>(queue.top().priority));
        }
    }
}

} // namespace ShapeImage

#pragma once

#include "fn/rmem.h"
#include "fn/vector3.h"
#include "shapeimg/max_priority_queue.h"
#include "shapeimg/ray.h"

#include <cstdint>
#include <limits>
#include <span>
#include <vector>

namespace ShapeImage {

/// A point of a tree: its position, and its number in the array that the tree was made of.
struct TreePoint {
    FN3Vector<double> position;
    std::int32_t index;
};

/// A part of a tree. Nodes lie in the order of a walk that goes left first: an inner node's left child is the
/// next one. The points below a node follow each other in the tree's array.
struct Node {
    using Vector = FN3Vector<double>;

    static constexpr std::int32_t leaf = -1;

    /// What is below, along `axis`: the left child ends at `leftEnd`, the right one begins at `rightBegin`.
    double leftEnd = 0;
    double rightBegin = 0;
    std::int32_t axis = leaf; ///< 0, 1 or 2 for x, y, z; `leaf` for a node without children
    std::int32_t right = 0;   ///< the right child
    std::int32_t end = 0;     ///< behind the last node below
    std::int32_t first = 0;   ///< the first point below
    std::int32_t count = 0;   ///< number of points below
    /// A ball around all points below.
    Vector center;
    double radius = 0;

    struct Spread {
        Vector mean;
        Vector variance;
    };
    /// Mean and variances of the coordinates; all zero for no points.
    static Spread getSpread(std::span<const TreePoint> points);
};

/// A binary tree over points of space, for queries of neighbours (J. L. Bentley, "Multidimensional binary
/// search trees used for associative searching", 1975; the incremental distances of S. Arya and D. M. Mount,
/// "Algorithms for fast vector quantization", 1993).
///
/// Each inner node splits its points in two halves across their greatest extent; leaves hold up to 8. Points
/// can be hidden: they stay in the array with their flag cleared, and no query finds them. Points that are
/// not finite, or further out than 1e100, are hidden from the start. Queries may run on any number of
/// threads.
class KdTree {
public:
    using Vector = FN3Vector<double>;
    using Queue = MaxPriorityQueue<std::int32_t, float>;

    /// How many points each run of the removal of outliers has hidden.
    struct Removed {
        std::size_t byDistance = 0;
        std::size_t byCell = 0;
        std::size_t byConnection = 0;
    };

    /// @param visible one for each point
    /// @throws FNEBadArg if there are not as many flags as points, or more than 2^31 - 1 of them
    KdTree(const std::vector<Vector>& points, const FNRMem<bool>& visible, bool removeOutliers);

    const std::vector<Vector>& points() const noexcept { return points_; }
    const FNRMem<bool>& visible() const noexcept { return visible_; }
    /// Number of points that are not hidden.
    std::size_t size() const noexcept { return sorted_.size(); }
    /// The points that are not hidden, in the tree's order.
    std::span<const TreePoint> sorted() const noexcept { return sorted_; }

    /// Hides outliers, reports their numbers to the log, and makes the tree anew.
    ///
    /// 1. Points with a squared distance from the mean above 4 times the sum of the three variances.
    /// 2. With the rest in a grid of cells: the points of cells that, together with the up to 26 cells around
    ///    them, hold less than an eighth of what the median cell does.
    /// 3. The points of cells that are not connected, over cells with points side by side, with the largest
    ///    part.
    Removed maskOutliers();

    /// Replaces each point p, hidden ones too, by matrix * p + translation.
    void affineTransform(const Vector& translation, const FN3Matrix<double>& matrix);

    /// Puts the numbers of the points nearest to `point`, with their squared distances, into the queue.
    /// @param filter called with the number of a point: whether it counts
    template <class Filter>
    void findClosest(const Vector& point, double radius, const Filter& filter, Queue& queue) const;
    void findClosest(const Vector& point, double radius, Queue& queue) const;
    /// The same with distances from a half-line.
    void findClosestToRay(const Ray& ray, double radius, Queue& queue) const;
    /// Calls `visit` with each point in the tube of the given radius around a half-line.
    template <class Visit> void visitTube(const Ray& ray, double radius, const Visit& visit) const;

private:
    /// The cells of a regular grid that hold points.
    struct Cells;
    template <class Filter> class PointQuery;

    void build(bool removeOutliers);
    void createTree();
    std::int32_t createNode(std::int32_t first, std::int32_t count);
    bool hasAnswer(double radius, const Queue& queue) const {
        return !nodes_.empty() && radius >= 0 && queue.capacity() != 0;
    }
    void hide(std::int32_t index) { visible_.getExclusive()[index] = false; }

    std::size_t removeOutliersByDistance();
    Cells buildCells() const;
    static void connectCells(Cells& cells);
    std::size_t removeOutliersByCell(const Cells& cells);
    std::size_t removeOutliersByConnection(const Cells& cells);
    double cellSize() const;

    std::vector<Vector> points_;
    FNRMem<bool> visible_;
    std::vector<TreePoint> sorted_; ///< in the order of the leaves
    std::vector<Node> nodes_;       ///< the root first; none without points
};

/// One walk down the tree.
template <class Filter> class KdTree::PointQuery {
public:
    PointQuery(const KdTree& tree, const Vector& point, double radius, const Filter& filter, Queue& queue)
        : nodes_(tree.nodes_.data()), sorted_(tree.sorted_.data()), point_(point), filter_(filter),
          queue_(queue), limit_(radius * radius) {}

    void run() { walk(0, 0); }

private:
    /// @param distance lower bound of the squared distances below the node: the squares of `beyond_` added
    void walk(std::int32_t node, double distance) {
        const Node& n = nodes_[node];
        if (n.axis == Node::leaf) return scan(n);
        const double toLeft = point_[n.axis] - n.leftEnd, toRight = point_[n.axis] - n.rightBegin;
        const bool leftFirst = toLeft + toRight < 0;
        walk(leftFirst ? node + 1 : n.right, distance);

        const double gap = leftFirst ? toRight : toLeft;
        double& beyond = beyond_[n.axis];
        const double before = beyond, farDistance = distance + gap * gap - before;
        if (!(farDistance <= limit_)) return;
        beyond = gap * gap;
        walk(leftFirst ? n.right : node + 1, farDistance);
        beyond = before;
    }

    void scan(const Node& n) {
        for (const TreePoint *p = sorted_ + n.first, *end = p + n.count; p != end; ++p) {
            const Vector d = p->position - point_;
            const double distance = dot(d, d);
            if (!(distance <= limit_) || !filter_(p->index)) continue;
            queue_.push(p->index, static_cast<float>(distance));
            if (queue_.full()) limit_ = std::min(limit_, static_cast<double>(queue_.top().priority));
        }
    }

    const Node* nodes_;
    const TreePoint* sorted_;
    Vector point_;
    const Filter& filter_;
    Queue& queue_;
    double limit_;  ///< squared distance beyond which nothing counts
    Vector beyond_; ///< by axis: squared distance from the point to the present part of the tree
};

template <class Filter>
void KdTree::findClosest(const Vector& point, double radius, const Filter& filter, Queue& queue) const {
    if (hasAnswer(radius, queue)) PointQuery<Filter>(*this, point, radius, filter, queue).run();
}

template <class Visit> void KdTree::visitTube(const Ray& ray, double radius, const Visit& visit) const {
    if (!(radius >= 0)) return;
    for (std::size_t i = 0; i < nodes_.size();) {
        const Node& n = nodes_[i];
        const double reach = radius + n.radius;
        const bool near = ray.squaredDistance(n.center) <= reach * reach;
        if (near && n.axis == Node::leaf)
            for (const TreePoint& p :
                 sorted().subspan(static_cast<std::size_t>(n.first), static_cast<std::size_t>(n.count)))
                if (ray.squaredDistance(p.position) <= radius * radius) visit(p);
        i = near || n.axis == Node::leaf ? i + 1 : static_cast<std::size_t>(n.end);
    }
}

} // namespace ShapeImage

#include "fn/message/dialog.h"
#include "shapeimg/kd_tree.h"

#include <algorithm>
#include <numeric>

namespace ShapeImage {

namespace {

/// A point is kept up to this many sums of the variances of squared distance from the mean.
constexpr double distanceFactor = 4;
/// A cell is thin if its surroundings hold less than the median over all cells, divided by this.
constexpr std::int32_t thinness = 8;

/// The cell size is 3 times the median distance of points from their 8th neighbour: on an even surface, a
/// cell then holds about 18 points. The median is taken over up to 1000 points.
constexpr std::size_t spacingNeighbours = 8, spacingSamples = 1000;
constexpr double spacingsPerCell = 3;

/// Cells along one axis at most, so that three cell numbers fit into 63 bits with a margin on all sides.
constexpr double mostCells = 1 << 20;
constexpr int axisBits = 21;

using Key = std::uint64_t;

Key keyOf(Key x, Key y, Key z) {
    return (z << axisBits | y) << axisBits | x;
}

template <class T> T medianOf(std::vector<T> values) {
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

} // namespace

struct KdTree::Cells {
    struct Cell {
        Key key;
        std::size_t first; ///< among `members`
        std::size_t count;
        std::size_t part; ///< number of a cell of the same part; of itself for the part's representative
    };
    std::vector<Cell> cells;           ///< by ascending key
    std::vector<std::int32_t> members; ///< numbers of points, cell by cell

    /// Calls `visit` with the numbers of the cells with points around a cell, without itself.
    template <class Visit> void visitNeighbours(std::size_t cell, const Visit& visit) const {
        // Runs of three cells along x have keys that follow each other.
        for (int dz = -1; dz <= 1; ++dz)
            for (int dy = -1; dy <= 1; ++dy) {
                const Key middle = cells[cell].key + (static_cast<Key>(dz) << 2 * axisBits) +
                                   (static_cast<Key>(dy) << axisBits);
                auto it = std::lower_bound(cells.begin(), cells.end(), middle - 1,
                                           [](const Cell& c, Key key) { return c.key < key; });
                for (; it != cells.end() && it->key <= middle + 1; ++it)
                    if (const auto other = static_cast<std::size_t>(it - cells.begin()); other != cell)
                        visit(other);
            }
    }

    std::size_t representative(std::size_t cell) const {
        while (cells[cell].part != cell) cell = cells[cell].part;
        return cell;
    }
};

KdTree::Removed KdTree::maskOutliers() {
    Removed removed;
    if (size() == 0) return removed;
    removed.byDistance = removeOutliersByDistance();
    createTree();
    if (size() != 0) {
        Cells cells = buildCells();
        connectCells(cells);
        removed.byCell = removeOutliersByCell(cells);
        removed.byConnection = removeOutliersByConnection(cells);
        createTree();
    }
    FNDialog::log("Tree has " + std::to_string(size()) + " points (" + std::to_string(removed.byDistance) +
                  " removed in 1st run; " + std::to_string(removed.byCell) + " removed in 2nd run; " +
                  std::to_string(removed.byConnection) + " removed in 3rd run) ");
    return removed;
}

std::size_t KdTree::removeOutliersByDistance() {
    const auto [mean, variance] = Node::getSpread(sorted_);
    const double limit = distanceFactor * (variance.x + variance.y + variance.z);
    std::size_t removed = 0;
    for (const TreePoint& p : sorted_) {
        const Vector d = p.position - mean;
        if (dot(d, d) <= limit) continue;
        hide(p.index);
        ++removed;
    }
    return removed;
}

double KdTree::cellSize() const {
    const std::size_t samples = std::min(size(), spacingSamples);
    std::vector<float> squares;
    for (std::size_t i = 0; i < samples; ++i) {
        Queue queue(spacingNeighbours + 1); // the point itself is the first
        findClosest(sorted_[i * size() / samples].position, std::numeric_limits<double>::infinity(), queue);
        squares.push_back(queue.top().priority);
    }
    return spacingsPerCell * std::sqrt(static_cast<double>(medianOf(squares)));
}

KdTree::Cells KdTree::buildCells() const {
    // The root's ball reaches around everything; its box may be smaller, but what counts are differences.
    const Node& root = nodes_.front();
    const Vector low = root.center - Vector{root.radius, root.radius, root.radius};
    double size = std::max(cellSize(), 2 * root.radius / (mostCells - 2));
    if (!(size > 0)) size = 1; // all points are the same

    const auto cellOf = [&](const Vector& p) {
        const Vector v = (p - low) / size;
        const auto along = [](double x) { return static_cast<Key>(std::clamp(x, 0.0, mostCells)) + 1; };
        return keyOf(along(v.x), along(v.y), along(v.z));
    };
    std::vector<std::pair<Key, std::int32_t>> keyed;
    keyed.reserve(sorted_.size());
    for (const TreePoint& p : sorted_) keyed.emplace_back(cellOf(p.position), p.index);
    std::sort(keyed.begin(), keyed.end());

    Cells result;
    for (const auto& [key, index] : keyed) {
        if (result.cells.empty() || result.cells.back().key != key)
            result.cells.push_back({key, result.members.size(), 0, result.cells.size()});
        ++result.cells.back().count;
        result.members.push_back(index);
    }
    return result;
}

void KdTree::connectCells(Cells& cells) {
    // Union by the lower number, with shortened paths.
    for (std::size_t i = 0; i < cells.cells.size(); ++i)
        cells.visitNeighbours(i, [&](std::size_t other) {
            const std::size_t a = cells.representative(i), b = cells.representative(other);
            cells.cells[std::max(a, b)].part = std::min(a, b);
            cells.cells[i].part = cells.cells[other].part = std::min(a, b);
        });
    for (std::size_t i = 0; i < cells.cells.size(); ++i) cells.cells[i].part = cells.representative(i);
}

std::size_t KdTree::removeOutliersByCell(const Cells& cells) {
    std::vector<std::size_t> surroundings;
    for (std::size_t i = 0; i < cells.cells.size(); ++i) {
        surroundings.push_back(cells.cells[i].count);
        cells.visitNeighbours(i, [&](std::size_t other) { surroundings[i] += cells.cells[other].count; });
    }
    const std::size_t median = medianOf(surroundings);
    std::size_t removed = 0;
    for (std::size_t i = 0; i < cells.cells.size(); ++i) {
        if (surroundings[i] * thinness >= median) continue;
        const auto& cell = cells.cells[i];
        for (std::size_t m = cell.first; m < cell.first + cell.count; ++m) hide(cells.members[m]);
        removed += cell.count;
    }
    return removed;
}

std::size_t KdTree::removeOutliersByConnection(const Cells& cells) {
    const auto& all = cells.cells;
    // Points that the second run has hidden do not count.
    std::vector<std::size_t> sizes(all.size());
    for (const auto& cell : all)
        for (std::size_t m = cell.first; m < cell.first + cell.count; ++m)
            sizes[cell.part] += visible_.data()[cells.members[m]];
    const auto main = static_cast<std::size_t>(std::max_element(sizes.begin(), sizes.end()) - sizes.begin());
    std::size_t removed = 0;
    for (const auto& cell : all) {
        if (cell.part == main) continue;
        for (std::size_t m = cell.first; m < cell.first + cell.count; ++m)
            if (visible_.data()[cells.members[m]]) {
                hide(cells.members[m]);
                ++removed;
            }
    }
    return removed;
}

} // namespace ShapeImage

#pragma once

#include "fn/cptr.h"
#include "fn/optional.h"
#include "fn/rmem.h"
#include "fn/vector3.h"

#include <cstdint>
#include <functional>
#include <span>
#include <vector>

namespace ShapeImage {

class KdTree;

/// A cloud of points with a tree for queries of neighbours.
///
/// The points keep the numbers that they have in the array which the set was made of. Those that the mask
/// leaves out, that are not finite, or that were taken for outliers keep their numbers, too, but are not
/// valid: nothing below but point() and valid() knows of them. Copies share points and tree until one of them
/// is transformed. Queries may run on any number of threads.
///
///     const ShapeImage::PointSet cloud(points, 16, true);
///     for (const auto& near : cloud.findClosest(nose, 5.0)) use(near.point, near.distance);
class PointSet {
public:
    using Vector = FN3Vector<double>;
    /// Whether the point of a number counts.
    using Filter = std::function<bool(std::int32_t index)>;

    static constexpr unsigned int defaultNeighbourhoodSize = 32;

    struct Neighbour {
        Vector point;
        std::int32_t index; ///< the point's number
        float distance;     ///< from the position or ray asked for
    };
    /// Points near a position, nearest first. Copies share them.
    class Neighbourhood {
    public:
        Neighbourhood() = default;
        explicit Neighbourhood(const FNRMem<Neighbour>& neighbours) : neighbours_(neighbours) {}
        std::size_t size() const noexcept { return neighbours_.size(); }
        bool empty() const noexcept { return neighbours_.empty(); }
        const Neighbour& operator[](std::size_t i) const { return neighbours_[i]; }
        const Neighbour* begin() const noexcept { return neighbours_.begin(); }
        const Neighbour* end() const noexcept { return neighbours_.end(); }

    private:
        FNRMem<Neighbour> neighbours_;
    };

    /// Without points.
    PointSet();
    /// @param neighbourhoodSize the most points that a query finds
    explicit PointSet(const std::vector<Vector>& points,
                      unsigned int neighbourhoodSize = defaultNeighbourhoodSize, bool removeOutliers = false);
    /// @param mask which points count; cleared for those that turn out not to be valid
    /// @throws FNEBadArg if the mask has not one flag for each point.
    PointSet(const std::vector<Vector>& points, FNRMem<bool>& mask,
             unsigned int neighbourhoodSize = defaultNeighbourhoodSize, bool removeOutliers = false);

    PointSet(const PointSet&);
    PointSet& operator=(const PointSet&);
    ~PointSet();

    /// Number of points, valid or not.
    std::size_t size() const;
    /// Number of valid points.
    std::size_t validSize() const;
    bool empty() const { return validSize() == 0; }
    /// @throws FNEOutOfRange
    const Vector& point(std::int32_t index) const;
    bool valid(std::int32_t index) const;
    std::span<const Vector> points() const;
    const FNRMem<bool>& mask() const;

    unsigned int neighbourhoodSize() const;
    void setNeighbourhoodSize(unsigned int size);

    /// The valid points nearest to a position that are not further away than `radius`, as many as the
    /// neighbourhood size says. Of equally distant ones it is open which are found.
    Neighbourhood findClosest(const Vector& point, double radius) const;
    Neighbourhood findClosest(const Vector& point, double radius, unsigned int size) const;
    Neighbourhood findClosest(const Vector& point, const Filter& filter, double radius) const;
    /// The same by the distance from a half-line. @throws FNEBadArg for a zero direction.
    Neighbourhood findClosestToRay(const Vector& start, const Vector& direction, double radius) const;

    /// Where a half-line meets the surface that the points stand for: of the valid points before the start
    /// and within `radius` of the half-line, the layer that comes first (up to two radii deep) is averaged,
    /// with weights that fall to 0 at the radius. @return nothing if there are no such points.
    /// @throws FNEBadArg for a zero direction.
    Fn::Optional<Vector> estimateRayIntersection(const Vector& start, const Vector& direction,
                                                 double radius) const;

    /// Mean of the valid points. @throws FNEBadFunCall if there are none; so do the next eight.
    Vector center() const;
    Vector lowBoundingBoxCorner() const;
    Vector highBoundingBoxCorner() const;
    /// The valid point with the least or greatest coordinate; of several the one with the least number.
    Vector minXPoint() const;
    Vector maxXPoint() const;
    Vector minYPoint() const;
    Vector maxYPoint() const;
    Vector minZPoint() const;
    Vector maxZPoint() const;

    /// Replaces each point p by matrix * p + translation.
    void affineTransform(const Vector& translation,
                         const FN3Matrix<double>& matrix = FN3Matrix<double>::identity());

private:
    class Impl;

    Vector extremePoint(int axis, double sign) const;
    Impl& writable();

    FNCountedPtr<Impl> impl_;
};

} // namespace ShapeImage

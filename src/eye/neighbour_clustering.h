#pragma once

#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"

#include <set>
#include <utility>
#include <vector>

namespace Eye {

/// A window at which one or more rotations of a face were accepted.
struct FaceFinderClusteringItem {
    FNPos pos;                                  ///< centre of the window, image pixels
    float width = 0;                            ///< eye distance of the window's scale, image pixels
    std::vector<std::pair<float, float>> votes; ///< rotation in radians and confidence
};

/// Orders by descending confidence; in a multiset the first inserted of equals comes first.
struct MoreConfident {
    template <class Location> bool operator()(const Location& a, const Location& b) const {
        return a.confidence > b.confidence;
    }
};

/// Gathers accepted windows, and joins those that lie close together at similar scales: two windows are
/// neighbours if neither is larger than 1.4 times the other, and their distance is at most sqrt(2) / distance
/// of their mean size. Neighbours of neighbours belong to the same cluster.
///
/// @tparam Item FaceFinderClusteringItem or FacialFeatureLocation
/// @tparam Result FaceFinder::Location or FacialFeatureLocation
template <class Item, class Result> class NeighbourClustering {
public:
    using Results = std::multiset<Result, MoreConfident>;

    /// @param distance pixels of the trained size at which two windows sqrt(2) pixels apart are still joined
    /// @param maxNofElements only the most confident items are kept, 0 for all
    /// @throws FNEBadArg for a limit on items with several confidences
    explicit NeighbourClustering(float distance, std::size_t maxNofElements = 0);

    void add(const Item& item);
    std::size_t size() const noexcept { return items_.size(); }

    /// Adds one result for each cluster: means weighted with exp(confidence) times the squared size, and the
    /// greatest confidence. @return whether there are items
    bool computeClusterRepresentations(Results& results) const;

private:
    std::vector<std::size_t> rootsOfItems() const;

    float distance_;
    std::size_t maxNofElements_;
    std::vector<Item> items_;
};

extern template class NeighbourClustering<FaceFinderClusteringItem, FaceFinder::Location>;
extern template class NeighbourClustering<FacialFeatureLocation, FacialFeatureLocation>;

} // namespace Eye

#pragma once

#include "cmp/matches.h"

#include <span>
#include <vector>

namespace Cmp::Implementation {

/// Handle on a walk over records, each of which is compared with all probes of a search. Belongs to one
/// thread at a time.
class GalleryIterator {
public:
    /// A record and its raw score for each probe.
    struct Item {
        std::string id;
        std::vector<float> scores;
    };

    class Body {
    public:
        virtual ~Body() = default;
        /// Prepares the next record or records. @return how many are ready, 0 at the end
        virtual std::size_t loadNextItems() = 0;
        /// Compares those that are ready; holds until the next call.
        virtual std::span<const Item> compare() = 0;
        /// For each probe the counts of all scores up to now, null where none are counted.
        virtual const std::vector<ScoreHistogram>* rawScoreDistributions() const { return nullptr; }
    };

    explicit GalleryIterator(const FNCountedPtr<Body>& body) : body_(body) {}
    Body* operator->() const { return &*body_; }

private:
    FNCountedPtr<Body> body_;
};

} // namespace Cmp::Implementation

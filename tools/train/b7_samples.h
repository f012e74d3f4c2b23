#pragma once

#include "labelled/labels.h"
#include "train/training_sources.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace Train {

/// Raw vectors of B7, a byte for each component: 255 stands for the largest rank, 0 for the smallest one.
class RawVectors {
public:
    /// How the face of a picture was taken.
    enum Variant {
        asFound,        ///< landmarks of our own finders
        mirrored,       ///< the same on the mirrored picture
        jittered,       ///< landmarks of the first moved at random
        mirrorJittered, ///< landmarks of the second moved at random
        labelled,       ///< landmarks of the labels, where our finders found them too
        mirrorLabelled, ///< the same on the mirrored picture
        variants
    };
    struct Item {
        std::string file;   ///< folder and name below the root of the data
        std::string person; ///< folder and name; of a picture of an unnamed person the file
        Labelled::Split split;
        Variant variant;
        bool found; ///< by our own finders; else the labels were used
    };

    /// Raw vectors of all pictures of faces below `data`, as far as they have landmarks: all variants of
    /// those of named people in the train part, the first one of all others, those of unnamed people only of
    /// the train part. Variants teach what tells nothing about a person: places of landmarks, above all as
    /// two ways to find them differ.
    ///
    /// They are kept in `sources.cache` (two files, 1.3 GB) and read from there if they are there.
    explicit RawVectors(const TrainingSources& sources);

    std::size_t size() const { return items_.size(); }
    const Item& item(std::size_t i) const { return items_[i]; }
    std::span<const std::uint8_t> vector(std::size_t i) const {
        return {values_.data() + i * dimension_, dimension_};
    }
    std::size_t dimension() const { return dimension_; }

private:
    std::size_t dimension_;
    std::vector<Item> items_;
    std::vector<std::uint8_t> values_;
};

} // namespace Train

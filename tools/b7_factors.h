#pragma once

#include "cmp/b7/transformation.h"

#include <cstdint>
#include <iosfwd>
#include <vector>

namespace Orbek::Models {

/// The projection of B7 in the form that it is trained and shipped in: 10 MB in place of 122.
///
/// Raw components are divided into blocks, regions of the face. Each inner component is a weighted sum over
/// one block; features are inner components times a square matrix, which is a diagonal and a product of low
/// rank. All weights are small integers, and so are all sums (below 2^24, where floats are exact): unpacking
/// gives the same bytes on every machine.
struct B7Factors {
    std::uint32_t rank = 0;
    float unit = 1;                             ///< a feature is its sum of integers times this
    double squareScale = 1;                     ///< of the square matrix, before it is rounded to integers
    double weightScale = 1;                     ///< of the projection, before it is rounded to 8 bits
    std::vector<float> average;                 ///< of raw vectors
    std::vector<std::uint8_t> blockOfRow;       ///< of each raw component
    std::vector<std::uint8_t> blockOfComponent; ///< of each inner component, ascending
    /// For each inner component its weights on the raw components of its block, in their order.
    std::vector<std::int8_t> basis;
    std::vector<std::int32_t> diagonal; ///< for each inner component, in units of products of the next two
    std::vector<std::int8_t> left;      ///< column after column: inner components by rank
    std::vector<std::int8_t> right;     ///< column after column: inner components by rank, to be transposed
    std::vector<std::uint16_t> order;   ///< the inner place of each component of a feature

    std::size_t rows() const { return average.size(); }
    std::size_t components() const { return blockOfComponent.size(); }
    /// The raw components of each block.
    std::vector<std::vector<std::uint32_t>> rowsOfBlocks() const;
    struct Block {
        std::vector<std::uint32_t> rows; ///< its raw components
        std::size_t first;               ///< of its inner components
        Fn::Matrix<float> basis;         ///< a row for each raw component, a column for each inner one
    };
    std::vector<Block> blocks() const;
    /// The weights of one block on all features before they are scaled: a row for each of its raw components.
    /// @param square of squareMatrix(). @throws FNEBadFormat if a sum may be inexact
    Fn::Matrix<float> product(const Block& block, const std::vector<float>& square) const;

    /// The square matrix in integers, column after column. @throws FNEBadFormat if a sum may be inexact
    std::vector<float> squareMatrix() const;
    /// What the library reads. @throws FNEBadFormat if a sum may be inexact
    Cmp::B7::Transformation unpack() const;

    /// @throws FNEBadFormat, FNEIOError
    static B7Factors read(std::istream& stream);
    void write(std::ostream& stream) const;
};

} // namespace Orbek::Models

#include "b7_factors.h"

#include "fn/exception.h"

#include <gtest/gtest.h>

#include <cmath>
#include <sstream>

namespace {

using Orbek::Models::B7Factors;

/// Five raw components in two interleaved blocks, three inner components, a correction of rank 1.
B7Factors small() {
    B7Factors f;
    f.rank = 1;
    f.unit = 0.25f;
    f.squareScale = 0.5;
    f.weightScale = 0.125;
    f.average = {1, 2, 3, 4, 5};
    f.blockOfRow = {0, 1, 0, 1, 1};
    f.blockOfComponent = {0, 1, 1};
    f.basis = {3, -2, /**/ 1, 5, -4, /**/ 2, 0, 7};
    f.diagonal = {20, 30, 40};
    f.left = {2, -3, 5};
    f.right = {1, 4, -6};
    f.order = {2, 0, 1};
    return f;
}

std::string bytesOf(const B7Factors& factors) {
    std::ostringstream stream;
    factors.write(stream);
    return stream.str();
}

TEST(B7Factors, MultiplyOutToTheProductOfBasisAndSquareMatrix) {
    std::istringstream stream(bytesOf(small()));
    const B7Factors f = B7Factors::read(stream);
    const auto transformation = f.unpack();
    const double basis[5][3] = {{3, 0, 0}, {0, 1, 2}, {-2, 0, 0}, {0, 5, 0}, {0, -4, 7}};
    for (std::size_t c = 0; c < 3; ++c) {
        long sum = 0;
        for (std::size_t r = 0; r < 5; ++r) {
            double product = 0;
            for (std::size_t k = 0; k < 3; ++k) {
                const double inner = f.left[k] * f.right[f.order[c]] + (k == f.order[c] ? f.diagonal[k] : 0);
                product += basis[r][k] * static_cast<double>(std::lround(inner * f.squareScale));
            }
            const long weight = std::lround(product * f.weightScale);
            EXPECT_EQ(transformation.matrix.get()[c * 5 + r], weight) << r << ' ' << c;
            sum += weight;
        }
        EXPECT_EQ(transformation.base.get()[c], static_cast<float>(sum) * 0.25f);
    }
    EXPECT_EQ(transformation.average.get()[4], 5);
}

TEST(B7Factors, DamagedOrInexactOnesAreRefused) {
    const std::string whole = bytesOf(small());
    for (std::size_t size = 0; size < whole.size(); size += 3) {
        std::istringstream stream(whole.substr(0, size));
        EXPECT_THROW(B7Factors::read(stream), FNEBadFormat) << size;
    }
    const auto refused = [](auto change) {
        B7Factors f = small();
        change(f);
        std::istringstream stream(bytesOf(f));
        EXPECT_THROW(B7Factors::read(stream), FNEBadFormat);
    };
    refused([](B7Factors& f) { f.order[0] = 3; });
    refused([](B7Factors& f) { f.blockOfRow[0] = 1; }); // the weights no longer fit the blocks
    refused([](B7Factors& f) { f.blockOfComponent[2] = 9; });
    refused([](B7Factors& f) { f.rank = 2; });
    B7Factors large = small();
    large.squareScale = 1e6;
    EXPECT_THROW((void)large.unpack(), FNEBadFormat) << "floats would round such sums";
}

} // namespace

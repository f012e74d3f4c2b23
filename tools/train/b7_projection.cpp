#include "train/b7_projection.h"

#include "cmp/b7/encoder.h"
#include "cmp/b7/preprocessor.h"
#include "fn/matrix_decomposition.h"
#include "fn/matrix_eigen.h"
#include "fn/matrix_product.h"

#include <algorithm>
#include <cmath>
#include <iostream>
#include <map>
#include <numeric>
#include <random>
#include <utility>

namespace Train {
namespace {

using Fn::Matrix;
using Fn::SymmMatrix;
using Labelled::Split;
using Orbek::Models::B7Factors;

constexpr int blockDepth = 4;                     ///< halvings of the face into regions
constexpr std::size_t batch = 2048;               ///< samples whose products are summed at a time
constexpr float shrinkage = 0.7f;                 ///< of the mean variance within a person, added to each
constexpr float floorOfWeights = 2;               ///< in root mean squares of all weights
constexpr std::size_t mostPicturesThatCount = 10; ///< of one person, for the scatter between persons
constexpr std::uint32_t rank = 800;               ///< of the correction to the diagonal
constexpr double basisLevels = 6; ///< standard deviation of the weights of the basis as integers
constexpr double mostLevel = 127, mostSquareLevel = 2047;
/// Root mean square of components as a share of the magnitude that records keep. What is beyond is cut, which
/// makes scores better: a few large components would weigh too much.
constexpr double spreadInRecords = 0.65;

float valueOf(std::uint8_t digit) {
    return static_cast<float>(digit) * (Cmp::B7::PreProcessor::rankTable.front() / 255);
}

/// Sums of outer products of many columns.
class Scatter {
public:
    explicit Scatter(std::size_t n) : sum_(n), columns_(n, batch) { sum_ = 0.0f; }

    /// The next column to be filled in.
    float* next() {
        if (count_ == batch) flush();
        return columns_.getExclusive() + count_++ * columns_.rows();
    }
    SymmMatrix<float> sum() {
        flush();
        return sum_;
    }

private:
    void flush() {
        std::fill(columns_.getExclusive() + count_ * columns_.rows(),
                  columns_.getExclusive() + batch * columns_.rows(), 0.0f);
        sum_.addOuterProducts(columns_);
        count_ = 0;
    }

    SymmMatrix<float> sum_;
    Matrix<float> columns_;
    std::size_t count_ = 0;
};

/// Halves a set of points again and again, across its longer side.
void divide(std::span<std::uint32_t> points, const std::vector<FNPos>& places, int depth, std::uint8_t& block,
            std::vector<std::uint8_t>& blockOfPoint) {
    if (depth == 0) {
        for (const std::uint32_t p : points) blockOfPoint[p] = block;
        ++block;
        return;
    }
    const auto extent = [&](float FNPos::*axis) {
        const auto [least, most] = std::ranges::minmax(points, {}, [&](auto p) { return places[p].*axis; });
        return places[most].*axis - places[least].*axis;
    };
    const bool across = extent(&FNPos::x) >= extent(&FNPos::y);
    std::ranges::stable_sort(points, {}, [&](std::uint32_t p) {
        const FNPos place = places[p];
        return across ? std::pair(place.x, place.y) : std::pair(place.y, place.x);
    });
    divide(points.first(points.size() / 2), places, depth - 1, block, blockOfPoint);
    divide(points.subspan(points.size() / 2), places, depth - 1, block, blockOfPoint);
}

std::vector<std::uint8_t> blocksOfRows() {
    const std::vector<FNPos> places = Cmp::B7::PreProcessor::gridPoints();
    std::vector<std::uint32_t> points(places.size());
    std::iota(points.begin(), points.end(), 0u);
    std::vector<std::uint8_t> blockOfPoint(places.size()), blockOfRow;
    std::uint8_t block = 0;
    divide(points, places, blockDepth, block, blockOfPoint);
    for (const std::uint8_t b : blockOfPoint)
        blockOfRow.insert(blockOfRow.end(), Cmp::B7::PreProcessor::orientations, b);
    return blockOfRow;
}

std::vector<float> averageOf(const RawVectors& raw, const std::vector<std::size_t>& samples) {
    std::vector<double> sums(raw.dimension());
    for (const std::size_t s : samples) {
        const auto vector = raw.vector(s);
        for (std::size_t i = 0; i < sums.size(); ++i) sums[i] += vector[i];
    }
    std::vector<float> average(sums.size());
    std::ranges::transform(sums, average.begin(), [&](double sum) {
        return static_cast<float>(sum / static_cast<double>(samples.size()) *
                                  (Cmp::B7::PreProcessor::rankTable.front() / 255));
    });
    return average;
}

/// The ranks of some rows, less their averages, one column for each sample.
Matrix<float> rowsOf(const RawVectors& raw, std::span<const std::size_t> samples,
                     const std::vector<std::uint32_t>& rows, const B7Factors& factors) {
    Matrix<float> result(rows.size(), samples.size());
    float* out = result.getExclusive();
    for (const std::size_t s : samples)
        for (const std::uint32_t r : rows) *out++ = valueOf(raw.vector(s)[r]) - factors.average[r];
    return result;
}

/// Inner components of samples, one column for each.
Matrix<float> innerComponents(const RawVectors& raw, const std::vector<std::size_t>& samples,
                              const B7Factors& factors, double scale) {
    std::vector<B7Factors::Block> blocks = factors.blocks();
    for (B7Factors::Block& block : blocks) {
        float* const weights = block.basis.getExclusive();
        for (std::size_t i = 0; i < block.rows.size() * block.basis.cols(); ++i)
            weights[i] = static_cast<float>(weights[i] / scale);
    }
    Matrix<float> result(factors.components(), samples.size());
    for (std::size_t begin = 0; begin < samples.size(); begin += batch) {
        const std::size_t count = std::min(batch, samples.size() - begin);
        for (const B7Factors::Block& block : blocks) {
            const Matrix<float> inner = block.basis.transposedMultWith(
                rowsOf(raw, std::span(samples).subspan(begin, count), block.rows, factors));
            for (std::size_t s = 0; s < count; ++s)
                std::copy_n(inner.get() + s * inner.rows(), inner.rows(),
                            result.getExclusive() + (begin + s) * result.rows() + block.first);
        }
    }
    return result;
}

/// Columns of one person, or of one picture.
using Groups = std::map<std::string, std::vector<std::size_t>>;

Groups groupsBy(const RawVectors& raw, const std::vector<std::size_t>& samples,
                std::string RawVectors::Item::*key) {
    Groups groups;
    for (std::size_t column = 0; column < samples.size(); ++column)
        groups[raw.item(samples[column]).*key].push_back(column);
    return groups;
}

Groups setsOf(const RawVectors& raw, const std::vector<std::size_t>& samples) {
    Groups groups;
    for (std::size_t column = 0; column < samples.size(); ++column) {
        const std::string& file = raw.item(samples[column]).file;
        groups[file.substr(0, file.rfind('/'))].push_back(column);
    }
    return groups;
}

std::vector<float> meanOf(const Matrix<float>& columns, const std::vector<std::size_t>& members) {
    std::vector<float> mean(columns.rows());
    for (const std::size_t c : members)
        for (std::size_t i = 0; i < mean.size(); ++i) mean[i] += columns.get()[c * mean.size() + i];
    for (float& v : mean) v /= static_cast<float>(members.size());
    return mean;
}

SymmMatrix<float> withinPersons(const Matrix<float>& inner, const Groups& persons) {
    const std::size_t n = inner.rows();
    Scatter scatter(n);
    std::size_t samples = 0;
    for (const auto& [name, members] : persons) {
        const std::vector<float> mean = meanOf(inner, members);
        for (const std::size_t c : members)
            std::transform(mean.begin(), mean.end(), inner.get() + c * n, scatter.next(),
                           [](float m, float v) { return v - m; });
        samples += members.size();
    }
    return scatter.sum() * (1 / static_cast<float>(samples));
}

/// Adds the differences of the sets' means, so strongly that little of them is left after whitening: how
/// pictures of a set were taken says nothing about a person.
void addSets(const Matrix<float>& inner, const Groups& sets, SymmMatrix<float>& within) {
    constexpr float strength = 5;
    for (const auto& [name, members] : sets) {
        std::vector<float> mean = meanOf(inner, members);
        for (float& v : mean) v *= std::sqrt(strength);
        within.addOuterProduct(FNVector<float>(mean));
    }
}

/// The mean over persons of the products of different pictures.
SymmMatrix<float> betweenPersons(const Matrix<float>& inner, const Groups& pictures,
                                 const std::map<std::string, std::string>& personOfPicture) {
    const std::size_t n = inner.rows();
    std::map<std::string, std::vector<std::vector<float>>> persons;
    std::vector<double> sums(n);
    for (const auto& [picture, members] : pictures) {
        std::vector<float> mean = meanOf(inner, members);
        for (std::size_t i = 0; i < n; ++i) sums[i] += mean[i];
        persons[personOfPicture.at(picture)].push_back(std::move(mean));
    }
    double weights = 0;
    const auto weightOf = [](std::size_t count) {
        return static_cast<double>(std::min(count, mostPicturesThatCount) - 1);
    };
    for (const auto& [person, means] : persons) weights += weightOf(means.size());
    Scatter products(n), squares(n);
    for (auto& [person, means] : persons) {
        const std::size_t count = means.size();
        if (count < 2) continue;
        const auto factor = static_cast<float>(
            std::sqrt(weightOf(count) / weights / static_cast<double>(count * (count - 1))));
        float* const total = products.next();
        std::fill_n(total, n, 0.0f);
        for (const std::vector<float>& mean : means) {
            float* const column = squares.next();
            for (std::size_t i = 0; i < n; ++i) {
                column[i] =
                    factor * (mean[i] - static_cast<float>(sums[i] / static_cast<double>(pictures.size())));
                total[i] += column[i];
            }
        }
    }
    return products.sum() - squares.sum();
}

/// How samples of named people scatter within and between persons.
struct Scatters {
    SymmMatrix<float> within, between;
    float meanVariance; ///< within persons

    /// @param columns of the samples @param named the samples
    Scatters(const Matrix<float>& columns, const RawVectors& raw, const std::vector<std::size_t>& named)
        : within(withinPersons(columns, groupsBy(raw, named, &RawVectors::Item::person))),
          between(columns.rows()), meanVariance(0) {
        for (std::size_t i = 0; i < within.size(); ++i)
            meanVariance += std::as_const(within)(i, i) / static_cast<float>(within.size());
        addSets(columns, setsOf(raw, named), within);
        std::map<std::string, std::string> personOfPicture;
        for (const std::size_t s : named) personOfPicture[raw.item(s).file] = raw.item(s).person;
        between = betweenPersons(columns, groupsBy(raw, named, &RawVectors::Item::file), personOfPicture);
    }
};

/// Fills in the basis, blockOfComponent and the scale of the basis' integers, which is returned. The basis of
/// each region spans the directions in which persons differ most in proportion to the differences of one
/// person's pictures; all regions compete for the components.
double learnBasis(const RawVectors& raw, const std::vector<std::size_t>& named, std::size_t components,
                  B7Factors& factors) {
    struct Direction {
        float ratio;
        std::size_t block, column;
    };
    const auto rows = factors.rowsOfBlocks();
    std::vector<Direction> directions;
    std::vector<Matrix<float>> bases;
    for (std::size_t block = 0; block < rows.size(); ++block) {
        const std::size_t n = rows[block].size();
        Scatters scatters(rowsOf(raw, named, rows[block], factors), raw, named);
        scatters.within += FNVector<float>(std::vector<float>(n, shrinkage * scatters.meanVariance));
        Matrix<float> ascending(n, n), descending(n, n);
        const FNVector<float> ratios =
            Fn::generalizedEigenVectorsLowMem(scatters.between, scatters.within, ascending, true);
        for (std::size_t i = 0; i < n; ++i) {
            std::copy_n(ascending.get() + (n - 1 - i) * n, n, descending.getExclusive() + i * n);
            directions.push_back({ratios.get()[n - 1 - i], block, i});
        }
        bases.push_back(Fn::MKL::QR(descending).Q);
    }
    std::ranges::stable_sort(directions, std::ranges::greater(), &Direction::ratio);
    directions.resize(components);
    std::ranges::stable_sort(directions, {}, &Direction::block);
    const double scale = basisLevels * std::sqrt(static_cast<double>(rows.front().size()));
    for (const Direction& d : directions) {
        factors.blockOfComponent.push_back(static_cast<std::uint8_t>(d.block));
        const std::size_t n = rows[d.block].size();
        const float* const vector = bases[d.block].get() + d.column * n;
        for (std::size_t i = 0; i < n; ++i)
            factors.basis.push_back(static_cast<std::int8_t>(
                std::clamp<double>(std::round(vector[i] * scale), -mostLevel, mostLevel)));
    }
    return scale;
}

/// Multiplies each column by its factor.
void scaleColumns(Matrix<float>& m, const std::vector<float>& factors) {
    float* v = m.getExclusive();
    for (const float factor : factors)
        for (std::size_t i = 0; i < m.rows(); ++i) *v++ *= factor;
}

/// The symmetric root of the metric.
/// @param added to each variance within persons
Matrix<float> metricRoot(SymmMatrix<float> within, const SymmMatrix<float>& between, float added) {
    const std::size_t n = within.size();
    Matrix<float> whitening(n, n);
    const FNVector<float> variances = Fn::eigenVectorsLowMem(within, whitening, true);
    const Matrix<float> directions = whitening;
    std::vector<float> factors(n);
    std::ranges::transform(variances, factors.begin(), [&](float v) { return 1 / std::sqrt(v + added); });
    scaleColumns(whitening, factors);

    const Matrix<float> product = between * whitening;
    SymmMatrix<float> whitened(n);
    const Matrix<float> full = whitening.transposedMultWith(product);
    for (std::size_t c = 0; c < n; ++c)
        for (std::size_t r = c; r < n; ++r)
            whitened.getExclusive()[c * n + r] = (full.get()[c * n + r] + full.get()[r * n + c]) / 2;
    Matrix<float> persons(n, n);
    const FNVector<float> b = Fn::eigenVectorsLowMem(whitened, persons, true);
    std::cout << "  largest variances between persons, whitened: " << b.get()[n - 1] << ", "
              << b.get()[n - 100] << " (100th), " << b.get()[n - 1000] << " (1000th)\n"
              << std::flush;
    std::vector<float> weights(n);
    double squares = 0;
    for (std::size_t i = 0; i < n; ++i) {
        const float v = std::max(b.get()[i], 0.0f);
        weights[i] = v / (1 + v);
        squares += weights[i] * weights[i];
    }
    const float least = floorOfWeights * static_cast<float>(std::sqrt(squares / static_cast<double>(n)));
    for (float& w : weights) w = std::sqrt(w + least);
    Matrix<float> weighted = persons;
    scaleColumns(weighted, weights);
    return whitening * (weighted.multWithTransposed(persons).multWithTransposed(directions));
}

/// Fills in diagonal, left, right and their scales from the square matrix.
/// @param variances of inner components
void compress(const Matrix<float>& square, const std::vector<float>& variances, B7Factors& factors) {
    const std::size_t n = square.rows();
    // What is left of the diagonal, as much as it matters to features.
    Matrix<float> rest = square;
    for (std::size_t c = 0; c < n; ++c)
        for (std::size_t r = 0; r < n; ++r)
            rest.getExclusive()[c * n + r] *= r == c ? 0 : std::sqrt(variances[r]);
    SymmMatrix<float> products(n);
    {
        const Matrix<float> full = rest.transposedMultWith(rest);
        std::copy_n(full.get(), n * n, products.getExclusive());
    }
    Matrix<float> right(n, rank);
    const FNVector<float> values = Fn::eigenVectorsLowMem(products, right, true, static_cast<int>(rank));
    Matrix<float> left = rest * right;
    std::vector<float> shrink(rank), grow(rank);
    for (std::size_t k = 0; k < rank; ++k) {
        const float* const column = left.get() + k * n;
        double norm = 0;
        for (std::size_t r = 0; r < n; ++r) norm += column[r] * column[r] / variances[r];
        grow[k] = static_cast<float>(std::sqrt(std::sqrt(norm)));
        shrink[k] = 1 / grow[k];
    }
    for (std::size_t k = 0; k < rank; ++k)
        for (std::size_t r = 0; r < n; ++r)
            left.getExclusive()[k * n + r] *= shrink[k] / std::sqrt(variances[r]);
    scaleColumns(right, grow);
    const auto digits = [&](const Matrix<float>& m, std::vector<std::int8_t>& out) {
        float most = 0;
        for (std::size_t i = 0; i < n * rank; ++i) most = std::max(most, std::abs(m.get()[i]));
        const double scale = mostLevel / most;
        out.resize(n * rank);
        for (std::size_t i = 0; i < out.size(); ++i)
            out[i] = static_cast<std::int8_t>(std::lround(m.get()[i] * scale));
        return scale;
    };
    factors.rank = rank;
    const double scale = digits(left, factors.left) * digits(right, factors.right);
    factors.diagonal.resize(n);
    double most = 0;
    for (std::size_t i = 0; i < n; ++i) {
        factors.diagonal[i] = static_cast<std::int32_t>(std::lround(square.get()[i * n + i] * scale));
        most = std::max<double>(most, std::abs(factors.diagonal[i]));
    }
    factors.squareScale = mostSquareLevel / most;
    factors.unit = static_cast<float>(1 / (scale * factors.squareScale)); // of the square matrix, so far
}

/// Orders components by variance, from features of some pictures as they will be.
/// @param integers square matrix in the present order @return what features are to be scaled by
double orderAndScale(const Matrix<float>& inner, const std::vector<float>& integers, B7Factors& factors) {
    const std::size_t components = factors.components();
    Matrix<float> square(components, components);
    for (std::size_t i = 0; i < integers.size(); ++i) square.getExclusive()[i] = integers[i] * factors.unit;
    std::mt19937 random(1);
    Matrix<float> some(components, batch);
    for (std::size_t k = 0; k < batch; ++k)
        std::copy_n(inner.get() + random() % inner.cols() * components, components,
                    some.getExclusive() + k * components);
    const Matrix<float> features = square.transposedMultWith(some);
    std::vector<float> squares(components);
    for (std::size_t k = 0; k < batch; ++k)
        for (std::size_t i = 0; i < components; ++i)
            squares[i] += features.get()[k * components + i] * features.get()[k * components + i] / batch;
    std::ranges::stable_sort(factors.order, std::ranges::greater(), [&](auto i) { return squares[i]; });
    const std::vector<float> magnitudes = Cmp::B7::Encoder().factors();
    double shares = 0;
    for (std::size_t i = 0; i < components; ++i)
        shares +=
            squares[factors.order[i]] / (magnitudes[i] * magnitudes[i]) / static_cast<double>(components);
    return spreadInRecords / std::sqrt(shares);
}

} // namespace

B7Factors learnProjection(const RawVectors& raw) {
    std::vector<std::size_t> all, named;
    for (std::size_t i = 0; i < raw.size(); ++i) {
        if (raw.item(i).split != Split::train) continue;
        all.push_back(i);
        if (raw.item(i).person != raw.item(i).file) named.push_back(i);
    }
    const std::size_t components = Cmp::B7::Encoder().components();
    B7Factors factors;
    factors.average = averageOf(raw, all);
    factors.blockOfRow = blocksOfRows();
    const double basisScale = learnBasis(raw, named, components, factors);
    const Matrix<float> inner = innerComponents(raw, named, factors, basisScale);
    std::cout << "  " << inner.cols() << " samples of named people\n" << std::flush;
    Matrix<float> root(components, components);
    {
        Scatters scatters(inner, raw, named);
        root = metricRoot(std::move(scatters.within), scatters.between, shrinkage * scatters.meanVariance);
    }

    std::vector<float> variances(components);
    for (std::size_t c = 0; c < inner.cols(); ++c)
        for (std::size_t i = 0; i < components; ++i)
            variances[i] += inner.get()[c * components + i] * inner.get()[c * components + i] /
                            static_cast<float>(inner.cols());
    compress(root, variances, factors);

    factors.order.resize(components);
    std::iota(factors.order.begin(), factors.order.end(), std::uint16_t{0});
    const std::vector<float> integers = factors.squareMatrix();
    const double featureScale = orderAndScale(inner, integers, factors);

    // The largest weight of the projection becomes the largest that 8 bits hold.
    double most = 0;
    for (const B7Factors::Block& block : factors.blocks()) {
        const Matrix<float> product = factors.product(block, integers);
        for (std::size_t i = 0; i < product.rows() * product.cols(); ++i)
            most = std::max<double>(most, std::abs(product.get()[i]));
    }
    factors.weightScale = mostLevel / most;
    factors.unit = static_cast<float>(factors.unit * featureScale / (basisScale * factors.weightScale));
    return factors;
}

} // namespace Train

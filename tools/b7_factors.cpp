#include "b7_factors.h"

#include "fn/exception.h"
#include "fn/numeric/blas.h"

#include <algorithm>
#include <cmath>
#include <istream>
#include <ostream>
#include <span>

namespace Orbek::Models {
namespace {

using Blas = Fn::Numeric::Blas<float>;

constexpr char mark[8] = {'B', '7', 'F', 'A', 'C', 'T', '0', '1'};
constexpr std::uint32_t mostElements = 1u << 27;
constexpr double exactFloat = 1 << 24;
constexpr long mostWeight = 127;

template <class T> void put(std::ostream& stream, const T& value) {
    stream.write(reinterpret_cast<const char*>(&value), sizeof value);
}
template <class T> void put(std::ostream& stream, const std::vector<T>& values) {
    put(stream, static_cast<std::uint32_t>(values.size()));
    stream.write(reinterpret_cast<const char*>(values.data()),
                 static_cast<std::streamsize>(values.size() * sizeof(T)));
}

template <class T> void get(std::istream& stream, T& value) {
    stream.read(reinterpret_cast<char*>(&value), sizeof value);
}
template <class T> void get(std::istream& stream, std::vector<T>& values) {
    std::uint32_t size = 0;
    get(stream, size);
    if (!stream || size > mostElements) FN_THROW(FNEBadFormat, "Factors of B7: damaged");
    values.resize(size);
    stream.read(reinterpret_cast<char*>(values.data()), static_cast<std::streamsize>(size * sizeof(T)));
}

/// The fields in the order of the file.
template <class Factors, class Visit> void visitFields(Factors& f, Visit visit) {
    visit(f.rank);
    visit(f.unit);
    visit(f.squareScale);
    visit(f.weightScale);
    visit(f.average);
    visit(f.blockOfRow);
    visit(f.blockOfComponent);
    visit(f.basis);
    visit(f.diagonal);
    visit(f.left);
    visit(f.right);
    visit(f.order);
}

std::vector<float> floats(const std::int8_t* values, std::size_t n) {
    return {values, values + n};
}

double greatest(std::span<const float> values) {
    double result = 0;
    for (const float v : values) result = std::max<double>(result, std::abs(v));
    return result;
}

void demandExact(double bound) {
    if (!(bound < exactFloat)) FN_THROW(FNEBadFormat, "Factors of B7: sums are too large to be exact");
}

/// What is wrong with sizes and indices, or nothing.
bool fits(const B7Factors& f) {
    const std::size_t n = f.components();
    if (n == 0 || n > 65535 || f.rows() == 0 || f.blockOfRow.size() != f.rows() || f.diagonal.size() != n ||
        f.order.size() != n || f.left.size() != n * f.rank || f.right.size() != n * f.rank ||
        !std::ranges::is_sorted(f.blockOfComponent))
        return false;
    std::size_t weights = 0;
    const auto rows = f.rowsOfBlocks();
    for (const std::uint8_t block : f.blockOfComponent) {
        if (block >= rows.size()) return false;
        weights += rows[block].size();
    }
    return weights == f.basis.size() && std::ranges::all_of(f.order, [&](auto place) { return place < n; });
}

} // namespace

std::vector<std::vector<std::uint32_t>> B7Factors::rowsOfBlocks() const {
    std::vector<std::vector<std::uint32_t>> rows(
        blockOfRow.empty() ? 0 : std::size_t{1} + *std::ranges::max_element(blockOfRow));
    for (std::size_t r = 0; r < blockOfRow.size(); ++r)
        rows[blockOfRow[r]].push_back(static_cast<std::uint32_t>(r));
    return rows;
}

std::vector<B7Factors::Block> B7Factors::blocks() const {
    std::vector<Block> result;
    std::size_t first = 0;
    const std::int8_t* weights = basis.data();
    for (std::vector<std::uint32_t>& rows : rowsOfBlocks()) {
        const auto count = static_cast<std::size_t>(
            std::ranges::count(blockOfComponent, static_cast<std::uint8_t>(result.size())));
        Fn::Matrix<float> own(rows.size(), count);
        std::copy_n(weights, rows.size() * count, own.getExclusive());
        weights += rows.size() * count;
        result.push_back({std::move(rows), first, own});
        first += count;
    }
    return result;
}

Fn::Matrix<float> B7Factors::product(const Block& block, const std::vector<float>& square) const {
    const std::size_t n = components(), count = block.basis.cols();
    Fn::Matrix<float> part(count, n);
    double greatestSum = 0;
    for (std::size_t c = 0; c < n; ++c) {
        const float* const column = square.data() + c * n + block.first;
        std::copy_n(column, count, part.getExclusive() + c * count);
        double sum = 0;
        for (std::size_t i = 0; i < count; ++i) sum += std::abs(column[i]);
        greatestSum = std::max(greatestSum, sum);
    }
    demandExact(greatestSum * greatest({block.basis.get(), block.basis.rows() * count}));
    return block.basis * part;
}

std::vector<float> B7Factors::squareMatrix() const {
    const std::size_t n = components();
    const std::vector<float> l = floats(left.data(), left.size()), r = floats(right.data(), right.size());
    demandExact(greatest(l) * greatest(r) * rank);
    std::vector<float> product(n * n);
    Blas::gemm(false, true, n, n, rank, 1, l.data(), r.data(), 0, product.data());
    for (std::size_t i = 0; i < n; ++i) product[i * n + i] += static_cast<float>(diagonal[i]);
    for (float& v : product) v = static_cast<float>(std::lround(v * squareScale));
    std::vector<float> ordered(n * n);
    for (std::size_t c = 0; c < n; ++c)
        std::copy_n(product.begin() + static_cast<std::ptrdiff_t>(order[c] * n), n,
                    ordered.begin() + static_cast<std::ptrdiff_t>(c * n));
    return ordered;
}

Cmp::B7::Transformation B7Factors::unpack() const {
    const std::size_t n = components();
    const std::vector<float> square = squareMatrix();
    Fn::Matrix<signed char> matrix(rows(), n);
    signed char* const out = matrix.getExclusive();
    for (const Block& block : blocks()) {
        const Fn::Matrix<float> part = product(block, square);
        const float* weight = part.get();
        for (std::size_t c = 0; c < n; ++c)
            for (const std::uint32_t r : block.rows)
                out[c * rows() + r] = static_cast<signed char>(
                    std::clamp(std::lround(*weight++ * weightScale), -mostWeight, mostWeight));
    }
    FNVector<float> base(n);
    for (std::size_t c = 0; c < n; ++c) {
        long sum = 0;
        for (std::size_t r = 0; r < rows(); ++r) sum += out[c * rows() + r];
        base.getExclusive()[c] = static_cast<float>(sum) * unit;
    }
    return {unit, matrix, FNVector<float>(average), FNVector<float>(n, 0.0f), base};
}

B7Factors B7Factors::read(std::istream& stream) {
    char found[sizeof mark] = {};
    stream.read(found, sizeof found);
    if (!std::equal(std::begin(mark), std::end(mark), found))
        FN_THROW(FNEBadFormat, "Factors of B7: another kind of file");
    B7Factors factors;
    visitFields(factors, [&](auto& field) { get(stream, field); });
    if (!stream || !fits(factors)) FN_THROW(FNEBadFormat, "Factors of B7: damaged");
    return factors;
}

void B7Factors::write(std::ostream& stream) const {
    stream.write(mark, sizeof mark);
    visitFields(*this, [&](const auto& field) { put(stream, field); });
}

} // namespace Orbek::Models

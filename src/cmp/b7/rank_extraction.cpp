#include "cmp/b7/preprocessor.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "cmp/b7/rank_extraction.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#ifndef ORBEK_B7_RANK_EXTRACTION
#define ORBEK_B7_RANK_EXTRACTION
namespace Cmp::B7 {
namespace {

/// The responses of one scale at one point of a grid: of the last orientation, of all of them, and of the
/// first one again, so that loads at 0, 1 and 2 give each one's neighbours and itself.
constexpr std::size_t blockSize = 20;
/// Floats that loads may touch behind a block.
constexpr std::size_t loadBeyond = 16;

/// Blocks one behind the other.
struct Run {
    const float* first;
    unsigned int count;
};

} // namespace
} // namespace Cmp::B7
#endif

HWY_BEFORE_NAMESPACE();
namespace Cmp::B7::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// For each orientation, how many responses in the runs are greater than the one of `centre`.
/// @param counts has room for a vector behind the last orientation
void countGreater(const float* centre, std::span<const Run> runs, std::int32_t* counts) {
    const hn::CappedTag<float, 16> d;
    const hn::RebindToSigned<decltype(d)> di;
    for (std::size_t o = 0; o < PreProcessor::orientations; o += hn::Lanes(d)) {
        const auto value = hn::LoadU(d, centre + o + 1);
        auto before = hn::Zero(di), same = hn::Zero(di), after = hn::Zero(di);
        const auto greater = [&](const float* responses) HWY_ATTR {
            return hn::VecFromMask(di, hn::RebindMask(di, hn::Gt(hn::LoadU(d, responses), value)));
        };
        for (const Run& run : runs) {
            const float* block = run.first + o;
            for (unsigned int i = 0; i < run.count; ++i, block += blockSize) {
                before = hn::Sub(before, greater(block));
                same = hn::Sub(same, greater(block + 1));
                after = hn::Sub(after, greater(block + 2));
            }
        }
        hn::StoreU(hn::Add(hn::Add(before, same), after), di, counts + o);
    }
}

} // namespace
} // namespace Cmp::B7::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Cmp::B7 {
namespace {
HWY_EXPORT(countGreater);
} // namespace

/// The responses that the points of one grid look at, in blocks: by scale, line and column.
class PreProcessor::Neighbourhoods {
public:
    Neighbourhoods(const Implementation::GaborBank& bank,
                   const Implementation::GaborBank::Responses& responses, unsigned int s)
        : s_(s), scales_(scalesAround(s)) {
        unsigned int points = 0;
        for (unsigned int l = 0; l < ShapedGridLinesVert_[s]; ++l) {
            lineStart_[l] = points;
            points += line(s, l).end - line(s, l).begin;
        }
        points_ = points;
        values_.resize((scales_.end - scales_.begin) * points * blockSize + loadBeyond);
        for (unsigned int ss = scales_.begin; ss < scales_.end; ++ss)
            for (unsigned int o = 0; o < orientations; ++o) gather(bank, responses, ss, o);
    }

    /// Writes the number of greater neighbours of each orientation. @return the size of the neighbourhoods
    unsigned int rank(unsigned int l, unsigned int j, std::int32_t* greater) const {
        std::array<Run, 3 * (2 * scaleRadius + 1)> runs;
        std::size_t count = 0;
        unsigned int blocks = 0;
        const Range lines = linesAround(s_, l);
        for (unsigned int l2 = lines.begin; l2 < lines.end; ++l2) {
            const Range columns = around(j, 1, line(s_, l2));
            if (columns.begin >= columns.end) continue;
            for (unsigned int ss = scales_.begin; ss < scales_.end; ++ss) {
                runs[count++] = {block(ss, l2, columns.begin), columns.end - columns.begin};
                blocks += columns.end - columns.begin;
            }
        }
        HWY_DYNAMIC_DISPATCH(countGreater)(block(s_, l, j), {runs.data(), count}, greater);
        return 3 * blocks;
    }

private:
    std::size_t offset(unsigned int ss, unsigned int l, unsigned int j) const {
        const std::size_t point = lineStart_[l] + j - line(s_, l).begin;
        return ((ss - scales_.begin) * points_ + point) * blockSize;
    }
    const float* block(unsigned int ss, unsigned int l, unsigned int j) const {
        return values_.data() + offset(ss, l, j);
    }
    void gather(const Implementation::GaborBank& bank, const Implementation::GaborBank::Responses& responses,
                unsigned int ss, unsigned int o) {
        const FNImage<float>& response = responses.filter(ss, o);
        for (unsigned int l = 0; l < ShapedGridLinesVert_[s_]; ++l) {
            const float* const row = response.row(pixelY(s_, l));
            const Range columns = line(s_, l);
            float* out = values_.data() + offset(ss, l, columns.begin);
            for (unsigned int j = columns.begin; j < columns.end; ++j, out += blockSize) {
                const float value = row[bank.columnIndex(ss, pixelX(s_, j))];
                out[o + 1] = value;
                if (o == 0) out[orientations + 1] = value;
                if (o == orientations - 1) out[0] = value;
            }
        }
    }

    unsigned int s_;
    Range scales_;
    std::array<unsigned int, maxLines> lineStart_{}; ///< points before each line
    std::size_t points_ = 0;
    std::vector<float> values_;
};

FNVector<float> PreProcessor::extract(const Implementation::GaborBank::Responses& responses) const {
    FNVector<float> ranks(computeFeatureVectorSize());
    float* out = ranks.getExclusive();
    for (unsigned int s = 0; s < NUM_SHAPED_GRIDS; ++s) {
        const Neighbourhoods neighbourhoods(bank_, responses, s);
        for (unsigned int l = 0; l < ShapedGridLinesVert_[s]; ++l)
            for (unsigned int j = line(s, l).begin; j < line(s, l).end; ++j) {
                std::int32_t greater[orientations + loadBeyond];
                const unsigned int total = neighbourhoods.rank(l, j, greater);
                for (unsigned int o = 0; o < orientations; ++o)
                    *out++ = rank_(static_cast<unsigned int>(greater[o]), total);
            }
    }
    return ranks;
}

} // namespace Cmp::B7
#endif

#include "train/position_tuning.h"

#include "fn/exception.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <numeric>

namespace Train {
namespace {

using Blas = Fn::Numeric::Blas<float>;
using Eye::Implementation::TrainedSvm;

/// So many windows of a search are kept; the finders look at the ten best.
constexpr std::size_t mostWindows = 40, mostWeighted = 10;

/// x in a * x = b for a symmetric `a`.
std::vector<double> solved(std::vector<double> a, std::vector<double> b) {
    std::vector<int> pivots(b.size());
    if (Fn::Numeric::Lapack<double>::gesv(b.size(), 1, a.data(), pivots.data(), b.data()) != 0)
        FN_THROW(FNEBadArg, "The responses of a machine depend on each other");
    return b;
}

} // namespace

PositionTuning::PositionTuning(const TrainedSvm& machine, float errorScale)
    : machine_(machine), errorScale_(errorScale) {}

void PositionTuning::add(std::vector<SearchedWindow> windows, float weight) {
    std::vector<std::pair<double, std::size_t>> ranks;
    for (std::size_t i = 0; i < windows.size(); ++i)
        ranks.emplace_back(-(machine_.evaluate(windows[i].signs)), i);
    const std::size_t count = std::min(mostWindows, windows.size());
    std::partial_sort(ranks.begin(), ranks.begin() + static_cast<std::ptrdiff_t>(count), ranks.end());
    searches_.push_back({offsets_.size(), count, weight});
    for (std::size_t k = 0; k < count; ++k) {
        const SearchedWindow& window = windows[ranks[k].second];
        offsets_.push_back(window.offset);
        sizeGains_.push_back(window.sizeGain);
        for (std::size_t j = 0; j < machine_.alphas.size(); ++j)
            responses_.push_back(response(machine_, window.signs, j));
    }
}

std::vector<float> PositionTuning::scoresOf(const std::vector<float>& alphas) const {
    std::vector<float> scores(offsets_.size());
    Blas::gemv(true, alphas.size(), scores.size(), 1, responses_.data(), alphas.data(), 0, scores.data());
    return scores;
}

double PositionTuning::errorOf(const std::vector<float>& scores, std::vector<float>* gradient) const {
    double error = 0, weights = 0;
    if (gradient) gradient->assign(scores.size(), 0.0f);
    for (const Search& search : searches_) {
        std::vector<std::size_t> best(search.count);
        std::iota(best.begin(), best.end(), search.first);
        const std::size_t used = std::min(mostWeighted, search.count);
        std::partial_sort(best.begin(), best.begin() + static_cast<std::ptrdiff_t>(used), best.end(),
                          [&](std::size_t a, std::size_t b) { return scores[a] > scores[b]; });
        best.resize(used);
        float share[mostWeighted];
        float sum = 0;
        for (std::size_t k = 0; k < used; ++k)
            sum += share[k] =
                std::exp(scores[best[k]] - scores[best[0]] + sizeGains_[best[k]] - sizeGains_[best[0]]);
        FNPos place{0, 0};
        for (std::size_t k = 0; k < used; ++k) place += offsets_[best[k]] * (share[k] /= sum);
        const float square = place.x * place.x + place.y * place.y;
        const float bounded = square + errorScale_ * errorScale_;
        error += search.weight * square / bounded;
        weights += search.weight;
        if (!gradient) continue;
        const FNPos pull = place * (2 * errorScale_ * errorScale_ / (bounded * bounded) * search.weight);
        const auto along = [&](FNPos offset) { return pull.x * offset.x + pull.y * offset.y; };
        for (std::size_t k = 0; k < used; ++k)
            (*gradient)[best[k]] = share[k] * (along(offsets_[best[k]]) - along(place));
    }
    if (gradient)
        for (float& g : *gradient) g /= static_cast<float>(weights);
    return error / weights;
}

std::vector<double> PositionTuning::covariance() const {
    const std::size_t d = machine_.alphas.size(), n = offsets_.size();
    std::vector<float> centred = responses_;
    for (const Search& search : searches_)
        for (std::size_t j = 0; j < d; ++j) {
            double mean = 0;
            for (std::size_t i = 0; i < search.count; ++i) mean += centred[(search.first + i) * d + j];
            mean /= static_cast<double>(search.count);
            for (std::size_t i = 0; i < search.count; ++i)
                centred[(search.first + i) * d + j] -= static_cast<float>(mean);
        }
    std::vector<float> sums(d * d, 0.0f);
    Blas::syrk(d, n, centred.data(), sums.data());
    return damped(sums, n);
}

TrainedSvm PositionTuning::tuned(const std::vector<Signs>& faces,
                                 const std::vector<WorkingStep>& steps) const {
    constexpr int descents = 300;
    constexpr double growth = 1.2, shrinking = 0.4, firstStep = 4.0, momentum = 0.9;
    const std::size_t d = machine_.alphas.size();
    const std::vector<double> spread = covariance();
    std::vector<float> alphas = machine_.alphas, velocity(d, 0.0f), gradient;
    double step = firstStep, error = errorOf(scoresOf(alphas), &gradient);
    std::printf("  place of the best windows: error %.4f", error);
    for (int descent = 0; descent < descents; ++descent) {
        // Down the natural gradient: a step's length is that of the change of the scores.
        std::vector<float> slope(d);
        Blas::gemv(false, d, offsets_.size(), 1, responses_.data(), gradient.data(), 0, slope.data());
        const std::vector<double> direction = solved(spread, {slope.begin(), slope.end()});
        std::vector<float> next = alphas, moved(d), nextGradient;
        for (std::size_t j = 0; j < d; ++j) {
            moved[j] = static_cast<float>(momentum * velocity[j] - step * direction[j]);
            next[j] += moved[j];
        }
        const double nextError = errorOf(scoresOf(next), &nextGradient);
        if (nextError < error) {
            alphas = next;
            velocity = moved;
            gradient = nextGradient;
            error = nextError;
            step *= growth;
        } else {
            velocity.assign(d, 0.0f);
            step *= shrinking;
        }
    }
    std::printf(", tuned %.4f\n", error);
    TrainedSvm result = machine_;
    result.alphas = alphas;

    // An earlier step and the last one share the bias. What they are apart is set by the change of the alphas
    // between them that moves all scores alike, as well as there is one.
    const auto reached = [&](const WorkingStep& working) {
        std::vector<float> sums;
        for (const Signs& face : faces) {
            float sum = 0;
            for (std::size_t j = 0; j < working.vectors; ++j)
                sum += result.alphas[j] * response(result, face, j);
            sums.push_back(sum);
        }
        const auto rank = static_cast<std::ptrdiff_t>((1 - working.keep) * static_cast<double>(sums.size()));
        std::nth_element(sums.begin(), sums.begin() + rank, sums.end());
        return static_cast<double>(sums[static_cast<std::size_t>(rank)]);
    };
    const WorkingStep& last = steps.back();
    for (std::size_t i = steps.size() - 1; i-- > 0;) {
        const double excess = reached(last) - reached(steps[i]) - (last.threshold - steps[i].threshold);
        std::printf("  step of %zu vectors: excess %.3f\n", steps[i].vectors, excess);
        if (excess <= 0) continue;
        const std::size_t from = steps[i].vectors, m = d - from;
        std::vector<double> within(m * m), mean(m, 0.0);
        for (std::size_t j = 0; j < m; ++j) {
            for (std::size_t k = 0; k < m; ++k) within[k + j * m] = spread[k + from + (j + from) * d];
            for (const Signs& face : faces)
                mean[j] += response(result, face, j + from) / static_cast<double>(faces.size());
        }
        const std::vector<double> raise = evenRaise(within, mean);
        for (std::size_t j = 0; j < m; ++j) result.alphas[j + from] -= static_cast<float>(excess * raise[j]);
    }
    std::printf("  place of the best windows: error %.4f\n", errorOf(scoresOf(result.alphas), nullptr));
    result.bias = static_cast<float>(reached(last) - last.threshold);
    return result;
}

} // namespace Train

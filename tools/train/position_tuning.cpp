#include "train/position_tuning.h"

#include "fn/numeric/blas.h"
#include "train/discriminator_training.h"

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

} // namespace

PositionTuning::PositionTuning(const TrainedSvm& machine, std::size_t vectors, float errorScale)
    : machine_(machine), vectors_(vectors), errorScale_(errorScale) {}

void PositionTuning::add(const std::vector<SearchedWindow>& windows, float weight) {
    std::vector<std::pair<double, std::size_t>> ranks;
    for (std::size_t i = 0; i < windows.size(); ++i)
        ranks.emplace_back(-machine_.evaluate(windows[i].signs), i);
    const std::size_t count = std::min(mostWindows, windows.size());
    std::partial_sort(ranks.begin(), ranks.begin() + static_cast<std::ptrdiff_t>(count), ranks.end());
    searches_.push_back({windows_.size(), count, weight});
    for (std::size_t k = 0; k < count; ++k) {
        const SearchedWindow& window = windows[ranks[k].second];
        windows_.push_back(window.signs);
        offsets_.push_back(window.offset);
        sizeGains_.push_back(window.sizeGain);
        for (std::size_t j = 0; j < vectors_; ++j)
            responses_.push_back(j < present() ? response(machine_, window.signs, j) : 0.0f);
    }
}

std::vector<float> PositionTuning::scoresOf(const std::vector<float>& alphas) const {
    std::vector<float> padded = alphas, scores(windows_.size());
    padded.resize(vectors_, 0.0f);
    Blas::gemv(true, vectors_, scores.size(), 1, responses_.data(), padded.data(), 0, scores.data());
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
    const std::size_t d = present();
    std::vector<float> sums(d * d, 0.0f), centred;
    for (const Search& search : searches_) {
        centred.clear();
        for (std::size_t i = 0; i < search.count; ++i) {
            const float* const responses = &responses_[(search.first + i) * vectors_];
            centred.insert(centred.end(), responses, responses + d);
        }
        for (std::size_t j = 0; j < d; ++j) {
            double mean = 0;
            for (std::size_t i = 0; i < search.count; ++i) mean += centred[i * d + j];
            mean /= static_cast<double>(search.count);
            for (std::size_t i = 0; i < search.count; ++i) centred[i * d + j] -= static_cast<float>(mean);
        }
        Blas::syrk(d, search.count, centred.data(), sums.data());
    }
    return damped(sums, windows_.size());
}

/// Down the natural gradient, in which a step's length is that of the change of the scores, with momentum
/// that is lost where the error would rise.
void PositionTuning::descend(int descents) {
    constexpr double growth = 1.2, shrinking = 0.4, firstStep = 4.0, momentum = 0.9;
    const std::size_t d = present();
    const std::vector<double> spread = covariance();
    std::vector<float> velocity(d, 0.0f), gradient;
    double step = firstStep, error = errorOf(scoresOf(machine_.alphas), &gradient);
    for (int descent = 0; descent < descents; ++descent) {
        std::vector<float> slope(vectors_);
        Blas::gemv(false, vectors_, windows_.size(), 1, responses_.data(), gradient.data(), 0, slope.data());
        const auto end = slope.begin() + static_cast<std::ptrdiff_t>(d);
        const std::vector<double> direction = solved(spread, {slope.begin(), end});
        std::vector<float> next = machine_.alphas, moved(d), nextGradient;
        for (std::size_t j = 0; j < d; ++j) {
            moved[j] = static_cast<float>(momentum * velocity[j] - step * direction[j]);
            next[j] += moved[j];
        }
        const double nextError = errorOf(scoresOf(next), &nextGradient);
        if (nextError < error) {
            machine_.alphas = next;
            velocity = moved;
            gradient = nextGradient;
            error = nextError;
            step *= growth;
        } else {
            velocity.assign(d, 0.0f);
            step *= shrinking;
        }
    }
    std::printf("  %zu vectors: error of the place of the best windows %.4f\n", d, error);
    std::fflush(stdout);
}

/// Adds the vector that the windows pull for, those that pull more with a greater chance, and as much of it
/// as helps most.
void PositionTuning::addVector(Random& random) {
    constexpr std::size_t batchSize = 3000;
    constexpr int ascents = 5, doublings = 8;
    std::vector<float> gradient, pulls, alphas = machine_.alphas;
    double error = errorOf(scoresOf(alphas), &gradient);
    std::vector<double> weights;
    for (const float g : gradient) weights.push_back(std::abs(g));
    const std::vector<std::size_t> batch = drawn(weights, batchSize, random);
    for (const std::size_t i : batch) pulls.push_back(gradient[i] < 0 ? 1.0f : -1.0f);
    const std::size_t j = present();
    machine_.supportVectors.push_back(
        bestVector(machine_, expanded(windows_, batch), pulls, ascents, random));
    double slope = 0, square = 0, mean = 0;
    for (std::size_t i = 0; i < windows_.size(); ++i) {
        const float r = responses_[i * vectors_ + j] = response(machine_, windows_[i], j);
        slope += gradient[i] * r;
        mean += r / static_cast<double>(windows_.size());
        square += static_cast<double>(r) * r / static_cast<double>(windows_.size());
    }
    machine_.alphas.push_back(0.0f);
    alphas.push_back(static_cast<float>(-slope / (square - mean * mean)));
    for (int doubling = 0; doubling < doublings; ++doubling, alphas[j] *= 2) {
        const double tried = errorOf(scoresOf(alphas), nullptr);
        if (tried >= error) break;
        error = tried;
        machine_.alphas = alphas;
    }
}

/// An earlier step and the last one share the bias: what they are apart is brought to the thresholds'
/// distance by a change of the alphas between them that moves all scores alike.
void PositionTuning::separateSteps(const std::vector<Signs>& faces, const std::vector<WorkingStep>& steps) {
    const std::size_t d = present();
    const std::vector<double> spread = covariance();
    for (std::size_t i = steps.size() - 1; i-- > 0;) {
        const std::size_t from = steps[i].vectors, m = d - from;
        std::vector<double> within(m * m), mean(m, 0.0);
        for (std::size_t j = 0; j < m; ++j) {
            for (std::size_t k = 0; k < m; ++k) within[k + j * m] = spread[k + from + (j + from) * d];
            for (const Signs& face : faces)
                mean[j] += response(machine_, face, j + from) / static_cast<double>(faces.size());
        }
        const std::vector<double> raise = evenRaise(within, mean);
        const std::vector<double> reached = reachedSums(machine_, faces, steps);
        const double missing = steps.back().threshold - steps[i].threshold - (reached.back() - reached[i]);
        for (std::size_t j = 0; j < m; ++j)
            machine_.alphas[j + from] += static_cast<float>(missing * raise[j]);
    }
}

TrainedSvm PositionTuning::tuned(const std::vector<Signs>& faces, const std::vector<WorkingStep>& steps,
                                 Random& random) {
    constexpr int firstDescents = 60, descentsOnTheWay = 15, lastDescents = 200;
    constexpr std::size_t vectorsOnTheWay = 25;
    descend(firstDescents);
    while (present() < vectors_) {
        addVector(random);
        if (present() % vectorsOnTheWay == 0) descend(descentsOnTheWay);
    }
    descend(lastDescents);
    separateSteps(faces, steps);
    machine_.bias = static_cast<float>(reachedSums(machine_, faces, steps).back() - steps.back().threshold);
    std::printf("  error with the steps set %.4f\n", errorOf(scoresOf(machine_.alphas), nullptr));
    return machine_;
}

} // namespace Train

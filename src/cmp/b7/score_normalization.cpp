#include "cmp/b7/score_normalization.h"

#include "cmp/b7/value_histogram.h"

#include <cmath>
#include <numbers>

namespace Cmp::B7 {

const BNormParams b7NormParams = {-0.00384883f, 0.000831075f, -5.20062e-05f, 0.000403925f,
                                  -0.003f,      0.000831075f, 5.11135f,      0.00511483f,
                                  -0.5f,        0.05f,        -0.0001f};

namespace {

constexpr double rootOfTwoPi = 2.5066282746310002;

/// exp(e) in straight pieces, each from its lower end on.
struct Piece {
    float from, slope, offset;
};
constexpr Piece pieces[] = {{-0.1f, 1.0f, 1.0f},
                            {-0.5f, 0.745766896f, 0.979414108f},
                            {-1.0f, 0.477302437f, 0.845181878f},
                            {-2.0f, 0.232544158f, 0.600423599f},
                            {-3.0f, 0.0855482149f, 0.306431713f},
                            {-4.0f, 0.0314714295f, 0.144201357f},
                            {-6.0f, 0.00791844336f, 0.0499894123f},
                            {-8.0f, 0.00107164477f, 0.00890862082f},
                            {-10.0f, 0.000145031349f, 0.00149571342f},
                            {-12.0f, 1.96278587e-05f, 0.000241678517f},
                            {-14.0f, 2.65634182e-06f, 3.80203142e-05f},
                            {-16.0f, 3.59496772e-07f, 5.86448353e-06f},
                            {-18.0f, 4.86525975e-08f, 8.90976735e-07f},
                            {-20.0f, 6.58441306e-09f, 1.33749415e-07f}};

template <class T> T density(T x, T mean, T deviation) {
    const T z = (x - mean) / deviation;
    return std::exp(-z * z / 2) / (deviation * static_cast<T>(rootOfTwoPi));
}

/// Where the densities of two normal distributions are equal, between their means; 0 if nowhere.
template <class T> T intersection(T m1, T d1, T m2, T d2) {
    const T a = 1 / (2 * d2 * d2) - 1 / (2 * d1 * d1);
    const T b = m1 / (d1 * d1) - m2 / (d2 * d2);
    const T c = std::log(d2) - std::log(d1) - m1 * m1 / (2 * d1 * d1) + m2 * m2 / (2 * d2 * d2);
    const T discriminant = b * b - 4 * a * c;
    return discriminant >= 0 ? (-b - std::sqrt(discriminant)) / (2 * a) : 0;
}

/// Two normal distributions of scores: of the person that is looked for, and of the others.
template <class T> struct Mixture {
    T m1, d1, m2, d2;

    /// The mean of the scores that are rather the person's own than another's: those up to where the numbers
    /// of both kinds are balanced. m1 if there are none.
    T ownMean(FNVector<T> const& bins, FNVector<unsigned int> const& counts) const {
        const T end = intersection(m1, d1, m2, d2);
        T all = 0, own = 0, sum = 0;
        for (const unsigned int count : counts) all += static_cast<T>(count);
        for (std::size_t i = 0; i < bins.size() && bins[i] < end; ++i) {
            if (counts[i] == 0) continue;
            const T v = bins[i], h = static_cast<T>(counts[i]), n = own + h;
            const T g1 = density(v, m1, d1), g2 = density(v, m2, d2);
            const T x = g1 != 0 ? g1 * n : 0, y = g2 != 0 ? (all - n) * g2 : 0;
            if (!(x > y)) break;
            own = n;
            sum += h * v;
        }
        return own >= 1 ? sum / own : m1;
    }

    /// Shares of the others' scores below `x`, times a factor, and of the person's own above.
    T others(T x, T factor) const {
        return factor * (T(0.5) + T(0.5) * std::erf((x - m2) / (std::numbers::sqrt2_v<T> * d2)));
    }
    T own(T x) const { return T(0.5) - T(0.5) * std::erf((x - m1) / (std::numbers::sqrt2_v<T> * d1)); }

    /// Where the share of the others, times a factor, equals that of the person.
    T balance(T factor, T least, T greatest, T tolerance) const {
        T lo = least, hi = greatest, mid = (lo + hi) / 2, e1 = 0, e2 = 0;
        while (hi - lo > tolerance) {
            mid = (lo + hi) / 2;
            e2 = others(mid, factor);
            e1 = own(mid);
            if (e2 - e1 < 0)
                lo = mid;
            else if (e2 - e1 > 0)
                hi = mid;
            if (!(std::abs(e2 - e1) > std::max(e1, e2) / 1000)) break;
        }
        if (e1 != 0 || e2 != 0) return mid;
        // Both are too small for numbers there: between the places where they are not.
        return (leave(mid, 1, [&](T x) { return others(x, factor); }) +
                leave(mid, -1, [&](T x) { return own(x); })) /
               2;
    }

private:
    /// The first of doubling steps from `x` on at which a share is not 0.
    template <class Share> static T leave(T x, T direction, Share share) {
        for (T step = T(0.001); share(x) == 0 && std::isfinite(x); step *= 2) x += direction * step;
        return x;
    }
};

} // namespace

template <class T> T EM::linearApproxOfGaussDensity(T const& x, T const& mean, T const& deviation) {
    if (deviation == 0) return x == mean ? T(1) : T(0);
    const T e = (x - mean) * (x - mean) / (-2 * deviation * deviation);
    const auto piece = std::ranges::find_if(pieces, [&](const Piece& p) { return e >= p.from; });
    const T u = piece == std::end(pieces) ? std::exp(e) : piece->slope * e + piece->offset;
    return u / (deviation * static_cast<T>(rootOfTwoPi));
}

template <class T>
bool EM::estimateBinomialGauss(FNVector<T> const& bins, FNVector<unsigned int> const& counts, T& mean1,
                               T& mean2, T& deviation1, T& deviation2, T& weight) {
    constexpr int mostRounds = 50;
    using Vector = FNVector<T>;
    const std::size_t n = bins.size();
    if (n == 0) return false;
    T total = 0;
    for (const unsigned int count : counts) total += static_cast<T>(count);
    const T tolerance = std::abs(mean2 - mean1) / T(21.315);
    T meanChange = 1, deviationChange = 1;
    for (int round = 0; round < mostRounds && (meanChange > tolerance || deviationChange > tolerance);
         ++round) {
        Vector a(n), b(n);
        T *const own = a.getExclusive(), *const others = b.getExclusive();
        for (std::size_t i = 0; i < n; ++i) {
            const T v = bins.get()[i], h = static_cast<T>(counts.get()[i]);
            const T g1 = weight * linearApproxOfGaussDensity(v, mean1, deviation1);
            const T g2 = (1 - weight) * linearApproxOfGaussDensity(v, mean2, deviation2);
            const T r = g1 + g2 > T(1.1920929e-7) ? h / (g1 + g2) : h;
            own[i] = g1 * r;
            others[i] = g2 * r;
        }
        weight = a.sum() / total;
        const T n1 = total * weight, n2 = total - n1;
        const auto mean = [&](const Vector& shares, T count) {
            return count > 0 ? shares * bins / count : 0;
        };
        const auto deviation = [&](const Vector& shares, T m, T count) {
            Vector squares(bins);
            T* const out = squares.getExclusive();
            for (std::size_t i = 0; i < n; ++i) out[i] = (out[i] - m) * (out[i] - m);
            const T variance = shares * squares / count;
            return variance > 0 ? std::sqrt(variance) : 0;
        };
        const T m1 = mean(a, n1), m2 = mean(b, n2);
        const T d1 = deviation(a, m1, n1), d2 = deviation(b, m2, n2);
        meanChange = std::max(std::abs(m1 - mean1), std::abs(m2 - mean2));
        deviationChange = std::max(std::abs(d1 - deviation1), std::abs(d2 - deviation2));
        mean1 = m1;
        mean2 = m2;
        deviation1 = d1;
        deviation2 = d2;
    }
    return true;
}

template <class T>
void one2ManyBNormalization(FNVector<T> const& bins, FNVector<unsigned int> const& counts, T& offset,
                            T& scale, BNormParams const& params) {
    constexpr T strict = 200, loose = 20; // others' scores that count as much as one of the person's
    Mixture<T> mixture{params.startMean1, params.startDeviation1, params.startMean2, params.startDeviation2};
    T weight = T(0.01);
    if (!EM::estimateBinomialGauss(bins, counts, mixture.m1, mixture.m2, mixture.d1, mixture.d2, weight))
        return;
    mixture.m1 = params.mean1;
    mixture.d1 = params.deviation1;
    mixture.m1 = mixture.ownMean(bins, counts);
    const T mid = mixture.balance(strict, params.least, params.greatest, T(5e-6));
    if (mid == 0) {
        scale = 1 / params.fallbackScale;
        offset = params.fallbackOffset / params.fallbackScale;
        return;
    }
    const T mid2 = mixture.balance(loose, params.least, params.greatest, T(5e-7));
    T s = params.fallbackScale, o = params.fallbackOffset;
    if (mid2 - mid > T(0.0001)) {
        const T z = mid2 == 0 ? T(-0.002326) : mid2;
        s = T(-0.001124) / (mid - z);
        o = T(-0.00345) - mid * s;
    }
    scale = 1 / s;
    offset = o / s;
}

RawMatches normalizeRawScores(const RawMatches& matches, const ScoreHistogram& histogram) {
    const std::size_t n = histogram.size();
    FNVector<float> centres(n);
    ScoreHistogram counts(n);
    for (std::size_t i = 0; i < n; ++i) {
        const float centre = static_cast<float>(i) * rawScoreBinWidth + rawScoreMin + rawScoreBinWidth / 2;
        centres.getExclusive()[n - 1 - i] = centre * b7NormParams.binFactor;
        counts.getExclusive()[n - 1 - i] = histogram.get()[i];
    }
    float offset = 0, scale = 1;
    one2ManyBNormalization(centres, counts, offset, scale, b7NormParams);
    scale /= 0.0001f;
    offset /= 0.0001f;
    RawMatches normalized;
    for (const RawMatch& match : matches) normalized.emplace((match.score - offset) / scale, match.id);
    return normalized;
}

template void one2ManyBNormalization(FNVector<float> const&, FNVector<unsigned int> const&, float&, float&,
                                     BNormParams const&);
template bool EM::estimateBinomialGauss(FNVector<float> const&, FNVector<unsigned int> const&, float&, float&,
                                        float&, float&, float&);
template float EM::linearApproxOfGaussDensity(float const&, float const&, float const&);

} // namespace Cmp::B7

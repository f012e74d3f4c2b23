#pragma once

#include <cstdint>
#include <memory>
#include <vector>

namespace Img::Fft {

/// How a line of `n` complex points is transformed: which butterflies, with which twiddle factors.
///
/// The transform is a Stockham autosort of mixed radix (C. Van Loan, "Computational Frameworks for the Fast
/// Fourier Transform", 1992): stage by stage, the points go from one buffer to another, and come out in
/// order. Lengths with a prime factor above `largestRadix` become a convolution of a smooth length (L.
/// Bluestein, 1970).
///
/// T is `float`, or `std::int32_t` for fixed point: there, factors are in units of 2^-31, and each stage of
/// radix r first shifts its input right by ceil(log2 r) bits, so that nothing overflows whatever comes.
template <class T> struct LinePlan {
    static constexpr std::uint32_t largestRadix = 31;

    /// Whether there are butterflies for all prime factors of `n`.
    static bool isSmooth(std::uint32_t n);

    /// @throws FNEBadArg if n is less than 2; for fixed point, if n is not smooth.
    explicit LinePlan(std::uint32_t n);

    struct Stage {
        std::uint32_t radix;
        std::uint32_t
            groups; ///< number of different twiddle factors: what is left to transform after this stage
        std::uint32_t stride;  ///< product of the radices before
        std::uint32_t shift;   ///< bits, 0 for float
        std::size_t twiddles;  ///< offset of (radix - 1) * groups pairs of cosine and sine
        std::size_t rotations; ///< of an odd radix: offset of `radix` pairs, the unit roots
    };

    /// Points in a work buffer.
    std::uint32_t bufferSize() const { return convolution ? convolution->n : n; }
    /// Bits by which the result is shifted right.
    std::uint32_t totalShift() const;

    std::uint32_t n;
    std::vector<Stage> stages;
    std::vector<T> factors;

    std::unique_ptr<LinePlan> convolution; ///< set if n is not smooth; there are no stages then
    std::vector<T> chirp;                  ///< n pairs: exp(-i pi k^2 / n)
    std::vector<T> filter; ///< convolution->n pairs: spectrum of the conjugate chirp, divided by that n

private:
    void makeStages();
    void makeConvolution();
};

} // namespace Img::Fft

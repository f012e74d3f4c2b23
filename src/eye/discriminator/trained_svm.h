#pragma once

#include "fn/sign_value_vector.h"
#include "fn/vector.h"

#include <iosfwd>
#include <string>
#include <vector>

namespace Eye::Implementation {

/// A support vector machine on sign vectors, as training leaves it and as model files hold it.
///
/// Its decision value for x is the sum over the support vectors of alpha * K(x, vector), less the bias, where
/// K is the scalar product (Dot) or (scalar product / kernelScale + kernelConstant)^2
/// (FullPolynomialDegree2).
///
/// File: one line of text, "Dot BIAS" or "FullPolynomial 2 CONSTANT SCALE BIAS"; behind it, as packages, the
/// vector of alphas and then the support vectors, in trained order and trained bit order.
struct TrainedSvm {
    enum class Kernel { Dot, FullPolynomialDegree2 };

    Kernel kernel = Kernel::Dot;
    float kernelConstant = 0;
    float kernelScale = 1;
    float bias = 0;
    std::vector<float> alphas;
    std::vector<Fn::SignValueVector<int>> supportVectors;

    /// @throws FNEBadFormat if the bytes are no such machine with the wanted kernel; memory grows with what
    /// has arrived, not with what counts announce.
    static TrainedSvm read(std::istream& stream, Kernel kernel);
    /// @throws FNEIOError
    void write(std::ostream& stream) const;

    /// @throws FNEBadFormat if an alpha is no number
    void requireFinite() const;

    /// The decision value in double precision, the reference for faster forms.
    double evaluate(const Fn::SignValueVector<int>& x) const;
};

} // namespace Eye::Implementation

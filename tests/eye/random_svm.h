#pragma once

#include "eye/discriminator/trained_svm.h"

#include <random>

/// Machines and windows for tests and benchmarks, the same for the same seed.

inline Fn::SignValueVector<int> randomSigns(std::uint32_t n, std::mt19937& random) {
    Fn::SVVectorSequentialBuilder<int> builder(n);
    while (builder.position() < n) builder.setNextSign(random() & 1);
    return builder.vector();
}

/// @param scale of a polynomial kernel; alphas lie between -1 and 1
inline Eye::Implementation::TrainedSvm randomSvm(Eye::Implementation::TrainedSvm::Kernel kernel,
                                                 std::size_t n, std::uint32_t dimension, unsigned seed,
                                                 float constant = 0.5f, float scale = 300) {
    std::mt19937 random(seed);
    std::uniform_real_distribution<float> alpha(-1, 1);
    Eye::Implementation::TrainedSvm svm;
    svm.kernel = kernel;
    svm.kernelConstant = constant;
    svm.kernelScale = scale;
    svm.bias = alpha(random);
    for (std::size_t i = 0; i < n; ++i) {
        svm.alphas.push_back(alpha(random));
        svm.supportVectors.push_back(randomSigns(dimension, random));
    }
    return svm;
}

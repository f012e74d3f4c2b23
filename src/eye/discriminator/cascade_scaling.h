#pragma once

#include "eye/discriminator/cascade_tables.h"
#include "eye/discriminator/cascaded_svm_discriminator.h"

/// From the floats of a trained machine to the integers of its cascade.

namespace Eye::Implementation {

/// A step in floats.
struct FloatStep {
    std::uint32_t limit;
    float threshold;
};

/// The steps of a configured cascade in ascending order; the last one alone if nothing is configured.
/// @throws FNEBadArg for an entry that is no number; FNEOutOfRange for one beyond the `n` support vectors
std::vector<FloatStep> readSteps(const CascadeSettings& settings, std::size_t n);

/// Order of evaluation of the support vectors: step by step, within each by alpha (alpha_order.h).
std::vector<std::uint32_t> evaluationOrder(const std::vector<float>& alphas,
                                           const std::vector<FloatStep>& steps);

/// Kernel of `trained` for vectors of `dimension` values. @throws FNEBadFormat if it does not fit 32-bit
/// integers
void scaleKernel(const TrainedSvm& trained, std::uint32_t dimension, FpKernelDeg2& kernel);
void scaleKernel(const TrainedSvm& trained, std::uint32_t dimension, DotKernel& kernel);

/// Factor of the alphas for the integer kernel in place of the trained one.
double alphaFactor(const FpKernelDeg2& kernel);
double alphaFactor(const DotKernel& kernel);

/// Fills in alphas (`alphas` in evaluation order, scaled for the kernel), bias, shift, steps and shortcut of
/// `tables`.
/// @return the factor from sums to scores
/// @throws FNEBadFormat if the alphas are all 0 or not finite
float scaleTables(const std::vector<float>& alphas, float bias, const std::vector<FloatStep>& steps,
                  CascadeTables& tables);

/// Copies the support vectors, all of one size, into the tables.
void setVectors(const std::vector<Fn::SignValueVector<int>>& vectors, CascadeTables& tables);
/// The support vectors as they were copied in.
std::vector<Fn::SignValueVector<int>> getVectors(const CascadeTables& tables);

} // namespace Eye::Implementation

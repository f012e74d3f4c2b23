#pragma once

#include "eye/discriminator/cascaded_svm_discriminator.h"
#include "fn/deployment/component.h"
#include "fn/serialize.h"

namespace Eye::Cara::T8 {

/// The discriminators of the early stages on signs of differences, by their kernels, and those on Gabor
/// signs.
using SodDotDiscriminator =
    Implementation::CascadedSvmDiscriminator<Implementation::DotKernel, Implementation::CombinedSods16x16>;
using SodPolynomialDiscriminator =
    Implementation::CascadedSvmDiscriminator<Implementation::FpKernelDeg2, Implementation::CombinedSods16x16>;
using GaborDiscriminator =
    Implementation::CascadedSvmDiscriminator<Implementation::FpKernelDeg2, Implementation::TrainedLayout>;

/// The discriminators for faces of one rotation in the image plane, in the order in which they decide.
struct CombinedCascade {
    CombinedCascade(const Fn::Deployment::Component& component, const std::string& templatePath);
    explicit CombinedCascade(const Fn::Package& package);
    explicit operator Fn::Package() const;

    static std::string typeId() { return "Eye::Cara::T8::CombinedCascade"; }
    static Fn::Deployment::Type define();

    float rotationAngle; ///< radians
    SodDotDiscriminator disc1B;
    SodPolynomialDiscriminator disc1C;
    GaborDiscriminator disc2A;

private:
    explicit CombinedCascade(Fn::PackageReader reader);
};

} // namespace Eye::Cara::T8

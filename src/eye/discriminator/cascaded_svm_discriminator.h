#pragma once

#include "eye/discriminator/cascade_settings.h"
#include "eye/discriminator/cascade_tables.h"
#include "eye/discriminator/sod_conversion.h"
#include "eye/discriminator/trained_svm.h"

#include <string>
#include <vector>

/// The discriminators of the finders: support vector machines on sign vectors, evaluated in fixed point as a
/// cascade that drops most windows after the first support vectors.
///
///     const Discriminator disc(settings, "/usr/share/orbek/etc/cara");
///     float score;
///     if (disc(window, score)) ...   // a face of confidence `score`
///
/// A discriminator is immutable once constructed; operator() may run on any number of threads.

namespace Eye::Implementation {

struct FloatStep;

/// Layouts of the support vectors in evaluation, and how each comes from the trained bit order. With the
/// filler 0, a vector in trained order becomes what a window of the scan holds.
struct TrainedLayout {
    static std::string text() { return "TL"; }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained, unsigned char = 0) {
        return trained;
    }
};

template <std::uint32_t columns, std::uint32_t rows> struct CombinedSodsColumn32BitAlignedLayout {
    static std::string text() { return "Col" + std::to_string(columns) + "x" + std::to_string(rows); }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained,
                                            unsigned char filler = halfSetFiller) {
        return SodConversion::sod2csod(trained, columns, rows, SodConversion::SodLayout::ColumnAligned,
                                       filler);
    }
};

template <std::uint32_t columns, std::uint32_t rows, std::uint32_t directions>
struct SparseGaborSodColumnAlignedLayout {
    static std::string text() { return "Col" + std::to_string(columns) + "x" + std::to_string(rows); }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained,
                                            unsigned char filler = halfSetFiller) {
        return GSodConversion::sod2ssod(trained, columns, rows, directions,
                                        GSodConversion::GSodLayout::ColumnAligned, filler);
    }
};

/// What distinguishes the kernels outside of the evaluation.
template <class Kernel> struct KernelTraits;
template <> struct KernelTraits<DotKernel> {
    static constexpr TrainedSvm::Kernel trained = TrainedSvm::Kernel::Dot;
    static constexpr const char* text = "Dot";
};
template <> struct KernelTraits<FpKernelDeg2> {
    static constexpr TrainedSvm::Kernel trained = TrainedSvm::Kernel::FullPolynomialDegree2;
    static constexpr const char* text = "FP2";
};

template <class Kernel, class Layout> class CascadedSvmDiscriminator {
public:
    using KernelType = Kernel;
    using LayoutType = Layout;

    /// Score of a rejected vector.
    static constexpr float rejected = -99.0f;

    /// Reads `templatePath`/`settings.file`.
    /// @throws FNEIOError that names the file and what is wrong with it; FNEBadArg for a step that is no
    /// number, and FNEOutOfRange for one beyond the number of support vectors
    CascadedSvmDiscriminator(const CascadeSettings& settings, const std::string& templatePath);
    /// With the settings of a component of type CascadeSettings.
    CascadedSvmDiscriminator(const Fn::Deployment::Component& component, const std::string& templatePath)
        : CascadedSvmDiscriminator(CascadeSettings::read(component), templatePath) {}
    /// From a machine in memory, whose vectors are in trained order and bit order.
    /// @throws FNEBadFormat if it cannot be scaled to integers; for steps as above
    CascadedSvmDiscriminator(const TrainedSvm& trained, const CascadeSettings& settings);
    /// @throws FNEBadArg if the package holds no discriminator of this kind
    explicit CascadedSvmDiscriminator(const Fn::Package& package);
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    /// Whether `x`, in the layout L, passes every step; `score` receives the decision value, or `rejected`.
    /// @throws FNEBadArg if `x` has not `dimension()` values
    bool operator()(const Fn::SignValueVector<int>& x, float& score) const;

    /// Number of values of a vector.
    std::uint32_t dimension() const noexcept { return tables_.dimension; }
    /// Names kernel, layout, file and cascade.
    const std::string& processingId() const noexcept { return processingId_; }

    const Kernel& kernel() const noexcept { return kernel_; }
    const CascadeTables& tables() const noexcept { return tables_; }
    float resultScale() const noexcept { return resultScale_; }

private:
    void load(const TrainedSvm& trained, const std::vector<FloatStep>& steps);

    Kernel kernel_;
    CascadeTables tables_;
    float resultScale_ = 1;
    std::string processingId_;
};

using CombinedSods16x16 = CombinedSodsColumn32BitAlignedLayout<16, 16>;

extern template class CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;
extern template class CascadedSvmDiscriminator<FpKernelDeg2, CombinedSods16x16>;
extern template class CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
extern template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<7, 7, 6>>;
extern template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 6, 6>>;
extern template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 8, 6>>;

} // namespace Eye::Implementation

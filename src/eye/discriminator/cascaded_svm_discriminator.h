#pragma once

#include "eye/discriminator/cascade_tables.h"
#include "eye/discriminator/sod_conversion.h"
#include "eye/discriminator/trained_svm.h"

#include <map>
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

/// Which file to read and where to stop.
struct CascadeSettings {
    struct Entry {
        std::string steps; ///< how many support vectors have been seen, a decimal number
        float threshold;   ///< what the decision value has to reach by then
    };

    std::string file; ///< relative to the template path
    /// Empty for the single step of all support vectors at the threshold -99.
    std::vector<Entry> cascade;
};

/// Layouts of the support vectors in evaluation, and how each comes from the trained bit order.
struct TrainedLayout {
    static std::string text() { return "TL"; }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained) { return trained; }
};

template <std::uint32_t columns, std::uint32_t rows> struct CombinedSodsColumn32BitAlignedLayout {
    static std::string text() { return "Col" + std::to_string(columns) + "x" + std::to_string(rows); }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained) {
        return SodConversion::sod2csod(trained, columns, rows, SodConversion::SodLayout::ColumnAligned,
                                       halfSetFiller);
    }
};

template <std::uint32_t columns, std::uint32_t rows, std::uint32_t directions>
struct SparseGaborSodColumnAlignedLayout {
    static std::string text() { return "Col" + std::to_string(columns) + "x" + std::to_string(rows); }
    static Fn::SignValueVector<int> convert(const Fn::SignValueVector<int>& trained) {
        return GSodConversion::sod2ssod(trained, columns, rows, directions,
                                        GSodConversion::GSodLayout::ColumnAligned, halfSetFiller);
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
    /// Score of a rejected vector.
    static constexpr float rejected = -99.0f;

    /// Reads `templatePath`/`settings.file`.
    /// @throws FNEIOError that names the file and what is wrong with it; FNEBadArg for a step that is no
    /// number, and FNEOutOfRange for one beyond the number of support vectors
    CascadedSvmDiscriminator(const CascadeSettings& settings, const std::string& templatePath);
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
    void load(const TrainedSvm& trained, const CascadeSettings& settings);

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

#include "eye/discriminator/cascaded_svm_discriminator.h"

#include "eye/discriminator/cascade_scaling.h"
#include "fn/serialize.h"

#include <cstring>
#include <fstream>
#include <sstream>

namespace Eye::Implementation {
namespace {

using Signs = Fn::SignValueVector<int>;
using SignVectors = Fn::SerializableVector<Signs>;
using Thresholds = Fn::SerializableMap<unsigned int, int>;

std::string makeProcessingId(const char* kernel, const std::string& layout, const CascadeSettings& settings) {
    std::ostringstream id;
    id << "Svm-" << kernel << '-' << layout << '-' << settings.file;
    const char* separator = "";
    for (const auto& entry : settings.cascade) {
        id << separator << entry.steps << '-' << entry.threshold;
        separator = "-";
    }
    return id.str();
}

Fn::Package packKernel(const DotKernel&) {
    return Fn::Package(std::list<Fn::Package>());
}

Fn::Package packKernel(const FpKernelDeg2& kernel) {
    return Fn::Package(std::list<Fn::Package>{Fn::Package(kernel.scale), Fn::Package(kernel.offset),
                                              Fn::Package(kernel.hasOffset), Fn::Package(kernel.shift)});
}

void unpackKernel(Fn::PackageReader reader, DotKernel&) {
    reader.expectEnd();
}

void unpackKernel(Fn::PackageReader reader, FpKernelDeg2& kernel) {
    kernel.scale = reader.next<float>();
    kernel.offset = reader.next<int>();
    kernel.hasOffset = reader.next<bool>();
    kernel.shift = reader.next<unsigned int>();
    reader.expectEnd();
}

void require(bool holds) {
    if (!holds) FN_THROW(FNEBadArg, "CascadedSvmDiscriminator: invalid package");
}

/// Checks what the evaluation relies on.
void requireValid(const FpKernelDeg2& kernel, std::uint32_t dimension) {
    const std::int64_t largest = std::abs(std::int64_t{kernel.offset}) + dimension;
    require(largest * largest <= std::int64_t{1} << 31 && kernel.shift < 32 &&
            kernel.hasOffset == (kernel.offset != 0));
}

void requireValid(const DotKernel&, std::uint32_t dimension) {
    require(dimension <= 32767);
}

} // namespace

template <class Kernel, class Layout>
CascadedSvmDiscriminator<Kernel, Layout>::CascadedSvmDiscriminator(const CascadeSettings& settings,
                                                                   const std::string& templatePath) {
    const std::string path = templatePath + "/" + settings.file;
    /// A failure of the content names the file.
    const auto fromFile = [&](auto reading) {
        try {
            reading();
        } catch (const FNException& e) {
            FN_THROW(FNEIOError, "CascadedSvmDiscriminator: error during read of template file `" + path +
                                     "' : " + e.what());
        }
    };
    TrainedSvm trained;
    fromFile([&] {
        std::ifstream file(path, std::ios::binary);
        if (!file) FN_THROW(FNEIOError, "file could not be opened for reading");
        trained = TrainedSvm::read(file, KernelTraits<Kernel>::trained);
    });
    const std::vector<FloatStep> steps = readSteps(settings, trained.alphas.size());
    fromFile([&] { load(trained, steps); });
    processingId_ = makeProcessingId(KernelTraits<Kernel>::text, Layout::text(), settings);
}

template <class Kernel, class Layout>
CascadedSvmDiscriminator<Kernel, Layout>::CascadedSvmDiscriminator(const TrainedSvm& trained,
                                                                   const CascadeSettings& settings)
    : processingId_(makeProcessingId(KernelTraits<Kernel>::text, Layout::text(), settings)) {
    if (trained.kernel != KernelTraits<Kernel>::trained ||
        trained.alphas.size() != trained.supportVectors.size())
        FN_THROW(FNEBadArg, "CascadedSvmDiscriminator: machine of another kernel or incomplete");
    load(trained, readSteps(settings, trained.alphas.size()));
}

template <class Kernel, class Layout>
void CascadedSvmDiscriminator<Kernel, Layout>::load(const TrainedSvm& trained,
                                                    const std::vector<FloatStep>& steps) {
    if (trained.alphas.empty()) FN_THROW(FNEBadFormat, "invalid alphas");
    trained.requireFinite();
    std::vector<Signs> converted;
    for (const Signs& vector : trained.supportVectors) converted.push_back(Layout::convert(vector));
    scaleKernel(trained, converted.front().size(), kernel_);

    const double factor = alphaFactor(kernel_);
    std::vector<float> alphas;
    std::vector<Signs> vectors;
    for (const std::uint32_t i : evaluationOrder(trained.alphas, steps)) {
        alphas.push_back(static_cast<float>(static_cast<double>(trained.alphas[i]) * factor));
        vectors.push_back(converted[i]);
    }
    resultScale_ = scaleTables(alphas, trained.bias, steps, tables_);
    tables_.earlyExit = trained.kernel == TrainedSvm::Kernel::FullPolynomialDegree2;
    setVectors(vectors, tables_);
}

template <class Kernel, class Layout>
bool CascadedSvmDiscriminator<Kernel, Layout>::operator()(const Signs& x, float& score) const {
    if (x.size() != tables_.dimension)
        FN_THROW(FNEBadArg, "Fn::SignValueVector::dotProduct: inequal sizes of vectors " +
                                std::to_string(x.size()) + " and " + std::to_string(tables_.dimension) + "!");
    const unsigned char* bits = x.bytes();
    alignas(64) unsigned char padded[largestStride];
    if (const std::uint32_t bytes = x.byteCount(); bytes != tables_.stride) {
        std::memcpy(padded, bits, bytes);
        std::memset(padded + bytes, 0, tables_.stride - bytes);
        bits = padded;
    }
    std::int64_t sum = 0;
    const bool accepted = evaluateCascade(tables_, kernel_, bits, sum);
    score = accepted ? static_cast<float>(sum) * resultScale_ : rejected;
    return accepted;
}

template <class Kernel, class Layout>
Fn::Package CascadedSvmDiscriminator<Kernel, Layout>::serialize() const {
    Thresholds thresholds;
    std::vector<unsigned int> steps;
    for (const auto& step : tables_.steps) {
        thresholds[step.limit] = step.threshold;
        steps.push_back(step.limit);
    }
    return Fn::Package(std::list<Fn::Package>{
        Fn::Package(SignVectors(getVectors(tables_))), Fn::Package(FNVector<short>(tables_.alphas)),
        Fn::Package(tables_.bias), Fn::Package(thresholds), packKernel(kernel_),
        Fn::Package(Fn::SerializableVector<unsigned int>(steps)), Fn::Package(tables_.earlyExit),
        Fn::Package(tables_.alphaShift), Fn::Package(resultScale_), Fn::Package(tables_.firstStepShortcut),
        Fn::Package(static_cast<int>(tables_.firstStepThreshold)),
        Fn::serialize<std::string>(processingId_)});
}

template <class Kernel, class Layout>
CascadedSvmDiscriminator<Kernel, Layout>::CascadedSvmDiscriminator(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    const auto vectors = reader.next<SignVectors>();
    const auto alphas = reader.next<FNVector<short>>();
    require(!vectors.empty() && vectors.size() == alphas.size());
    for (const Signs& vector : vectors) require(vector.size() == vectors.front().size());
    tables_.alphas.assign(alphas.begin(), alphas.end());
    tables_.bias = reader.next<int>();
    const auto thresholds = reader.next<Thresholds>();
    unpackKernel(Fn::PackageReader(reader.next<Fn::Package>()), kernel_);
    for (const unsigned int limit : reader.next<Fn::SerializableVector<unsigned int>>()) {
        const auto threshold = thresholds.find(limit);
        require(threshold != thresholds.end() && limit <= vectors.size());
        tables_.steps.push_back({limit, threshold->second});
    }
    tables_.earlyExit = reader.next<bool>();
    tables_.alphaShift = reader.next<unsigned int>();
    resultScale_ = reader.next<float>();
    tables_.firstStepShortcut = reader.next<bool>();
    const int firstStepThreshold = reader.next<int>();
    processingId_ = reader.next<std::string>();
    reader.expectEnd();

    require(tables_.alphaShift < 32 && static_cast<std::int16_t>(firstStepThreshold) == firstStepThreshold);
    tables_.firstStepThreshold = static_cast<std::int16_t>(firstStepThreshold);
    requireValid(kernel_, vectors.front().size());
    setVectors(vectors, tables_);
}

template class CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;
template class CascadedSvmDiscriminator<FpKernelDeg2, CombinedSods16x16>;
template class CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<7, 7, 6>>;
template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 6, 6>>;
template class CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 8, 6>>;

} // namespace Eye::Implementation

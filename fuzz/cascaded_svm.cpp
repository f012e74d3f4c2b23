// Cascaded discriminators from files and packages: what is accepted can be evaluated, and survives its
// package.

#include "eye/discriminator/cascaded_svm_discriminator.h"

#include <cstdlib>
#include <sstream>

namespace {

using namespace Eye::Implementation;

template <class Read> void tolerate(Read read) {
    try {
        read();
    } catch (const FNException&) {
    }
}

template <class Disc> void use(const Disc& disc) {
    Fn::SignValueVector<int> window(disc.dimension());
    const Disc copy(disc.serialize());
    float score = 0, copyScore = 0;
    const bool accepted = disc(window, score);
    if (copy(window, copyScore) != accepted) std::abort();
}

template <class Disc> void readFile(const std::string& bytes, const CascadeSettings& settings) {
    tolerate([&] {
        std::istringstream stream(bytes);
        use(Disc(TrainedSvm::read(stream, KernelTraits<typename Disc::KernelType>::trained), settings));
    });
}

template <class Disc> void readPackage(const Fn::Package& package) {
    tolerate([&] { use(Disc(package)); });
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    using Dot = CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;
    using Polynomial = CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    for (const CascadeSettings& settings :
         {CascadeSettings{"", {}}, CascadeSettings{"", {{"1", -0.5f}, {"2", -0.1f}}}}) {
        readFile<Dot>(bytes, settings);
        readFile<Polynomial>(bytes, settings);
    }
    Fn::Package package;
    tolerate([&] { package = Fn::Package(data, size); });
    readPackage<Dot>(package);
    readPackage<Polynomial>(package);
    return 0;
}

// The text-headed files of the float discriminators: what is accepted can be evaluated and written.

#include "eye/discriminator/svm_fp_discriminator.h"

#include <sstream>

namespace {

template <class Use> void tolerate(const std::string& bytes, Use use) {
    try {
        std::istringstream stream(bytes);
        use(stream);
    } catch (const FNException&) {
    }
}

template <class Model> void write(const Model& model) {
    std::ostringstream stream;
    model.write(stream);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    double score = 0;
    tolerate(bytes, [&](std::istream& stream) {
        const auto svm = Eye::FullPolynomialSvm::read(stream, "SVMFPDiscriminator");
        write(svm);
        const std::size_t n = svm.support.dimension();
        Eye::SVMFPDiscriminator(svm, 0)(Img::FeatureVector<float>(FNVector<float>(n, 0.5f)), score);
        const FNVector<short> fixed(n, short{100});
        Eye::SVMFPDiscriminatorFixed(svm, 0)(Img::FeatureVector<short>(fixed), score);
    });
    tolerate(bytes, [](std::istream& stream) { write(Eye::LdDiscriminator(stream, 0)); });
    tolerate(bytes, [](std::istream& stream) { write(Eye::QuadDiscriminator(stream)); });
    tolerate(bytes, [](std::istream& stream) { write(Eye::SVMRBFDiscriminator(stream)); });
    tolerate(bytes, [&](std::istream& stream) {
        const Eye::SVMHyperbolicDiscriminator disc(stream);
        write(disc);
        disc(Img::FeatureVector<float>(FNVector<float>(disc.support.dimension(), 0.5f)), score);
    });
    return 0;
}

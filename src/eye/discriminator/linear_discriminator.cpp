#include "eye/discriminator/linear_discriminator.h"

#include "eye/discriminator/template_stream.h"

namespace Eye {
namespace {

using Implementation::TemplateReader;
using Implementation::TemplateWriter;

constexpr const char* magic = "ld";

} // namespace

FloatLayout canonicalLayout() {
    static const FNCountedPtr<Img::CanonicalFeatureVectorLayout<float>> layout(
        new Img::CanonicalFeatureVectorLayout<float>);
    return layout;
}

LdDiscriminator::LdDiscriminator(const FNVector<float>& weights, const double& threshold,
                                 const FloatLayout& layout, const std::string& name)
    : threshold_(threshold), layout_(layout), name_(name), canonicalWeights_(weights) {
    const Img::FeatureVector<float> canonical(weights);
    for (unsigned int variant = 0; variant < layout_->variants(); ++variant)
        weights_.push_back(layout_->canonicalToIntermediate(canonical, variant).values());
}

LdDiscriminator::LdDiscriminator(std::istream& stream, const double& threshold, const FloatLayout& layout)
    : LdDiscriminator([&] {
          TemplateReader reader(stream, "LdDiscriminator", magic);
          const std::size_t dimension = reader.readCount();
          const std::string name = reader.readName();
          return LdDiscriminator(reader.readVector<float>(dimension), threshold, layout, name);
      }()) {}

LdDiscriminator LdDiscriminator::create(const std::string& directory, const std::string& file,
                                        const double& threshold, const FloatLayout& layout) {
    return Implementation::readTemplate(directory, file, "LdDiscriminator", [&](std::istream& stream) {
        return LdDiscriminator(stream, threshold, layout);
    });
}

void LdDiscriminator::write(std::ostream& stream) const {
    TemplateWriter(stream, magic).number(canonicalWeights_.size()).name(name_).vector(canonicalWeights_);
}

bool LdDiscriminator::operator()(const Img::FeatureVector<float>& x, double& score) const {
    const FNVector<float>& weights = x.canonical() ? canonicalWeights_ : weights_.at(x.variant());
    score = static_cast<double>(weights * x.values());
    return score > threshold_;
}

QuadDiscriminator::QuadDiscriminator(const std::string& directory, const std::string& file) {
    Implementation::readTemplate(directory, file, "QuadDiscriminator",
                                 [this](std::istream& stream) { read(stream); });
}

void QuadDiscriminator::read(std::istream& stream) {
    TemplateReader reader(stream, "QuadDiscriminator", magic);
    dimension = reader.readInt();
    name = reader.readName();
    coefficients = reader.readVector<double>();
}

void QuadDiscriminator::write(std::ostream& stream) const {
    TemplateWriter(stream, magic).number(dimension).name(name).vector(coefficients);
}

} // namespace Eye

#include "kx/set_identifier.h"

#include "kx/identifier.h"

namespace Kx {

using namespace Fn::Deployment;

namespace {

constexpr const char* doc = "Identifier for image sets.";

} // namespace

SetIdentifier::SetIdentifier(const Component& component, const FaceFinder& faceFinder,
                             const EyesFinder& eyesFinder, const Cmp::Strategy& strategy)
    : eyes_(faceFinder, eyesFinder, component, false), strategy_(strategy) {}

Type SetIdentifier::define() {
    return Type(typeId(), doc, properties(Implementation::EyeSearch::range()), "", false);
}

template <class Samples>
void SetIdentifier::identifyAny(const Samples& samples, const Cmp::Population& population,
                                Cmp::Score threshold, unsigned int maxMatches) const {
    Implementation::Identifier identifier(strategy_, Fn::View<Cmp::Population>({population}), threshold,
                                          maxMatches);
    Implementation::walk(*this, eyes_, samples,
                         [&](const SensorSample& sample, int) { return identifier.compare(sample); });
    broadcast(identifier.matches());
}

void SetIdentifier::identify(const std::list<SensorSample>& samples, const Cmp::Population& population,
                             Cmp::Score threshold, unsigned int maxMatches) const {
    identifyAny(samples, population, threshold, maxMatches);
}

void SetIdentifier::identify(const FNImageSet& images, const Cmp::Population& population,
                             Cmp::Score threshold, unsigned int maxMatches) const {
    identifyAny(images, population, threshold, maxMatches);
}

Type AnnotatedSetIdentifier::define() {
    return Type(typeId(), doc, "", false);
}

void AnnotatedSetIdentifier::identify(const std::list<Cmp::Face>& faces,
                                      const Fn::View<Cmp::Population>& populations, Cmp::Score threshold,
                                      unsigned int maxMatches) const {
    Implementation::Identifier identifier(strategy_, populations, threshold, maxMatches);
    Implementation::walk(*this, faces,
                         [&](const SensorSample& sample, int) { return identifier.compare(sample); });
    broadcast(identifier.matches());
}

} // namespace Kx

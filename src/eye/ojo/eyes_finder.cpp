#include "eye/ojo/eyes_finder.h"

#include "eye/ojo/feature_search.h"
#include "fn/deployment/composite_values.h"
#include "fn/image_reference.h"

namespace Eye::Ojo::T8 {

using namespace Fn::Deployment;

namespace {

// Working points that the trained discriminator is scaled to, see models/CARD.md.
struct Strict {
    static std::string typeId() { return "Strict"; }
    static Type define() {
        return discriminatorType(typeId(), "T8 EyesFinder Strict Settings",
                                 {"eyedisc.dat", {{"5", -1.27f}, {"300", -0.34f}}});
    }
};

struct Tolerant {
    static std::string typeId() { return "Tolerant"; }
    static Type define() {
        return discriminatorType(typeId(), "T8 EyesFinder Tolerant Settings",
                                 {"eyedisc.dat", {{"5", -1.39f}, {"300", -1.0f}}});
    }
};

using DiscSettings = AlternativeN<Strict, Tolerant>;

} // namespace

Type EyesFinder::define() {
    return finderType(typeId(), "T8 EyesFinder Implementation", "$INSTALLDIR/etc/ojo",
                      property<DiscSettings>::create("DiscSettings", "Settings for the discriminator"));
}

class EyesFinder::Impl {
public:
    explicit Impl(const Component& component)
        : search_(Value<String>::get(component.subComponent("TemplatePath")),
                  chosen(component.subComponent("DiscSettings"))) {}

    void find(const EyeSearchAreas& areas, const FNImageReference& image, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const {
        const FNImage<unsigned short> mono = image.toMono16();
        foundFirst = search_.find(mono, areas.first, first);
        foundSecond = search_.find(mono, areas.second, second);
    }

private:
    static Component chosen(const Component& settings) {
        return settings.subComponent(Value<DiscSettings>::get(settings));
    }

    FeatureSearch<EyeScan> search_;
};

EyesFinder::EyesFinder(const Component& component) : impl_(new Impl(component)) {}
EyesFinder::~EyesFinder() = default;

void EyesFinder::find(const FaceFinder::Location& face, const FNImageReference& image, bool& foundFirst,
                      FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const {
    impl_->find(EyeSearchAreas::of(face), image, foundFirst, first, foundSecond, second);
}

void EyesFinder::find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
                      const FNImageReference& image, bool& foundFirst, FacialFeatureLocation& first,
                      bool& foundSecond, FacialFeatureLocation& second) const {
    impl_->find(EyeSearchAreas::of(eye1, eye2), image, foundFirst, first, foundSecond, second);
}

} // namespace Eye::Ojo::T8

#include "eye/boca/mouth_finder.h"

#include "eye/boca/mouth_scan.h"
#include "eye/ojo/feature_search.h"
#include "fn/deployment/composite_values.h"
#include "fn/image_reference.h"

namespace Eye::Boca {

using namespace Fn::Deployment;

namespace {

struct Settings {
    static std::string typeId() { return "T8 MouthFinder Settings"; }
    static Type define() {
        // A working point that the trained discriminator is scaled to, see models/CARD.md.
        return Ojo::T8::discriminatorType(typeId(), typeId(), {"mouthdisc.dat", {{"300", -1.3f}}});
    }
};

constexpr const char* discriminatorKey = "MouthD";

} // namespace

Type MouthFinder::define() {
    return Ojo::T8::finderType(
        typeId(), "T8 MouthFinder Implementation", "$INSTALLDIR/etc/boca",
        property<Settings>::create(discriminatorKey, "Settings for the discriminator"));
}

class MouthFinder::Impl : public Ojo::T8::FeatureSearch<MouthScan> {
public:
    explicit Impl(const Component& component)
        : FeatureSearch(Value<String>::get(component.subComponent("TemplatePath")),
                        component.subComponent(discriminatorKey)) {}
};

MouthFinder::MouthFinder(const Component& component) : impl_(new Impl(component)) {}
MouthFinder::~MouthFinder() = default;

bool MouthFinder::find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
                       const FNImageReference& image, FacialFeatureLocation& result) const {
    return impl_->find(image.toMono16(), MouthScan::placement.area(eye1.pos, eye2.pos), result);
}

} // namespace Eye::Boca

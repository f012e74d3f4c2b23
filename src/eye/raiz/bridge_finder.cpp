#include "eye/raiz/bridge_finder.h"

#include "eye/ojo/feature_search.h"
#include "eye/raiz/bridge_scan.h"
#include "fn/deployment/composite_values.h"
#include "fn/image_reference.h"

namespace Eye::Raiz {

using namespace Fn::Deployment;

namespace {

struct Settings {
    static std::string typeId() { return "T8 BridgeFinder Settings"; }
    static Type define() {
        // A working point that the trained discriminator is scaled to, see models/CARD.md.
        return Ojo::T8::discriminatorType(typeId(), typeId(), {"bridgedisc.dat", {{"300", -0.87f}}});
    }
};

constexpr const char* discriminatorKey = "BridgeD";

} // namespace

Type BridgeFinder::define() {
    return Ojo::T8::finderType(
        typeId(), "T8 BridgeFinder Implementation", "$INSTALLDIR/etc/raiz",
        property<Settings>::create(discriminatorKey, "Settings for the discriminator"));
}

class BridgeFinder::Impl : public Ojo::T8::FeatureSearch<BridgeScan> {
public:
    explicit Impl(const Component& component)
        : FeatureSearch(Value<String>::get(component.subComponent("TemplatePath")),
                        component.subComponent(discriminatorKey)) {}
};

BridgeFinder::BridgeFinder(const Component& component) : impl_(new Impl(component)) {}
BridgeFinder::~BridgeFinder() = default;

bool BridgeFinder::find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
                        const FNImageReference& image, FacialFeatureLocation& result) const {
    return impl_->find(image.toMono16(), BridgeScan::placement.area(eye1.pos, eye2.pos), result);
}

} // namespace Eye::Raiz

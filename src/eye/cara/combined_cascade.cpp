#include "eye/cara/combined_cascade.h"

#include "fn/deployment/composite_values.h"

namespace Eye::Cara::T8 {

using namespace Fn::Deployment;

Type CombinedCascade::define() {
    using Implementation::CascadeSettings;
    using Steps = Container<Float>;
    return Type(
        typeId(), "Discriminators for one rotation of the face",
        properties(property<Float>::create("RotationAngle", "Rotation in the image plane in radians"),
                   property<CascadeSettings>::create("Disc1B", "First discriminator of the rotation"),
                   property<CascadeSettings>::create("Disc1C", "Second discriminator of the rotation"),
                   property<CascadeSettings>::create("Disc2A", "Third discriminator of the rotation")),
        std::list<Default>{Default(type<Steps>(), "Disc1B.Cascade", "1 2 6"),
                           Default(type<Steps>(), "Disc1C.Cascade", "15 40 300"),
                           Default(type<Steps>(), "Disc2A.Cascade", "200")},
        "", false);
}

CombinedCascade::CombinedCascade(const Component& component, const std::string& templatePath)
    : rotationAngle(Value<Float>::get(component.subComponent("RotationAngle"))),
      disc1B(component.subComponent("Disc1B"), templatePath),
      disc1C(component.subComponent("Disc1C"), templatePath),
      disc2A(component.subComponent("Disc2A"), templatePath) {}

CombinedCascade::CombinedCascade(const Fn::Package& package) : CombinedCascade(Fn::PackageReader(package)) {}

CombinedCascade::CombinedCascade(Fn::PackageReader reader)
    : rotationAngle(reader.next<float>()), disc1B(reader.next<SodDotDiscriminator>()),
      disc1C(reader.next<SodPolynomialDiscriminator>()), disc2A(reader.next<GaborDiscriminator>()) {
    reader.expectEnd();
}

CombinedCascade::operator Fn::Package() const {
    return Fn::Package(std::list<Fn::Package>{Fn::Package(rotationAngle), disc1B.serialize(),
                                              disc1C.serialize(), disc2A.serialize()});
}

} // namespace Eye::Cara::T8

#include "orbek/feature_test.h"

#include "orbek/implementation/assessment.h"

namespace Orbek::Portrait::Feature {

class Set::Implementation {
public:
    static Set make(const Kx::Feature::Set& features) {
        return Set(CountedPtr<Implementation>(new Implementation{features}));
    }

    Kx::Feature::Set features;
};

class Test::Implementation : public EngineOf<Kx::Feature::Test> {
public:
    using EngineOf::EngineOf;
};

Set::Set(const CountedPtr<Implementation>& implementation) : implementation_(implementation) {}
Set::Set(const Set&) = default;
Set& Set::operator=(const Set&) = default;
Set::~Set() = default;

bool Set::wearsGlasses() const {
    return implementation_->features.wearsGlasses();
}
Gender Set::gender() const {
    return implementation_->features.gender() == Kx::Feature::Male ? Gender::Male : Gender::Female;
}
Ethnicity Set::ethnicity() const {
    return static_cast<Ethnicity>(implementation_->features.ethnicity());
}
float Set::age() const {
    return implementation_->features.age();
}

static_assert(static_cast<int>(Ethnicity::White) == Kx::Feature::White &&
              static_cast<int>(Ethnicity::Black) == Kx::Feature::Black &&
              static_cast<int>(Ethnicity::Asian) == Kx::Feature::Asian);

Test::Test(const Configuration& configuration)
    : implementation_(new Implementation(configuration, &Resources::featureTest)) {}
Test::Test(const Test&) = default;
Test& Test::operator=(const Test&) = default;
Test::~Test() = default;

Set Test::assess(const Characteristics& portrait) const {
    return Set::Implementation::make(
        implementation_->engine().assess(Characteristics::Implementation::of(portrait).portrait));
}

} // namespace Orbek::Portrait::Feature

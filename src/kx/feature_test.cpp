#include "kx/feature_test.h"

#include "fn/deployment/composite_values.h"
#include "fn/deployment/leaf_values.h"
#include "fn/serialize.h"

#include <optional>

namespace Kx::Feature {

using namespace Fn::Deployment;

namespace {

/// The number of a word in a list; the list's length if it is not there.
int indexOf(const std::list<std::string>& words, const std::string& word) {
    return static_cast<int>(std::distance(words.begin(), std::find(words.begin(), words.end(), word)));
}

std::string wordOf(const std::list<std::string>& words, int index, const char* failure) {
    if (index < 0 || index >= static_cast<int>(words.size()))
        FN_THROW(FNEBadArg, failure + std::to_string(index));
    return *std::next(words.begin(), index);
}

} // namespace

Gender GenderEnumDef::toGender(const std::string& word) {
    const int index = indexOf(enumeration(), word);
    if (index > Male) FN_THROW(FNEBadArg, "Kx::Feature::GenderEnumDef::toGender: unknown gender " + word);
    return static_cast<Gender>(index);
}

std::string GenderEnumDef::toString(Gender gender) {
    return wordOf(enumeration(), gender, "Kx::Feature::GenderEnumDef::toString: unknown gender ");
}

std::string GenderConfig::typeId() {
    return Enum<GenderEnumDef>::typeId();
}
Type GenderConfig::define() {
    return Enum<GenderEnumDef>::define();
}

std::string EthnicityConfig::typeId() {
    return Enum<EthnicityEnumDef>::typeId();
}
Type EthnicityConfig::define() {
    return Enum<EthnicityEnumDef>::define();
}

Ethnicity EthnicityConfig::stringToValue(const std::string& word) {
    const int index = indexOf(EthnicityEnumDef::enumeration(), word);
    if (index > Asian)
        FN_THROW(FNEBadArg, "Kx::Feature::EthnicityConfig::stringToValue: unknown ethnicity " + word);
    return static_cast<Ethnicity>(index);
}

std::string EthnicityConfig::valueToString(Ethnicity ethnicity) {
    return wordOf(EthnicityEnumDef::enumeration(), ethnicity,
                  "Kx::Feature::EthnicityConfig::valueToString: unknwon ethnicity ");
}

// ---- the set

class Set::Implementation {
public:
    Implementation(const Cmp::Portrait::Characteristics& portrait, const Boundaries& boundaries)
        : portrait_(portrait), boundaries_(boundaries) {}

    explicit Implementation(const Component& component)
        : wearsGlasses_(Value<Bool>::get(component.subComponent("WearsGlasses"))),
          gender_(Value<GenderConfig>::get(component.subComponent("Gender"))),
          ethnicity_(Value<EthnicityConfig>::get(component.subComponent("Ethnicity"))),
          age_(Value<Float>::get(component.subComponent("Age"))) {}

    explicit Implementation(Fn::PackageReader reader) {
        const auto byte = reader.next<Fn::Package>().cores();
        if (byte.size() != 1 || byte.front().size() != 1)
            FN_THROW(FNEBadArg, "Kx::Feature::Set: the first element is not one byte");
        wearsGlasses_ = *byte.front().data() != 0;
        gender_ = static_cast<Gender>(reader.next<int>());
        GenderEnumDef::toString(*gender_); // fails for an unknown one
        ethnicity_ = static_cast<Ethnicity>(reader.next<int>());
        EthnicityConfig::valueToString(*ethnicity_);
        age_ = reader.next<float>();
        reader.expectEnd();
    }

    bool wearsGlasses() const {
        return kept(wearsGlasses_,
                    [&] { return portrait().glasses() >= boundaries_->wearsGlassesThreshold(); });
    }
    Gender gender() const {
        return kept(gender_,
                    [&] { return portrait().isMale() >= boundaries_->isMaleThreshold() ? Male : Female; });
    }
    Ethnicity ethnicity() const {
        return kept(ethnicity_, [&] {
            const auto [white, black, asian] = portrait().ethnicity();
            const Ethnicity best = black > white ? Black : White;
            return asian > (best == Black ? black : white) ? Asian : best;
        });
    }
    float age() const {
        return kept(age_, [&] { return portrait().age(); });
    }

private:
    template <class T, class Compute> static T kept(std::optional<T>& value, Compute compute) {
        if (!value) value = compute();
        return *value;
    }
    const Cmp::Portrait::Characteristics& portrait() const {
        if (!portrait_) FN_THROW(FNEBadFunCall, "Not processed!");
        return *portrait_;
    }

    std::optional<Cmp::Portrait::Characteristics> portrait_;
    std::optional<Boundaries> boundaries_;
    mutable std::optional<bool> wearsGlasses_;
    mutable std::optional<Gender> gender_;
    mutable std::optional<Ethnicity> ethnicity_;
    mutable std::optional<float> age_;
};

Set::Set(const FNCountedPtr<const Implementation>& implementation) : implementation_(implementation) {}
Set::Set(const Component& component) : implementation_(new Implementation(component)) {}
Set::Set(const Fn::Package& package) : implementation_(new Implementation(Fn::PackageReader(package))) {}
Set::Set(const Set&) = default;
Set& Set::operator=(const Set&) = default;
Set::~Set() = default;

Type Set::define() {
    return Type(typeId(), "Feature Set",
                properties(property<Bool>::create("WearsGlasses", "Person wears glasses."),
                           property<GenderConfig>::create("Gender", "Gender of the person"),
                           property<EthnicityConfig>::create("Ethnicity", "Ethnicity of the person"),
                           property<Float>::create("Age", "Age of the person.")),
                "", false);
}

bool Set::wearsGlasses() const {
    return implementation_->wearsGlasses();
}
Gender Set::gender() const {
    return implementation_->gender();
}
Ethnicity Set::ethnicity() const {
    return implementation_->ethnicity();
}
float Set::age() const {
    return implementation_->age();
}

Fn::Package Set::serialize() const {
    Fn::Package::Core glasses(1);
    *glasses.getExclusive() = wearsGlasses() ? 1 : 0;
    return Fn::Package(std::list<Fn::Package>{
        Fn::Package(std::list<Fn::Package::Core>{glasses}), Fn::Package(static_cast<int>(gender())),
        Fn::Package(static_cast<int>(ethnicity())), Fn::Package(age())});
}

// ---- the test

Test::Test(const Component& component)
    : boundaries_(Value<Float>::get(component.subComponent("WearsGlassesThreshold")),
                  Value<Float>::get(component.subComponent("IsMaleThreshold"))) {}

Type Test::define() {
    return Type(
        typeId(), "Assessment for portrait features",
        properties(
            propertyWithDefault<Float>::create(
                "WearsGlassesThreshold", -0.8f,
                "Thresholds for glasses weight determining whether the persons wears glasses. Higher "
                "threshold will lead to a higher false acceptance rate. (person wearing glasses but "
                "classified as 'not wearing glasses'). The theoretical range of threshold is from -FLT_MAX "
                "- FLT_MAX"),
            propertyWithDefault<Float>::create(
                "IsMaleThreshold", 0.0f,
                "Threshold for gender detection. Increasing threshold will lead to a higher false rejection "
                "rate (male will not be classified as male)")),
        "", false);
}

Set Test::assess(const Cmp::Portrait::Characteristics& portrait) const {
    return Set(FNCountedPtr<const Set::Implementation>(new Set::Implementation(portrait, boundaries_)));
}

} // namespace Kx::Feature

#pragma once

#include "cmp/portrait/characteristics.h"
#include "fn/deployment/component.h"

/// Plain statements about the person of a portrait, made of its measures.
///
///     const Kx::Feature::Set features = Kx::Feature::Test(component).assess(portrait);
///     if (features.wearsGlasses()) ...
namespace Kx::Feature {

enum Gender : int { Female = 0, Male = 1 };
enum Ethnicity : int { White = 0, Black = 1, Asian = 2 };

/// The words for them.
struct GenderEnumDef {
    static std::list<std::string> enumeration() { return {"female", "male"}; }
    /// @throws FNEBadArg
    static Gender toGender(const std::string& word);
    static std::string toString(Gender gender);
};
struct EthnicityEnumDef {
    static std::list<std::string> enumeration() { return {"White", "Black", "Asian"}; }
};

/// The settings that hold one of them.
struct GenderConfig {
    using ValueType = Gender;
    static std::string typeId();
    static Fn::Deployment::Type define();
    /// @throws FNEBadArg
    static Gender stringToValue(const std::string& word) { return GenderEnumDef::toGender(word); }
    static std::string valueToString(Gender gender) { return GenderEnumDef::toString(gender); }
};
struct EthnicityConfig {
    using ValueType = Ethnicity;
    static std::string typeId();
    static Fn::Deployment::Type define();
    /// @throws FNEBadArg
    static Ethnicity stringToValue(const std::string& word);
    static std::string valueToString(Ethnicity ethnicity);
};

/// From which measure on a statement is true.
class Boundaries {
public:
    Boundaries(float wearsGlassesThreshold, float isMaleThreshold)
        : wearsGlassesThreshold_(wearsGlassesThreshold), isMaleThreshold_(isMaleThreshold) {}

    float wearsGlassesThreshold() const { return wearsGlassesThreshold_; }
    float isMaleThreshold() const { return isMaleThreshold_; }

private:
    float wearsGlassesThreshold_, isMaleThreshold_;
};

/// The statements; each is worked out when it is first asked for, and kept. Copies share them. There is no
/// lock: one set and its copies belong to one thread at a time.
class Set {
public:
    /// Of settings of this type.
    explicit Set(const Fn::Deployment::Component& component);
    /// What serialize() has written. @throws FNEBadArg
    explicit Set(const Fn::Package& package);
    Set(const Set&);
    Set& operator=(const Set&);
    ~Set();

    static std::string typeId() { return "Kx::Feature::Set"; }
    static Fn::Deployment::Type define();

    /// @throws as the measures of the portrait do
    bool wearsGlasses() const;
    Gender gender() const;
    Ethnicity ethnicity() const;
    float age() const; ///< years

    /// Works out all. A list of wearsGlasses as one byte, gender and ethnicity as integers, and age.
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

private:
    friend class Test;
    class Implementation;
    explicit Set(const FNCountedPtr<const Implementation>& implementation);
    FNCountedPtr<const Implementation> implementation_;
};

/// Any number of threads may use one.
class Test {
public:
    explicit Test(const Fn::Deployment::Component& component);

    static std::string typeId() { return "Kx::Feature::Test"; }
    static Fn::Deployment::Type define();

    const Boundaries& boundaries() const { return boundaries_; }
    /// Costs nothing yet.
    Set assess(const Cmp::Portrait::Characteristics& portrait) const;

private:
    Boundaries boundaries_;
};

} // namespace Kx::Feature

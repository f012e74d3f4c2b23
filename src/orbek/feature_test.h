#pragma once

#include "orbek/portrait.h"

namespace Orbek::Portrait::Feature {

enum class Gender { Male = 0, Female = 1 };
enum class Ethnicity { White = 0, Black = 1, Asian = 2 };

/// Plain statements about the person of a portrait. Each is worked out when it is first asked for, and throws
/// what the measure behind it throws. One set and its copies belong to one thread at a time.
class [[gnu::visibility("default")]] Set {
public:
    Set(const Set&);
    Set& operator=(const Set&);
    ~Set();

    bool wearsGlasses() const;
    Gender gender() const;
    Ethnicity ethnicity() const;
    float age() const; ///< years

    class [[gnu::visibility("hidden")]] Implementation;

private:
    friend class Implementation;
    explicit Set(const CountedPtr<Implementation>& implementation);
    CountedPtr<Implementation> implementation_;
};

/// Makes them with the thresholds below ORBEK.FeatureTest.
///
///     const auto features = Orbek::Portrait::Feature::Test(configuration).assess(portrait);
///     if (features.wearsGlasses()) ...
class [[gnu::visibility("default")]] Test {
public:
    explicit Test(const Configuration& configuration);
    Test(const Test&);
    Test& operator=(const Test&);
    ~Test();

    Set assess(const Characteristics& portrait) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Portrait::Feature

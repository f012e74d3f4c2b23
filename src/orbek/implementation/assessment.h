#pragma once

#include "orbek/feature_test.h"
#include "orbek/full_frontal_test.h"
#include "orbek/implementation/configuration_implementation.h"

/// What the public classes of portraits hold.

namespace Orbek {

/// An engine of a configuration.
template <class Engine> class EngineOf {
public:
    /// @param request of the engine. @throws FNEGeneric if it cannot be made
    EngineOf(const Configuration& configuration, Engine (Resources::*request)() const)
        : engine_((Configuration::Implementation::implementation(configuration)->resources().*request)()),
          configuration_(configuration) {}

    const Engine& engine() const { return engine_; }
    const Configuration& configuration() const { return configuration_; }

private:
    Engine engine_;
    Configuration configuration_; ///< keeps what the engine uses
};

class Portrait::Characteristics::Implementation {
public:
    static Characteristics make(const Cmp::Portrait::Characteristics& portrait, unsigned int numberOfFaces) {
        return Characteristics(CountedPtr<Implementation>(new Implementation{portrait, numberOfFaces}));
    }
    static const Implementation& of(const Characteristics& handle) { return *handle.implementation_; }

    Cmp::Portrait::Characteristics portrait;
    unsigned int numberOfFaces;
};

} // namespace Orbek

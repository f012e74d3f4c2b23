#pragma once

#include "orbek/fir.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/population.h"

/// What the public classes of comparison hold.

namespace Orbek {

/// A configuration whose comparison is used.
class Comparison {
public:
    explicit Comparison(const Configuration& configuration) : configuration_(configuration) {}

    Cmp::Strategy strategy() const {
        return Configuration::Implementation::implementation(configuration_)->resources().cmpStrategy();
    }

private:
    Configuration configuration_;
};

class FIR::Implementation {
public:
    explicit Implementation(const Cmp::FIR& record) : fir(record) {}

    static FIR make(const Cmp::FIR& record) {
        return FIR(CountedPtr<Implementation>(new Implementation(record)));
    }
    static const Cmp::FIR& of(const FIR& handle) { return handle.implementation_->fir; }

    const Cmp::FIR fir;
};

class Population::Implementation : public Comparison {
public:
    explicit Implementation(const Configuration& configuration)
        : Comparison(configuration), population(strategy().algorithm()->createPopulation(0)) {}

    static const Cmp::Population& of(const Population& handle) { return handle.implementation_->population; }

    Cmp::Population population;
};

} // namespace Orbek

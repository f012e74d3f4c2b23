#pragma once

#include "orbek/fir.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/population.h"
#include "orbek/score.h"

#include <cmath>

/// What the public classes of comparison hold.

namespace Orbek {

/// A number that a caller has given. Numbers beyond a range have a meaning, what is no number has none: as a
/// threshold it would be below every score.
/// @throws FNEBadArg naming the argument
inline float demandNumber(float value, const char* argument) {
    if (std::isnan(value)) FN_THROW(FNEBadArg, std::string(argument) + " is not a number");
    return value;
}

/// What a caller has given as the threshold of scores. @throws FNEBadArg for what is no number
inline Cmp::Score thresholdOf(const Score& score) {
    return Cmp::Score(demandNumber(score, "The threshold"));
}

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

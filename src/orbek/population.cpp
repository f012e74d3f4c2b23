#include "orbek/population.h"

#include "orbek/implementation/comparison.h"

namespace Orbek {

Population::Population(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
Population::Population(const Population&) = default;
Population& Population::operator=(const Population&) = default;
Population::~Population() = default;

void Population::append(const FIR& fir, const std::string& id) {
    implementation_->population.add(FIR::Implementation::of(fir), id);
}

void Population::remove(const std::string& id) {
    implementation_->population.remove(id);
}

FIR Population::get(const std::string& id) const {
    return FIR::Implementation::make(implementation_->population.get(id));
}

} // namespace Orbek

#include "orbek/population.h"

#include "fn/whole_file.h"
#include "orbek/implementation/comparison.h"
#include "orbek/implementation/population_file.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <limits>

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

std::size_t Population::size() const {
    return implementation_->population.size();
}

std::vector<std::string> Population::ids() const {
    std::vector<std::string> ids;
    implementation_->population.visit([&](const std::string& id, const Cmp::FIR&) { ids.push_back(id); });
    return ids;
}

void Population::save(std::ostream& stream) const {
    if (size() > std::numeric_limits<std::uint32_t>::max())
        FN_THROW(FNEBadArg, "Population: too many records for one file");
    writePopulationHead(stream, static_cast<std::uint32_t>(size()));
    implementation_->population.visit([&](const std::string& id, const Cmp::FIR& fir) {
        writePopulationRecord(stream, id, fir.body()->serialize());
    });
}

void Population::save(const std::string& fileName) const {
    Fn::writeWholeFile(fileName, [&](std::ostream& stream) { save(stream); });
}

Population Population::load(const Configuration& configuration, std::istream& stream) {
    const Population population(configuration);
    Cmp::Population& records = population.implementation_->population;
    const Cmp::RecordBuilder builder =
        population.implementation_->strategy().algorithm()->createRecordBuilder();
    readPopulation(stream, [&](const std::string& id, const Fn::Package& record) {
        records.add(builder->create(record), id);
    });
    return population;
}

Population Population::load(const Configuration& configuration, const std::string& fileName) {
    std::ifstream file(fileName, std::ios::binary);
    if (!file) FN_THROW(FNEIOError, fileName + ": cannot be opened: " + std::strerror(errno));
    try {
        const Population population = load(configuration, file);
        if (file.peek() != std::ifstream::traits_type::eof())
            FN_THROW(FNEBadFormat, "Population: the file does not end behind its last record");
        return population;
    } catch (const std::exception& e) {
        FN_THROW(FNEIOError, fileName + ": " + e.what());
    }
}

} // namespace Orbek

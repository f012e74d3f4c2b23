// Stored populations: what is accepted is the same after it was written again.

#include "fn/exception.h"
#include "orbek/implementation/population_file.h"

#include <cstdlib>
#include <sstream>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    std::istringstream stream(bytes);
    std::vector<std::pair<std::string, Fn::Package>> records;
    try {
        Orbek::readPopulation(stream, [&](const std::string& id, const Fn::Package& record) {
            records.emplace_back(id, record);
        });
    } catch (const FNException&) {
        return 0;
    }
    std::ostringstream again;
    Orbek::writePopulationHead(again, static_cast<std::uint32_t>(records.size()));
    for (const auto& [id, record] : records) Orbek::writePopulationRecord(again, id, record);
    std::istringstream second(again.str());
    std::size_t at = 0;
    Orbek::readPopulation(second, [&](const std::string& id, const Fn::Package& record) {
        if (id != records.at(at).first || !(record == records.at(at).second)) std::abort();
        ++at;
    });
    if (at != records.size()) std::abort();
    return 0;
}

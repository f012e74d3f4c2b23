#include "orbek/implementation/population_file.h"

#include "fn/serialize.h"

namespace Orbek {
namespace {

constexpr const char* label = "Orbek::Population";
constexpr unsigned int version = 1;

using List = std::list<Fn::Package>;

/// The elements of the next package. @param what is missing otherwise, for the message
List nextList(std::istream& stream, std::size_t size, const std::string& what) {
    List list;
    try {
        list = Fn::Package(stream);
    } catch (const FNException& e) {
        FN_THROW(FNEBadFormat, "Population: no " + what + ": " + e.what());
    }
    if (list.size() != size) FN_THROW(FNEBadFormat, "Population: no " + what);
    return list;
}

} // namespace

void writePopulationHead(std::ostream& stream, std::uint32_t records) {
    Fn::Package(List{Fn::serialize<std::string>(label), Fn::Package(version), Fn::Package(records)})
        .write(stream);
}

void writePopulationRecord(std::ostream& stream, const std::string& id, const Fn::Package& record) {
    if (id.find('\0') != std::string::npos)
        FN_THROW(FNEBadArg, "Population: the id " + id + " has a NUL in it");
    Fn::Package(List{Fn::serialize<std::string>(id), record}).write(stream);
}

void readPopulation(std::istream& stream,
                    const std::function<void(const std::string& id, const Fn::Package& record)>& take) {
    const List head = nextList(stream, 3, "beginning of a population");
    if (Fn::deSerialize<std::string>(head.front()) != label)
        FN_THROW(FNEBadFormat, "Population: no beginning of a population");
    if (const unsigned int found = std::next(head.begin())->toUInt32(); found != version)
        FN_THROW(FNEBadFormat, "Population: of the unknown version " + std::to_string(found));
    const unsigned int records = head.back().toUInt32();
    for (unsigned int i = 0; i < records; ++i) {
        const List record =
            nextList(stream, 2, "record " + std::to_string(i) + " of " + std::to_string(records));
        take(Fn::deSerialize<std::string>(record.front()), record.back());
    }
}

} // namespace Orbek

#pragma once

#include "fn/package.h"

#include <cstdint>
#include <functional>
#include <iosfwd>
#include <string>

/// A stored population is a row of packages: first the list of the text "Orbek::Population", the version 1
/// and the number of records, both unsigned 32-bit integers; then for each record, in order of addition, the
/// list of its id, a text, and of its package.

namespace Orbek {

/// Writes the first package. @throws FNEIOError
void writePopulationHead(std::ostream& stream, std::uint32_t records);
/// Writes one record. @throws FNEIOError; FNEBadArg for an id that a text cannot hold
void writePopulationRecord(std::ostream& stream, const std::string& id, const Fn::Package& record);

/// Reads a stored population up to its end, and no further. In memory is one record at a time.
/// @throws FNEBadFormat for other bytes, or what the stream or `take` throws
void readPopulation(std::istream& stream,
                    const std::function<void(const std::string& id, const Fn::Package& record)>& take);

} // namespace Orbek

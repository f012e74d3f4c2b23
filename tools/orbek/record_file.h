#pragma once

#include "orbek/fir_builder.h"

#include <cstdint>
#include <string>

#include <nlohmann/json_fwd.hpp>

/// Files of records: the bytes of one.

namespace Orbek::Tool {

/// @throws UnreadableInput naming the file and what is wrong with it
FIR readRecord(const FIRBuilder& builder, const std::string& file);
/// Writes the whole file or, if that fails, none. @throws std::exception naming the file and the reason
void writeRecord(const FIR& record, const std::string& file);

std::uint32_t numberOfFeatures(const FIR& record);
/// File, version, number of features and bytes.
nlohmann::ordered_json describeRecord(const FIR& record, const std::string& file);

} // namespace Orbek::Tool

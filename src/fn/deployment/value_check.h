#pragma once

#include "fn/deployment/type.h"

#include <string>

namespace Fn::Deployment {

/// What is wrong with a text as the value of a type: empty if nothing is, or else a clause behind the name of
/// the setting, as `"fast" is not of the type Float`. Stricter than the readers, which ignore what stands
/// behind a number, and take "-1" for a large unsigned one.
/// @param text without variables
std::string faultOfValue(const Type& type, const std::string& text);

} // namespace Fn::Deployment

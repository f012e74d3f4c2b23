#pragma once

#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "orbek/configuration.h"

namespace Orbek {

/// What is wrong with the lines of a configuration text.
/// @param roots of the trees that they are for
std::vector<Configuration::Fault> configurationFaults(const std::vector<AppConfigDB::Line>& lines,
                                                      const std::list<Fn::Deployment::Component>& roots);

/// A text with the values of the variables of a tree, as it is read.
std::string withVariables(const std::string& text, const Fn::Deployment::Component& root);

} // namespace Orbek

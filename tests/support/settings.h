#pragma once

#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"

#include <sstream>

/// A component of the type of `T`, named "X", on a configuration text.
template <class T> Fn::Deployment::Component settingsOf(const std::string& text = "") {
    std::istringstream stream(text);
    const Fn::Deployment::Type& type = Fn::Deployment::type<T>();
    return Fn::Deployment::Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(stream)),
                                     Fn::Deployment::Property(type, "X", type.defaultValue(), "", false));
}

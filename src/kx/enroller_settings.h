#pragma once

#include "fn/deployment/component.h"

/// The setting that all enrollers have.
namespace Kx::Implementation {

/// @param doc what it means for the enroller
Fn::Deployment::Property minNumOfSamples(const std::string& doc);
/// For an enroller that looks for faces and eyes.
Fn::Deployment::Property minNumOfSamplesOfSearch();
/// Its value.
unsigned int minNumOfSamples(const Fn::Deployment::Component& enroller);

} // namespace Kx::Implementation

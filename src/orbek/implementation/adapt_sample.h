#pragma once

#include "kx/sensor_sample.h"
#include "orbek/implementation/adapt.h"
#include "orbek/sample.h"

namespace Orbek {

/// Item by item, those that are set. @throws Sample::ItemNotSet for a first eye in space without the second;
/// FNEBadArg for a null handle
Kx::SensorSample adapt(const Sample& sample);
/// The same back; the image has an empty name.
/// @throws FNEBadFunCall for a left, or a first, eye without the other one
Sample adapt(const Kx::SensorSample& sample);
/// All of a range in their order. @param visit called with each image just before its conversion
std::list<Kx::SensorSample> adapt(std::list<Sample>::const_iterator first,
                                  std::list<Sample>::const_iterator last, const Fn::Functor1<Image>& visit);

} // namespace Orbek

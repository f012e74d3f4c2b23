#pragma once

#include "fg/dll_frame_grabber_factory.h"

namespace Orbek {

/// Whether a shared library is a camera in C, see orbek/camera_plugin.h.
bool isPluginCamera(const Fn::Dll& library);

/// Opens the camera of such a library, in both of its roles. The library stays loaded as long as one of them.
/// @param name of the device
/// @throws FNESysError naming the device, with the plug-in's reason
FG::GrabberPair openPluginCamera(const Fn::Dll& library, const std::string& name);

} // namespace Orbek

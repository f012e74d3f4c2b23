#include "orbek/capture_device.h"

#include "fg/frame_grabber_factory.h"
#include "fn/deployment/composite_values.h"
#include "orbek/implementation/capture_device_impl.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/implementation/plugin_camera.h"
#include "orbek/implementation/video_format_body.h"

namespace Orbek {

using Fn::Deployment::Component;

namespace {

/// Kinds that are not part of the library may live in a plug-in.
/// @param reason tells afterwards why there is no source, if that is known
FG::GrabberPair makeGrabber(const Component& device, const std::string& name,
                            FG::DllFrameGrabberFactoryCache& plugins, std::string& reason) {
    const FG::GrabberPair made =
        FG::FrameGrabberFactory<FG::FrameGrabberFullSet>::create2(device, name, plugins, &reason);
    const std::string kind = device.read(true), library = plugins.path(kind);
    if (made.first || made.second || library.empty()) return made;
    if (const Fn::Dll dll(library); isPluginCamera(dll)) return openPluginCamera(dll, name);
    return plugins.get(kind).createBoth(device.subComponent(kind), name);
}

} // namespace

CaptureDeviceBody::CaptureDeviceBody() = default;
CaptureDeviceBody::~CaptureDeviceBody() = default;

Image CaptureDeviceBody::release() {
    return capture();
}

unsigned int CaptureDeviceBody::gain() {
    return 0;
}

unsigned int CaptureDeviceBody::exposure() {
    return 0;
}

void CaptureDeviceBody::control(const Image&, const std::list<Face::Location>&) {}

int CaptureDeviceBody::configure() {
    return 0;
}

int CaptureDeviceBody::videoFormatDialog() {
    return 0;
}

VideoFormat CaptureDeviceBody::getVideoFormat() {
    return VideoFormat(CountedPtr<VideoFormat::Body>(new VideoFormat::Body(Fn::Package())));
}

void CaptureDeviceBody::setVideoFormat(const VideoFormat&) {}

CaptureDevice createCaptureDevice(const Configuration& configuration, const std::string& name) {
    const auto implementation = Configuration::Implementation::implementation(configuration);
    const Component root = implementation->resources().rootComponent();
    const Component device = root.subComponent("CaptureDevices").subComponent(name);
    const auto plugins = implementation->resources().dllFrameGrabberFactoryCache();
    std::string reason;
    const FG::GrabberPair grabber = makeGrabber(device, name, *plugins, reason);
    const bool controlled = listsElement(root.subComponent("CameraControllers"), name);
    return CaptureDevice(new CaptureDeviceImpl(device.name(), grabber, reason, controlled));
}

} // namespace Orbek

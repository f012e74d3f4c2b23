#include "test_camera.h"

FG_PLUGIN_EXPORT CameraHandle createFG(Fn::Deployment::Component, std::string name) {
    return CameraHandle(new TestCamera(name));
}

FG_PLUGIN_EXPORT FG::GrabberPair createFG2(Fn::Deployment::Component, std::string name) {
    const CameraHandle camera(new TestCamera(name));
    return {camera, FNCountedPtr<FG::StillImageSource>(new FG::StillImageSourceEmulator(camera))};
}

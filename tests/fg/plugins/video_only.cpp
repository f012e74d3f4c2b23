#include "test_camera.h"

FG_PLUGIN_EXPORT CameraHandle createFG(Fn::Deployment::Component, std::string name) {
    if (name.empty()) FN_THROW(FNEBadArg, "a camera without a name");
    return CameraHandle(new TestCamera(name));
}

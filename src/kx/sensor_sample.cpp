#include "kx/sensor_sample.h"

namespace Kx {

namespace {

FNCountedPtr<FN3Vector<double>> handle(const FN3Vector<double>& position) {
    return FNCountedPtr<FN3Vector<double>>(new FN3Vector<double>(position));
}

} // namespace

Cmp::Sample SensorSample::cmpSample() const {
    if (!hasEyes()) FN_THROW(FNEBadFunCall, "Cannot form Cmp Sample without annotations");
    Cmp::Sample sample(image, leftEye->pos, rightEye->pos);
    if (pointSet)
        sample.pointSet = pointSet;
    else if (vertexImage)
        sample.vertexImage = vertexImage;
    if (firstEye3D.isSet() && secondEye3D.isSet()) {
        sample.shapeLeftEye = handle(*firstEye3D);
        sample.shapeRightEye = handle(*secondEye3D);
    }
    return sample;
}

Cmp::Face SensorSample::face() const {
    return Cmp::Face(image, *leftEye, *rightEye);
}

} // namespace Kx

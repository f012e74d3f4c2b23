#include "kx/sensor_sample.h"

namespace Kx {

namespace {

FNCountedPtr<FN3Vector<double>> handle(const FN3Vector<double>& position) {
    return FNCountedPtr<FN3Vector<double>>(new FN3Vector<double>(position));
}

/// Whether some of a face lies in its picture.
bool seen(const FNImageReference& image, FNPos leftEye, FNPos rightEye) {
    const auto w = static_cast<float>(image.w()), h = static_cast<float>(image.h());
    const auto inside = [&](FNPos p) { return p.x >= 0 && p.x <= w && p.y >= 0 && p.y <= h; };
    return inside((leftEye + rightEye) / 2) && (inside(leftEye) || inside(rightEye));
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

int Implementation::pushSample(const Cmp::RecordBuilder& builder, const Cmp::Sample& sample) {
    if (sample.intensityImage && sample.leftEye && sample.rightEye &&
        !seen(*sample.intensityImage, *sample.leftEye, *sample.rightEye))
        return -1;
    return builder->pushSample(sample);
}

} // namespace Kx

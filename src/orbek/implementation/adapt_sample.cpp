#include "orbek/implementation/adapt_sample.h"

#include "orbek/implementation/adapt_shape.h"

namespace Orbek {

namespace {

FN3Vector<double> adaptPoint(const Vertex& v) {
    return {v.x, v.y, v.z};
}

Vertex adaptPoint(const FN3Vector<double>& v) {
    return {v.x, v.y, v.z};
}

} // namespace

Kx::SensorSample adapt(const Sample& sample) {
    Kx::SensorSample result(adapt(sample.image));
    if (sample.eyes.isSet()) {
        result.leftEye = leftEye(sample.eyes.value());
        result.rightEye = rightEye(sample.eyes.value());
    }
    if (sample.vertexImage.isSet())
        result.vertexImage =
            FNCountedPtr<Fn::VertexImage>(new Fn::VertexImage(adapt(sample.vertexImage.value())));
    if (sample.pointSet.isSet())
        result.pointSet = FNCountedPtr<::ShapeImage::TexturedPointSet>(
            new ::ShapeImage::TexturedPointSet(adapt(sample.pointSet.value())));
    if (sample.firstEye3D.isSet()) {
        result.firstEye3D = adaptPoint(sample.firstEye3D.value());
        result.secondEye3D = adaptPoint(sample.secondEye3D.value());
    }
    return result;
}

Sample adapt(const Kx::SensorSample& sample) {
    Sample result(adapt(sample.image, ""));
    if (sample.leftEye.isSet()) result.eyes.set(adapt(*sample.leftEye, *sample.rightEye));
    if (sample.vertexImage) result.vertexImage.set(adapt(*sample.vertexImage));
    if (sample.pointSet) result.pointSet.set(adapt(*sample.pointSet));
    if (sample.firstEye3D.isSet()) {
        result.firstEye3D.set(adaptPoint(*sample.firstEye3D));
        result.secondEye3D.set(adaptPoint(*sample.secondEye3D));
    }
    return result;
}

std::list<Kx::SensorSample> adapt(std::list<Sample>::const_iterator first,
                                  std::list<Sample>::const_iterator last, const Fn::Functor1<Image>& visit) {
    std::list<Kx::SensorSample> samples;
    for (; first != last; ++first) {
        visit(first->image);
        samples.push_back(adapt(*first));
    }
    return samples;
}

} // namespace Orbek

#include "orbek/sample.h"

#include "orbek/implementation/adapt_shape.h"
#include "shapeimg/scanfile/scan_file.h"

namespace Orbek {

Sample::ItemNotSet::ItemNotSet(const std::string& name)
    : text_(new std::string("Attempt to retrieve Sample item " + name + " which is not set")) {}
Sample::ItemNotSet::ItemNotSet(const ItemNotSet&) = default;
Sample::ItemNotSet::~ItemNotSet() = default;

const char* Sample::ItemNotSet::what() const noexcept {
    return text_->c_str();
}

Sample::Sample(const Image& sampleImage) : image(sampleImage) {}
Sample::Sample(const Image& sampleImage, const ShapeImage& shape) : image(sampleImage) {
    vertexImage.set(shape);
}
Sample::Sample(const Image& sampleImage, const PointSet& points) : image(sampleImage) {
    pointSet.set(points);
}
Sample::Sample(const std::pair<Image, Eyes::Location>& imageWithEyes) : image(imageWithEyes.first) {
    eyes.set(imageWithEyes.second);
}
Sample::Sample(const Sample&) = default;
Sample& Sample::operator=(const Sample&) = default;
Sample::~Sample() = default;

Sample loadShapeSample(const std::string& fileName) {
    const ::ShapeImage::TexturedPointSet scan = ::ShapeImage::readTexturedPointSet(fileName);
    return Sample(adapt(scan.texture(), ""), adapt(scan));
}

} // namespace Orbek

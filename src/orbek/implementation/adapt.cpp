#include "orbek/implementation/adapt.h"

#include "orbek/implementation/image_adapter.h"
#include "orbek/implementation/image_fn.h"

namespace Orbek {
namespace {

class ImageReadPropertiesFeedback final : public Fn::ReadImagePropertiesFeedback::Body {
public:
    explicit ImageReadPropertiesFeedback(const ImageIO::PropertiesFeedback& feedback) : feedback_(feedback) {}

    void compressionMode(const Fn::FNImageDataCompressionMode& mode) override {
        constexpr auto last = static_cast<int>(ImageIO::ColorMode::Separated);
        const auto value = static_cast<int>(mode);
        feedback_->compressionMode(value < 0 || value > last ? ImageIO::ColorMode::Unknown
                                                             : static_cast<ImageIO::ColorMode>(value));
    }
    void pixelDepth(unsigned int bits) override { feedback_->pixelDepth(bits); }

private:
    ImageIO::PropertiesFeedback feedback_;
};

static_assert(static_cast<int>(ImageIO::ColorMode::Separated) ==
                  static_cast<int>(Fn::FNImageDataCompressionMode::Separated) &&
              static_cast<int>(ImageIO::ColorMode::Y800) ==
                  static_cast<int>(Fn::FNImageDataCompressionMode::Y800));

} // namespace

Face::Location adapt(const ::FaceFinder::Location& location) {
    return {adapt(location.pos), location.width, location.confidence, location.rotationAngle};
}

::FaceFinder::Location adapt(const Face::Location& location) {
    return {adapt(location.pos), location.width, location.confidence, location.rotationAngle};
}

FacialFeatureLocation leftEye(const Eyes::Location& eyes) {
    return {adapt(eyes.first), 0, eyes.firstConfidence};
}

FacialFeatureLocation rightEye(const Eyes::Location& eyes) {
    return {adapt(eyes.second), 0, eyes.secondConfidence};
}

Eyes::Location adapt(const FacialFeatureLocation& left, const FacialFeatureLocation& right) {
    return {adapt(left.pos), adapt(right.pos), left.confidence, right.confidence};
}

Image adapt(const FNImageReference& image, const std::string& name) {
    return Image(new ImageFN(image, name));
}

FNImageReference adapt(const Image& image) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(new ImageAdapter(image)));
}

std::pair<Image, Eyes::Location> adapt(const Cmp::Face& face) {
    const FacialFeatureLocation left = face.leftEyeLocation(); // the first to be missed, if both are
    return {adapt(face.image(), ""), adapt(left, face.rightEyeLocation())};
}

Cmp::Face adapt(const std::pair<Image, Eyes::Location>& imageWithEyes) {
    const auto& [image, eyes] = imageWithEyes;
    return Cmp::Face(adapt(image), leftEye(eyes), rightEye(eyes));
}

Fn::ReadImagePropertiesFeedback adapt(const ImageIO::PropertiesFeedback& feedback) {
    if (!feedback) return {};
    return Fn::ReadImagePropertiesFeedback(
        FNCountedPtr<Fn::ReadImagePropertiesFeedback::Body>(new ImageReadPropertiesFeedback(feedback)));
}

} // namespace Orbek

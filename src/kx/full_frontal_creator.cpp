#include "kx/full_frontal_creator.h"

#include "fn/deployment/composite_values.h"
#include "fn/image_conversion.h"
#include "img/affine/transform.h"

namespace Kx::FullFrontal {

using namespace Fn::Deployment;

namespace {

struct Scaling {
    static std::string typeId() { return "Fullfrontal::Scaling"; }
    static Type define() {
        return Type(typeId(), "Target width of image to be tranformed",
                    properties(propertyWithDefault<Int>::create(
                        "TargetWidth", 460,
                        "Width of target image. Height is calculated according to the width to length "
                        "ration. Default: 460 pixel")),
                    "", false);
    }
};

struct WidthStrategy {
    static std::string typeId() { return "Kx::FullfrontalCrop::WidthStrategy"; }
    static Type define() {
        return Type(
            typeId(), "Select a method for how to compute the portrait width.",
            properties(
                Property(type<Float>(), "AspectRatio", "1.285714",
                         "Enforce the aspect ratio of the portrait. The aspect ratio describes the height to "
                         "width ratio of the portrait. The recommended range is 1.25 to 1.34. See ISO "
                         "19794-5 appendix. (defaults to 1.286 (45/35)",
                         false),
                propertyWithDefault<Float>::create(
                    "HeadWidthToImageWidthRatio", 0.7f,
                    "Use the ratio of head width to image width. (default: 0.7)")),
            "", false);
    }
};

template <class T> typename T::ValueType setting(const Component& component, const char* key) {
    return Value<T>::get(component.subComponent(key));
}

std::optional<int> targetWidth(const Component& scaling) {
    if (Value<Option<Scaling>>::get(scaling) != "Enabled") return {};
    return pictureSide(static_cast<float>(setting<Int>(scaling.subComponent("Enabled"), "TargetWidth")));
}

float headTilt(FNPos left, FNPos right) {
    const FNPos eyeLine = right - left;
    return std::atan(eyeLine.y / eyeLine.x);
}

/// The colour in the pixels of an image, with gray values as the sum of the plain weights gives them.
template <class T> T paddingValue(const Fn::Bgra32& color) {
    const auto weighted = [&](const auto& weights) {
        return weights[0] * color.r + weights[1] * color.g + weights[2] * color.b;
    };
    constexpr auto weights = Fn::ColorConversions<unsigned int, 256>::luminanceRGB;
    if constexpr (std::is_same_v<T, unsigned char>)
        return static_cast<unsigned char>(weighted(weights) >> 8);
    else if constexpr (std::is_same_v<T, unsigned short>)
        return static_cast<unsigned short>(weighted(weights));
    else if constexpr (std::is_same_v<T, float>)
        return weighted(Fn::ColorConversions<float, 256>::luminanceRGBdiv);
    else
        return color;
}

/// A face on a picture that was cut out of its image, with all that is known of it.
Cmp::Face transferred(const Cmp::Face& face, const FNImageReference& picture,
                      const Img::Affine::Mapping& toPicture) {
    const float scale = std::sqrt(std::fabs(toPicture.m0 * toPicture.m3 - toPicture.m1 * toPicture.m2));
    const auto feature = [&](const FacialFeatureLocation& location) {
        return Cmp::Face::FeatureLocation(
            new FacialFeatureLocation{toPicture(location.pos), location.size * scale, location.confidence});
    };
    Cmp::Face::FaceLocation location;
    Cmp::Face::FeatureLocation leftEye, rightEye, nasion, mouth;
    if (face.hasFaceFinderInfo()) {
        location = Cmp::Face::FaceLocation(new FaceFinder::Location(face.faceFinderLocation()));
        Cmp::eyesToFacePos(toPicture(face.ffLeftEye()), toPicture(face.ffRightEye()), location->pos,
                           location->rotationAngle, location->width);
    }
    if (face.hasEyeFinderLeftEyeInfo()) leftEye = feature(face.leftEyeLocation());
    if (face.hasEyeFinderRightEyeInfo()) rightEye = feature(face.rightEyeLocation());
    if (face.hasNasionInfo()) nasion = feature(face.nasionLocation());
    if (face.hasMouthInfo()) mouth = feature(face.mouthLocation());
    return Cmp::Face(picture, location, leftEye, rightEye, nasion, mouth);
}

} // namespace

Type Creator::define() {
    std::list<Property> all = properties(
        property<Option<Scaling>>::create("Scaling",
                                          "Whether to scale or not and to which target width. Height is "
                                          "determined by the ration of width to height configuration"),
        propertyWithDefault<Float>::create("HeadLengthToImageLengthRatio", 0.75f,
                                           "Target ratio of head length to image height. (default: 0.75)"),
        property<Alternative<WidthStrategy>>::create("ImageWidthStrategy",
                                                     "The strategy to compute the width of the portrait."),
        propertyWithDefault<Float>::create("HeadToImagePositionRatio", 0.55f,
                                           "Target position of the face center relativ to image height."),
        propertyWithDefault<Bool>::create(
            "EnableISOTestForGeometricParameter", true,
            "HeadToLengthRatio and HeadToImagePositionration will be testet on ISO conformance if this value "
            "is set to true. false means the test is omitted and both can be set to any value. (default: "
            "true)"),
        propertyWithDefault<Bool>::create("AllowRotation", true,
                                          "Allow Rotation to adjust eyes to a horizontal line."));
    all.splice(all.end(), Padding::properties());
    all.push_back(property<FaceGeometry>::create("FaceGeometry",
                                                 "Face geometry is derived from eyes positions. All factors "
                                                 "are taken from some heuristics."));
    return Type(typeId(), "Crop face region in order to get a full frontal image according to ISO-19794-5",
                all, "", false);
}

Creator::Creator(const Component& component)
    : targetWidth_(targetWidth(component.subComponent("Scaling"))),
      lengthRatio_(setting<Float>(component, "HeadLengthToImageLengthRatio")),
      position_(setting<Float>(component, "HeadToImagePositionRatio")),
      testSettings_(setting<Bool>(component, "EnableISOTestForGeometricParameter")),
      allowRotation_(setting<Bool>(component, "AllowRotation")), padding_(component),
      geometry_(component.subComponent("FaceGeometry")) {
    const Component strategy = component.subComponent("ImageWidthStrategy");
    const std::string choice = Value<Alternative<WidthStrategy>>::get(strategy);
    width_ = choice == "AspectRatio" ? Width::AspectRatio : Width::HeadWidth;
    widthRatio_ = setting<Float>(strategy, choice.c_str());
}

Cmp::Face Creator::extract(const Cmp::Face& face) const {
    return extract(face, lengthRatio_, position_);
}
Cmp::Face Creator::extract(const Cmp::Face& face, float lengthRatio, float position) const {
    return extract(face, lengthRatio, position, {}, {}, {}, {});
}
Cmp::Face Creator::extract(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar,
                           FNPos rightEar) const {
    return extract(face, lengthRatio_, position_, chin, crown, leftEar, rightEar);
}
Cmp::Face Creator::extract(const Cmp::Face& face, float lengthRatio, float position, FNPos chin, FNPos crown,
                           FNPos leftEar, FNPos rightEar) const {
    testSettings(lengthRatio, position);
    const FaceGeometry::Points points = pointsOf(face, chin, crown, leftEar, rightEar);
    switch (face.image().native()) {
    case FNImageReference::MONO8:
        return extracted<unsigned char>(face, lengthRatio, position, points);
    case FNImageReference::MONO16:
        return extracted<unsigned short>(face, lengthRatio, position, points);
    case FNImageReference::MONO_FLOAT:
        return extracted<float>(face, lengthRatio, position, points);
    default:
        return extracted<Fn::Bgra32>(face, lengthRatio, position, points);
    }
}

Creator::Corners Creator::getCropRect(const Cmp::Face& face) const {
    return getCropRect(face, lengthRatio_, position_);
}
Creator::Corners Creator::getCropRect(const Cmp::Face& face, float lengthRatio, float position) const {
    return getCropRect(face, lengthRatio, position, {}, {}, {}, {});
}
Creator::Corners Creator::getCropRect(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar,
                                      FNPos rightEar) const {
    return getCropRect(face, lengthRatio_, position_, chin, crown, leftEar, rightEar);
}
Creator::Corners Creator::getCropRect(const Cmp::Face& face, float lengthRatio, float position, FNPos chin,
                                      FNPos crown, FNPos leftEar, FNPos rightEar) const {
    testSettings(lengthRatio, position);
    const FaceGeometry::Points points = pointsOf(face, chin, crown, leftEar, rightEar);
    TransformDimensions box;
    cuttingBox(points.leftEye, points.rightEye, lengthRatio, position, points.chin, points.crown,
               points.leftEar, points.rightEar, box);
    return {box.origin, box.origin + box.u, box.origin + box.u + box.v, box.origin + box.v};
}

void Creator::testSettings(float lengthRatio, float position) const {
    if (!testSettings_) return;
    if (position > 0.7f)
        FN_THROW(FNEBadArg, "Configured target position of face is out of full frontal image specification");
    if (lengthRatio > 0.8f)
        FN_THROW(FNEBadArg, "Configured ratio of face length to image height is out of full frontal image "
                            "specification");
}

/// The places that decide, all set.
FaceGeometry::Points Creator::pointsOf(const Cmp::Face& face, FNPos chin, FNPos crown, FNPos leftEar,
                                       FNPos rightEar) const {
    const FNPos left = face.leftEye(), right = face.rightEye();
    if (left == right) FN_THROW(FNEBadArg, "Failed to extract full frontal image without valid annotation.");
    return geometry_.completed({left, right, chin, crown, leftEar, rightEar});
}

void Creator::cuttingBox(FNPos left, FNPos right, float lengthRatio, float position, FNPos chin, FNPos crown,
                         FNPos leftEar, FNPos rightEar, TransformDimensions& box) const {
    constexpr float fiveDegrees = 0.08726646259971647f;
    checkPlaces({left, right, chin, crown, leftEar, rightEar});
    if (!allowRotation_ && std::fabs(headTilt(left, right)) > fiveDegrees)
        FN_THROW(FNEBadArg, "Face does not fit to rotation limits.");
    box.height = pictureSide(length(chin - crown) / lengthRatio);
    box.width = pictureSide(width_ == Width::AspectRatio ? static_cast<float>(box.height) / widthRatio_
                                                         : length(rightEar - leftEar) / widthRatio_);
    const FNPos eyeAxis = allowRotation_ ? (right - left) / length(right - left) : FNPos(1, 0);
    box.u = boxSide(eyeAxis, box.width);
    box.v = boxSide({-eyeAxis.y, eyeAxis.x}, box.height);
    box.origin = (left + right) / 2.0f - 0.5f * box.u - (1 - position) * box.v;
}

template <class T>
FNImage<T> Creator::crop(const FNImage<T>& image, FNPos& left, FNPos& right, float lengthRatio,
                         float position, FNPos chin, FNPos crown, FNPos leftEar, FNPos rightEar,
                         Img::Affine::Mapping& toPicture) const {
    TransformDimensions box;
    cuttingBox(left, right, lengthRatio, position, chin, crown, leftEar, rightEar, box);
    checkPaddingRatio(box, image.box(), padding_.ratio);
    if (targetWidth_) {
        const auto height = std::int64_t{*targetWidth_} * box.height / box.width;
        box.height = pictureSide(static_cast<float>(height));
        box.width = *targetWidth_;
    }
    FNImage<T> picture = box.picture<T>();
    toPicture = Img::Affine::transform(image, picture, box.origin, box.u, box.v, true,
                                       paddingValue<T>(padding_.color))
                    .inverse();
    left = toPicture(left);
    right = toPicture(right);
    return picture;
}

template <class T>
Cmp::Face Creator::extracted(const Cmp::Face& face, float lengthRatio, float position,
                             const FaceGeometry::Points& points) const {
    FNPos left = points.leftEye, right = points.rightEye;
    Img::Affine::Mapping toPicture;
    const FNImage<T> picture = crop(face.image().to<T>(), left, right, lengthRatio, position, points.chin,
                                    points.crown, points.leftEar, points.rightEar, toPicture);
    return transferred(face, FNImageReferenceFactory::create(picture), toPicture);
}

template FNImage<unsigned char> Creator::crop(const FNImage<unsigned char>&, FNPos&, FNPos&, float, float,
                                              FNPos, FNPos, FNPos, FNPos, Img::Affine::Mapping&) const;
template FNImage<unsigned short> Creator::crop(const FNImage<unsigned short>&, FNPos&, FNPos&, float, float,
                                               FNPos, FNPos, FNPos, FNPos, Img::Affine::Mapping&) const;
template FNImage<float> Creator::crop(const FNImage<float>&, FNPos&, FNPos&, float, float, FNPos, FNPos,
                                      FNPos, FNPos, Img::Affine::Mapping&) const;
template FNImage<Fn::Bgra32> Creator::crop(const FNImage<Fn::Bgra32>&, FNPos&, FNPos&, float, float, FNPos,
                                           FNPos, FNPos, FNPos, Img::Affine::Mapping&) const;

} // namespace Kx::FullFrontal

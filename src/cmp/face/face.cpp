#include "cmp/face/face.h"

#include "fn/serialize.h"
#include "img/affine/transform.h"
#include "img/affine/turns.h"

#include <stdexcept>

namespace Cmp {

namespace {

using PixelType = FNImageReference::PixelType;

template <class T> FNCountedPtr<T> counted(const T& value) {
    return FNCountedPtr<T>(new T(value));
}

/// Appends whether there is a location, and the location.
template <class T> void append(std::list<Fn::Package>& elements, const FNCountedPtr<T>& location) {
    elements.emplace_back(static_cast<bool>(location));
    if (location) elements.push_back(Fn::serialize<T>(*location));
}
template <class T> void take(Fn::PackageReader& reader, FNCountedPtr<T>& location) {
    if (reader.next<bool>()) location = counted(reader.next<T>());
}

template <class T> const T& stored(const FNCountedPtr<T>& location, const char* failure) {
    if (!location) FN_THROW(FNEBadFunCall, failure);
    return *location;
}

/// A picture that has been changed keeps the other's attributes, but for positions in it, and its strategy.
template <class T> FNImageReference successor(const FNImageReference& image, const FNImage<T>& pixels) {
    FNImageAttributes attributes = image.attributes();
    attributes.erase("EYEPOS");
    return FNImageReferenceFactory::create(pixels, attributes, image.getSerializationStrategy());
}

/// The result of `change`, called with the image in its own pixel type.
template <class Change> FNImageReference changed(const FNImageReference& image, Change change) {
    switch (image.native()) {
    case PixelType::MONO8:
        return successor(image, change(image.toMono8()));
    case PixelType::MONO16:
        return successor(image, change(image.toMono16()));
    case PixelType::MONO_FLOAT:
        return successor(image, change(image.toMonoFloat()));
    case PixelType::BGRA32:
        return successor(image, change(image.toBgra32()));
    case PixelType::RGB48:
        return successor(image, change(image.toRgb48()));
    }
    throw std::runtime_error("unsupported facial image representation format");
}

/// Pixels that Img::Affine::transform knows.
template <class T> FNImage<T> scaled(const FNImage<T>& image, std::uint32_t width, std::uint32_t height) {
    if constexpr (std::is_same_v<T, Fn::Rgb48>) {
        throw std::runtime_error("unsupported facial image representation format");
    } else {
        FNImage<T> result(width, height);
        if (!image.empty() && !result.empty()) Img::Affine::transform(image, result);
        return result;
    }
}

template <class T> FNImage<T> cropped(const FNImage<T>& image, const FNBox& box) {
    FNImage<T> result(box.width(), box.height());
    T* out = result.getExclusive();
    for (FNConstImIter<T> it(image, box); !it.atEnd(); it.nextRow())
        out = std::copy(it.restOfRow().begin(), it.restOfRow().end(), out);
    return result;
}

/// `inner` on black. Zeros in every channel, alpha too.
template <class T>
FNImage<T> framed(const FNImage<T>& inner, FNGridPos offset, std::uint32_t width, std::uint32_t height) {
    FNImage<T> result(width, height);
    result.fill(T{});
    for (std::uint32_t y = 0; y < inner.h(); ++y)
        std::copy_n(inner.row(y), inner.w(),
                    result.getExclusive() + (y + static_cast<std::uint64_t>(offset.y)) * width +
                        static_cast<std::uint64_t>(offset.x));
    return result;
}

/// One side of an image times `factor`.
std::uint32_t scaledSide(std::uint32_t side, float factor) {
    const float result = static_cast<float>(side) * factor;
    if (!(result >= 0 && result < 2147483648.0f)) FN_THROW(FNEBadArg, "Cannot scale an image by that factor");
    return static_cast<std::uint32_t>(result);
}

} // namespace

// ---- construction and packing

Face::Face(FNImageReference const& image, FacialFeatureLocation const& leftEye,
           FacialFeatureLocation const& rightEye)
    : image_(image), leftEye_(counted(leftEye)), rightEye_(counted(rightEye)) {}

Face::Face(FNImageReference const& image, FaceFinder::Location const& face)
    : image_(image), face_(counted(face)) {}

Face::Face(FNImageReference const& image, FaceLocation const& face, FeatureLocation const& leftEye,
           FeatureLocation const& rightEye, FeatureLocation const& nasion, FeatureLocation const& mouth)
    : image_(image), face_(face), leftEye_(leftEye), rightEye_(rightEye), nasion_(nasion), mouth_(mouth) {}

Face::Face(Fn::Package const& package) {
    Fn::PackageReader reader(package);
    image_ = reader.next<FNImageReference>();
    take(reader, face_);
    for (FeatureLocation* location : {&leftEye_, &rightEye_, &nasion_, &mouth_}) take(reader, *location);
    reader.expectEnd();
}

Fn::Package Face::serialize() const {
    std::list<Fn::Package> elements{image_.serialize()};
    append(elements, face_);
    for (const FeatureLocation* location : {&leftEye_, &rightEye_, &nasion_, &mouth_})
        append(elements, *location);
    return Fn::Package(elements);
}

// ---- locations

FaceFinder::Location const& Face::faceFinderLocation() const {
    return stored(face_, "There is no FaceFinder information for this face!");
}
FacialFeatureLocation const& Face::leftEyeLocation() const {
    return stored(leftEye_, "There is no left eye EyeFinder information for this face!");
}
FacialFeatureLocation const& Face::rightEyeLocation() const {
    return stored(rightEye_, "There is no right eye EyeFinder information for this face!");
}
FacialFeatureLocation const& Face::nasionLocation() const {
    return stored(nasion_, "There is no NasionFinder information for this face!");
}
FacialFeatureLocation const& Face::mouthLocation() const {
    return stored(mouth_, "There is no MouthFinder information for this face!");
}

FNPos Face::leftEye() const {
    return leftEye_ ? leftEye_->pos : ffLeftEye();
}
FNPos Face::rightEye() const {
    return rightEye_ ? rightEye_->pos : ffRightEye();
}
FNPos Face::mouth() const {
    if (mouth_) return mouth_->pos;
    return hasBothEyeLocations() ? efMouth() : ffMouth();
}
FNPos Face::nasion() const {
    return nasion_ ? nasion_->pos : facePosition();
}
FNPos Face::facePosition() const {
    return hasBothEyeLocations() ? efFacePosition() : faceFinderLocation().pos;
}
float Face::eyeDistance() const {
    return hasBothEyeLocations() ? efEyeDistance() : faceFinderLocation().width;
}
float Face::rollAngle() const {
    return hasBothEyeLocations() ? efRollAngle() : faceFinderLocation().rotationAngle;
}

FNPos Face::ffLeftEye() const {
    const auto& face = faceFinderLocation();
    return faceToLeftEyePos(face.pos, face.rotationAngle, face.width);
}
FNPos Face::ffRightEye() const {
    const auto& face = faceFinderLocation();
    return faceToRightEyePos(face.pos, face.rotationAngle, face.width);
}
FNPos Face::ffMouth() const {
    const auto& face = faceFinderLocation();
    return faceToMouthPos(face.pos, face.rotationAngle, face.width);
}

FNPos Face::efMouth() const {
    const FNPos left = leftEyeLocation().pos;
    return eyesToMouthPos(left, rightEyeLocation().pos);
}

namespace {

/// As the face finder would place a face with these eyes.
FaceFinder::Location placedByEyes(const Face& face) {
    const FNPos left = face.leftEyeLocation().pos; // first, for its failure
    FaceFinder::Location location;
    eyesToFacePos(left, face.rightEyeLocation().pos, location.pos, location.rotationAngle, location.width);
    return location;
}

} // namespace

FNPos Face::efFacePosition() const {
    return placedByEyes(*this).pos;
}
float Face::efEyeDistance() const {
    return placedByEyes(*this).width;
}
float Face::efRollAngle() const {
    return placedByEyes(*this).rotationAngle;
}

// ---- changes

/// Changes the locations that this face, and whoever shares them, has.
template <class Map> void Face::mapLocations(Map map, float sizeFactor) {
    if (face_) {
        face_->pos = map(face_->pos);
        face_->width *= sizeFactor;
    }
    for (const FeatureLocation* location : {&leftEye_, &rightEye_, &nasion_, &mouth_})
        if (*location) {
            (*location)->pos = map((*location)->pos);
            (*location)->size *= sizeFactor;
        }
}

/// A face with locations of its own.
template <class Map> Face Face::mapped(FNImageReference const& image, Map map) const {
    Face result(image);
    if (face_) result.face_ = counted(*face_);
    for (FeatureLocation Face::*location : {&Face::leftEye_, &Face::rightEye_, &Face::nasion_, &Face::mouth_})
        if (this->*location) result.*location = counted(*(this->*location));
    result.mapLocations(map, 1);
    return result;
}

void Face::scale(float factor) {
    const std::uint32_t width = scaledSide(image_.w(), factor), height = scaledSide(image_.h(), factor);
    if (width != image_.w() || height != image_.h())
        image_ = changed(image_, [&](const auto& pixels) { return scaled(pixels, width, height); });
    mapLocations([&](FNPos p) { return p * factor; }, factor);
}

void Face::reshape(int width, int height) {
    if (width <= 0 || height <= 0 || image_.w() == 0)
        FN_THROW(FNEBadArg, "Cannot reshape from or to an image without pixels");
    const float w = static_cast<float>(image_.w()), h = static_cast<float>(image_.h());
    const auto newWidth = static_cast<std::uint32_t>(width), newHeight = static_cast<std::uint32_t>(height);
    std::uint32_t innerWidth = newWidth, innerHeight = newHeight;
    const bool wide = w / h > static_cast<float>(width) / static_cast<float>(height);
    const float s = wide ? static_cast<float>(width) / w : static_cast<float>(height) / h;
    // Rounding may bring the other side one pixel above what there is room for.
    if (wide)
        innerHeight = std::min(newHeight, static_cast<std::uint32_t>(h * s));
    else
        innerWidth = std::min(newWidth, static_cast<std::uint32_t>(w * s));
    const FNGridPos offset((width - static_cast<int>(innerWidth)) >> 1,
                           (height - static_cast<int>(innerHeight)) >> 1);

    image_ = changed(image_, [&](const auto& pixels) {
        return framed(scaled(pixels, innerWidth, innerHeight), offset, newWidth, newHeight);
    });
    mapLocations([&](FNPos p) { return s * p + FNPos(offset) + FNPos(0.5f, 0.5f); }, s);
}

FNImageReference vertReflection(FNImageReference const& image) {
    return changed(image,
                   [](const auto& pixels) { return Img::Affine::vertReflection(pixels, pixels.box()); });
}

Face vertReflection(Face const& face) {
    const float width = static_cast<float>(face.image().w());
    return face.mapped(vertReflection(face.image()), [&](FNPos p) { return FNPos(width - p.x, p.y); });
}

Face cropFace(Face const& face, float factor) {
    if (!face.hasBothEyeLocations() && !face.hasFaceFinderInfo())
        FN_THROW(FNEBadFunCall, "Cannot crop the face because there is no sufficient information about the "
                                "location and size of this face!");
    const float distance = face.eyeDistance() * (factor > 1 ? factor : 1);
    const FNPos pos = face.facePosition();
    const FNGridPos corner(FNPos(pos.x - 1.8f * distance, pos.y - 1.9f * distance));
    const FNGridPos end(FNPos(pos.x + 1.8f * distance, pos.y + 3.1f * distance));
    const FNBox box = FNBox{corner.x, corner.y, end.x, end.y} & face.image().box();

    const auto image = changed(face.image(), [&](const auto& pixels) { return cropped(pixels, box); });
    return face.mapped(image, [&](FNPos p) { return p - FNPos(FNGridPos(box.x0, box.y0)); });
}

} // namespace Cmp

#include "kx/token_face.h"

#include "fn/image_conversion.h"
#include "img/affine/transform.h"

namespace Kx::TokenFace {

namespace {

/// The eyes of a token image, in pixels of it.
struct EyePlaces {
    FNPos left, right, middle;
};

/// One of the two kinds of token image.
struct Kind {
    CutBox (*box)(FNPos left, FNPos right);
    EyePlaces (*eyes)(float width, float height);
    /// Whether pixels at the border of the image blend with the padding.
    bool blendsBorder;
};

/// From the left eye to the right one, of length 1.
FNPos eyeAxis(FNPos left, FNPos right) {
    return (right - left) / length(right - left);
}
FNPos across(FNPos axis) {
    return {-axis.y, axis.x};
}

constexpr Kind standard{[](FNPos left, FNPos right) {
                            const float distance = length(right - left);
                            const FNPos axis = eyeAxis(left, right);
                            CutBox box;
                            box.width = pictureSide(4 * distance);
                            box.height = pictureSide(4 * static_cast<float>(box.width) / 3);
                            box.origin =
                                left - 1.5f * distance * axis - 29 * 0.083333336f * distance * across(axis);
                            box.u = boxSide(axis, box.width);
                            box.v = boxSide(across(axis), box.height);
                            return box;
                        },
                        [](float width, float height) -> EyePlaces {
                            const float x = width / 2 + 0.5f, y = 0.453125f * height + 0.5f;
                            return {{x - width / 8, y}, {x + width / 8, y}, {x, y}};
                        },
                        true};

constexpr Kind minimal{[](FNPos left, FNPos right) {
                           const float scale = 60 / length(right - left);
                           const FNPos axis = eyeAxis(left, right);
                           CutBox box;
                           box.width = 240;
                           box.height = 320;
                           box.origin = left - 90 / scale * axis - 145 / scale * across(axis);
                           box.u = 240 / scale * axis;
                           box.v = 320 / scale * across(axis);
                           return box;
                       },
                       [](float, float) -> EyePlaces {
                           return {{90.5f, 144.5f}, {149.5f, 144.5f}, {120.5f, 144.5f}};
                       },
                       false};

/// Whether there is nothing to measure the face by.
bool coincide(FNPos left, FNPos right) {
    checkPlaces({left, right});
    return !(length(right - left) > 0);
}

/// The pixels around a box that may touch its picture.
FNBox surroundings(const CutBox& box) {
    const auto [left, right] = std::minmax(
        {box.origin.x, box.origin.x + box.u.x, box.origin.x + box.v.x, box.origin.x + box.u.x + box.v.x});
    const auto [top, bottom] = std::minmax(
        {box.origin.y, box.origin.y + box.u.y, box.origin.y + box.v.y, box.origin.y + box.u.y + box.v.y});
    const FNGridPos first(FNPos(std::floor(left), std::floor(top))),
        last(FNPos(std::ceil(right), std::ceil(bottom)));
    return {first.x - 1, first.y - 1, last.x + 1, last.y + 1};
}

/// The part of an image that a box needs, with a frame of padding wherever the box passes the border. The box
/// moves along. One pixel of frame is enough: beyond it, padding is all there is.
template <class T> FNImage<T> withFrame(const FNImage<T>& image, CutBox& box, const T& padding) {
    const FNBox whole = image.box(), needed = surroundings(box) & FNBox{-1, -1, whole.x1 + 1, whole.y1 + 1};
    const FNBox inside = needed & whole;
    if (inside == needed) return image; // nothing outside, or nothing but that
    FNImage<T> framed(needed.width(), needed.height());
    framed.fill(padding);
    FNImIter<T> to(
        framed, {inside.x0 - needed.x0, inside.y0 - needed.y0, inside.x1 - needed.x0, inside.y1 - needed.y0});
    for (FNConstImIter<T> from(image, inside); !from.atEnd(); from.nextRow(), to.nextRow())
        std::ranges::copy(from.restOfRow(), to.restOfRow().begin());
    box.origin -= FNPos(FNGridPos(needed.x0, needed.y0));
    return framed;
}

template <class T>
FNImage<T> produce(const Kind& kind, const FNImage<T>& image, FNPos left, FNPos right, float paddingRatio,
                   const T& padding) {
    if (coincide(left, right)) return image;
    CutBox box = kind.box(left, right);
    FNImage<T> picture = box.picture<T>();
    checkPaddingRatio(box, image.box(), paddingRatio);
    const FNImage<T> source = kind.blendsBorder ? withFrame(image, box, padding) : image;
    Img::Affine::transform(source, picture, box.origin, box.u, box.v, true, padding);
    return picture;
}

/// Through 16 bits, which interpolation needs.
template <>
FNImage<unsigned char> produce(const Kind& kind, const FNImage<unsigned char>& image, FNPos left, FNPos right,
                               float paddingRatio, const unsigned char& padding) {
    using Word = unsigned short;
    if (coincide(left, right)) return image;
    return Fn::convertImage<unsigned char>(produce(kind, Fn::convertImage<Word>(image), left, right,
                                                   paddingRatio, Fn::convertPixel<Word>(padding)));
}

Cmp::Face produce(const Kind& kind, const Cmp::Face& face, float paddingRatio, const Fn::Bgra32& color) {
    const FNPos left = face.leftEye(), right = face.rightEye();
    const bool uncut = coincide(left, right);
    const auto picture = [&]<class T>(const FNImage<T>& image) {
        return FNImageReferenceFactory::create(
            produce(kind, image, left, right, paddingRatio,
                    Fn::convertPixel<T>(Fn::Bgra32(color.r, color.g, color.b))));
    };
    const FNImageReference token = [&] {
        if (uncut) return face.image();
        switch (face.image().native()) {
        case FNImageReference::MONO_FLOAT:
            return picture(face.image().toMonoFloat());
        case FNImageReference::BGRA32:
        case FNImageReference::RGB48:
            return picture(face.image().toBgra32());
        default:
            return picture(face.image().toMono16());
        }
    }();
    const EyePlaces places = kind.eyes(static_cast<float>(token.w()), static_cast<float>(token.h()));
    if (face.hasBothEyeLocations()) {
        const float scale = uncut ? 1 : static_cast<float>(token.w()) / (4 * length(right - left));
        const auto eye = [&](const FacialFeatureLocation& found, FNPos place) -> FacialFeatureLocation {
            return {place, found.size * scale, found.confidence};
        };
        return Cmp::Face(token, eye(face.leftEyeLocation(), places.left),
                         eye(face.rightEyeLocation(), places.right));
    }
    FaceFinder::Location location = face.faceFinderLocation();
    location.pos = places.middle;
    return Cmp::Face(token, location);
}

} // namespace

Fn::Deployment::Type CropTokenImage::define() {
    return Fn::Deployment::Type(
        typeId(), "Crop face region in order to get a token image image according to ISO-19794-5",
        properties(), "", false);
}

Cmp::Face produceImage(const Cmp::Face& face, float paddingRatio, const Fn::Bgra32& color) {
    return produce(standard, face, paddingRatio, color);
}

Cmp::Face produceMinimalImage(const Cmp::Face& face, float paddingRatio, const Fn::Bgra32& color) {
    return produce(minimal, face, paddingRatio, color);
}

template <class T>
FNImage<T> produceImage(const FNImage<T>& image, FNPos left, FNPos right, float paddingRatio,
                        const T& padding) {
    return produce(standard, image, left, right, paddingRatio, padding);
}

template <class T>
FNImage<T> produceMinimalImage(const FNImage<T>& image, FNPos left, FNPos right, float paddingRatio,
                               const T& padding) {
    return produce(minimal, image, left, right, paddingRatio, padding);
}

template FNImage<unsigned char> produceImage(const FNImage<unsigned char>&, FNPos, FNPos, float,
                                             const unsigned char&);
template FNImage<unsigned short> produceImage(const FNImage<unsigned short>&, FNPos, FNPos, float,
                                              const unsigned short&);
template FNImage<float> produceImage(const FNImage<float>&, FNPos, FNPos, float, const float&);
template FNImage<Fn::Bgra32> produceImage(const FNImage<Fn::Bgra32>&, FNPos, FNPos, float, const Fn::Bgra32&);
template FNImage<unsigned char> produceMinimalImage(const FNImage<unsigned char>&, FNPos, FNPos, float,
                                                    const unsigned char&);
template FNImage<unsigned short> produceMinimalImage(const FNImage<unsigned short>&, FNPos, FNPos, float,
                                                     const unsigned short&);
template FNImage<float> produceMinimalImage(const FNImage<float>&, FNPos, FNPos, float, const float&);
template FNImage<Fn::Bgra32> produceMinimalImage(const FNImage<Fn::Bgra32>&, FNPos, FNPos, float,
                                                 const Fn::Bgra32&);

} // namespace Kx::TokenFace

#pragma once

#include "cmp/face/face.h"
#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"
#include "fn/callback/functor.h"
#include "fn/image_reference.h"
#include "fn/imagefile/properties_feedback.h"
#include "orbek/eyes_finder.h"
#include "orbek/image_io.h"

/// Translation between the public value types and those of the engines.

namespace Orbek {

inline FNPos adapt(const Position& pos) {
    return {pos.x, pos.y};
}
inline Position adapt(const FNPos& pos) {
    return {pos.x, pos.y};
}

inline FNBox adapt(const Box& box) {
    return {box.x0, box.y0, box.x1, box.y1};
}
/// The corners come out sorted.
inline Box adapt(const FNBox& box) {
    return Box(box.x0, box.y0, box.x1, box.y1);
}

Face::Location adapt(const ::FaceFinder::Location& location);
::FaceFinder::Location adapt(const Face::Location& location);

/// One eye, with its confidence and no size.
FacialFeatureLocation leftEye(const Eyes::Location& eyes);
FacialFeatureLocation rightEye(const Eyes::Location& eyes);
Eyes::Location adapt(const FacialFeatureLocation& left, const FacialFeatureLocation& right);

Image adapt(const FNImageReference& image, const std::string& name);
/// The engines read the application's pixels in place; the reference keeps the image alive.
/// @throws FNEBadArg for a null handle
FNImageReference adapt(const Image& image);

/// The image, with an empty name, and the places of the eyes.
/// @throws FNEBadFunCall if the face has not both eyes
std::pair<Image, Eyes::Location> adapt(const Cmp::Face& face);
/// A face of which only the eyes are known.
Cmp::Face adapt(const std::pair<Image, Eyes::Location>& imageWithEyes);
/// All pairs of a range in their order. @param visit called with each image just before its conversion
template <class Iterator>
std::list<Cmp::Face> adapt(Iterator first, Iterator last, const Fn::Functor1<Image>& visit) {
    std::list<Cmp::Face> faces;
    for (; first != last; ++first) {
        visit(first->first);
        faces.push_back(adapt(*first));
    }
    return faces;
}

/// A null handle ignores what it is told.
Fn::ReadImagePropertiesFeedback adapt(const ImageIO::PropertiesFeedback& feedback);

} // namespace Orbek

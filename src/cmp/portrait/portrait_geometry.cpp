#include "cmp/portrait/portrait_geometry.h"

#include "cmp/reshape.h"

namespace Cmp::Portrait {

FNImage<float> portraitOf(const Face& face, const PortraitFormat& format) {
    if (!face.hasBothEyeLocations() && !face.hasFaceFinderInfo())
        FN_THROW(FNEBadFunCall, "Cannot reshape the face because there is no sufficient information about "
                                "the location and size of this face!");
    const bool eyes = face.hasBothEyeLocations();
    const FNPos first = eyes ? face.leftEye() : face.ffLeftEye();
    const FNPos second = eyes ? face.rightEye() : face.ffRightEye();
    return reshape(face.image().toMonoFloat(), first, second, format.side, format.side, format.eye, true,
                   1.0f)
        .first;
}

FNImage<float> windowOf(const FNImage<float>& portrait, const FNBox& box) {
    FNImage<float> window(box.width(), box.height());
    float* out = window.getExclusive();
    for (FNConstImIter<float> it(portrait, box); !it.atEnd(); it.nextRow())
        out = std::copy(it.restOfRow().begin(), it.restOfRow().end(), out);
    return window;
}

} // namespace Cmp::Portrait

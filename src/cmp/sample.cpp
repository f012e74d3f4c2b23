#include "cmp/sample.h"

namespace Cmp {

void Sample::check(const Requirements& requirements) const {
    const auto demand = [](bool required, bool present, const char* what) {
        if (required && !present)
            FN_THROW(FNEBadArg, std::string("Sample requirement not met: need ") + what);
    };
    demand(requirements.intensityImage, bool(intensityImage), "intensity image");
    demand(requirements.intensityEyePositions, leftEye && rightEye, "intensity eye positions");
    demand(requirements.faceStream, bool(faceStream), "FaceStream");
    demand(requirements.shapeData, vertexImage || pointSet, "shape vertex image or point set");
    demand(requirements.shapeEyePositions, shapeLeftEye && shapeRightEye, "shape eye positions");
}

} // namespace Cmp

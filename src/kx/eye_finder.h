#pragma once

#include "eye/eyes_finder.h"
#include "fn/image_reference.h"

namespace Kx::Implementation {

/// Finds the eyes of the most prominent face of an image, or knows them from the image's attributes:
/// "EyePositions" has six numbers with colons between them, x, y and confidence of the left and of the right
/// eye, and counts if "EyeFinderID" names these very finders.
class EyeFinder {
public:
    enum Found : int { NoFace = 0, NoEye = 1, LeftEye = 2, RightEye = 3, BothEyes = 4 };

    /// @param useAttributes whether the attributes are asked first
    EyeFinder(const FaceFinder& faceFinder, const EyesFinder& eyesFinder, bool useAttributes)
        : faceFinder_(faceFinder), eyesFinder_(eyesFinder),
          id_(eyesFinder.processingId() + faceFinder.processingId()), useAttributes_(useAttributes) {}

    /// @param left,right written as far as they are found
    /// @param minEyeDistance,maxEyeDistance to look for, in widths of the image
    /// @return a value of Found
    int find(const FNImageReference& image, FacialFeatureLocation& left, FacialFeatureLocation& right,
             double minEyeDistance, double maxEyeDistance) const;

private:
    bool findInAttributes(const FNImageAttributes& attributes, FacialFeatureLocation& left,
                          FacialFeatureLocation& right) const;

    FaceFinder faceFinder_;
    EyesFinder eyesFinder_;
    std::string id_;
    bool useAttributes_;
};

} // namespace Kx::Implementation

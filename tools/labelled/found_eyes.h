#pragma once

#include "eye/eyes_finder.h"
#include "eye/face_finder.h"

#include <filesystem>

namespace Labelled {

/// The eyes of labelled faces as they are in use, where our finders tell them.
class EyesAsFound {
public:
    struct Eyes {
        FNPos left, right;
        bool found; ///< by the finders; these are the labels otherwise
    };

    /// @param etc folder with the trained content. @throws FNEIOError
    explicit EyesAsFound(const std::filesystem::path& etc);

    /// @param left,right as they are labelled
    Eyes operator()(const FNImageReference& image, FNPos left, FNPos right) const;

private:
    FaceFinder face_;
    EyesFinder eyes_;
};

} // namespace Labelled

#pragma once

#include "fn/image_reference.h"
#include "fn/thread/mutex.h"
#include "orbek/image.h"

#include <optional>

namespace Orbek {

/// The library's own images as the application sees them. Each representation is converted once, when it is
/// first asked for.
class ImageFN final : public ImageBody {
public:
    ImageFN(const FNImageReference& reference, const std::string& name)
        : reference_(reference), name_(name) {}

    bool isColor() const override { return reference_.isColor(); }
    unsigned int width() const override { return reference_.w(); }
    unsigned int height() const override { return reference_.h(); }
    const unsigned char* grayScaleRepresentation() const override;
    const Rgb* colorRepresentation() const override;
    std::string name() const override { return name_; }

private:
    FNImageReference reference_;
    FNMutex mutex_{FNMutex::recursive}; ///< guards the change of the next two from unset to set
    mutable std::optional<FNImage<unsigned char>> gray_;
    mutable std::optional<FNImage<Fn::Bgra32>> color_;
    std::string name_;
};

} // namespace Orbek

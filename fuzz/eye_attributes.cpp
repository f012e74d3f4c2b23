// The eyes that an image's attributes tell: six finite numbers, or none.

#include "kx/eye_finder.h"

#include <cmath>
#include <cstdlib>

namespace {

/// Finds nothing, so that all that is found is from the attributes.
class Faces final : public FaceFinder::Body {
    bool find(const FNImageReference&, std::list<FaceFinder::Location>&, double, double,
              const FNBox&) const override {
        return false;
    }
    std::string processingId() const override { return "f"; }
};

class Eyes final : public EyesFinder::Body {
    void find(const FaceFinder::Location&, const FNImageReference&, bool&, FacialFeatureLocation&, bool&,
              FacialFeatureLocation&) const override {}
    void find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&, bool&,
              FacialFeatureLocation&, bool&, FacialFeatureLocation&) const override {}
    std::string processingId() const override { return "e"; }
};

bool finite(const FacialFeatureLocation& eye) {
    return std::isfinite(eye.pos.x) && std::isfinite(eye.pos.y) && std::isfinite(eye.confidence);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    static const Kx::Implementation::EyeFinder finder(FaceFinder(FNCountedPtr<FaceFinder::Body>(new Faces)),
                                                      EyesFinder(FNCountedPtr<EyesFinder::Body>(new Eyes)),
                                                      true);
    FNImageReference image;
    image.attributes() = {{"EyeFinderID", "ef"},
                          {"EyePositions", std::string(reinterpret_cast<const char*>(data), size)}};
    FacialFeatureLocation left, right;
    finder.find(image, left, right, 0, 1);
    if (!finite(left) || !finite(right)) std::abort();
    return 0;
}

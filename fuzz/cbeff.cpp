// Facial records: what is accepted has images within the limits and a place for each face, and can be
// written.

#include "kx/cbeff.h"
#include "fn/message/dialog.h"

#include <cstdlib>
#include <sstream>
#include <stdexcept>

namespace {

class Silence final : public FNDialog::Body {
    void log(const std::string&) override {}
    void info(const std::string&) override {}
    void warn(const std::string&) override {}
    void error(const std::string&) override {}
    std::string name() const override { return "Silence"; }
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    static const bool silent = (FNDialog::set(FNCountedPtr<FNDialog::Body>(new Silence)), true);
    (void)silent;
    Fn::ImageLimits limits;
    limits.maxPixels = 1u << 16;
    limits.maxBytes = 1u << 24;
    std::istringstream stream(std::string(reinterpret_cast<const char*>(data), size));
    std::list<Cmp::Face> faces;
    try {
        faces = Kx::CBEFF::read(stream, limits);
    } catch (const FNException&) {
        return 0;
    } catch (const std::invalid_argument&) { // eyes that coincide
        return 0;
    }
    std::uint64_t pixels = 0;
    for (const Cmp::Face& face : faces) {
        pixels += std::uint64_t{face.image().w()} * face.image().h();
        if (face.faceFinderLocation().width <= 0 || face.hasBothEyeLocations()) std::abort();
    }
    if (pixels > limits.maxPixels) std::abort();
    if (pixels > 4096) return 0; // writing takes the fuzzer's time
    std::ostringstream written;
    Kx::CBEFF::TokenFace::write(written, faces);
    return 0;
}

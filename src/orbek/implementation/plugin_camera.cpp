#include "orbek/implementation/plugin_camera.h"

#include "fn/image_reference.h"
#include "orbek/camera_plugin.h"

#include <cstring>

namespace Orbek {
namespace {

constexpr const char* openName = "orbekOpenCamera";

/// Room for a reason, which ends with a 0 whatever a plug-in writes there.
class Reason {
public:
    char* room() { return text_; }
    std::string text() {
        text_[ORBEK_CAMERA_ERROR_SIZE - 1] = '\0';
        return *text_ ? text_ : "no reason given";
    }

private:
    char text_[ORBEK_CAMERA_ERROR_SIZE] = {};
};

/// An open camera of a plug-in; the library goes after it.
class OpenCamera {
public:
    OpenCamera(const Fn::Dll& library, const std::string& name) : library_(library), name_(name) {
        Reason reason;
        auto* const open = library_.function<orbekOpenCameraFunction>(openName);
        if (open(ORBEK_CAMERA_INTERFACE, name.c_str(), &camera_, reason.room()) != 0)
            fail("cannot be opened", reason);
        if (!camera_.grab) FN_THROW(FNESysError, "The camera " + name_ + " has no function for images");
    }
    ~OpenCamera() {
        if (camera_.close) camera_.close(camera_.self);
    }
    OpenCamera(const OpenCamera&) = delete;
    OpenCamera& operator=(const OpenCamera&) = delete;

    using Shoot = decltype(orbekCamera::grab);

    const orbekCamera& camera() const { return camera_; }
    const std::string& name() const { return name_; }

    /// @throws FNESysError with the plug-in's reason, or for a frame that is none
    FNImageReference image(Shoot shoot) const {
        orbekFrame frame{};
        Reason reason;
        if (shoot(camera_.self, &frame, reason.room()) != 0) fail("gives no image", reason);
        switch (frame.format) {
        case ORBEK_GRAY8:
            return copy<unsigned char>(frame, 1, [](const unsigned char* p) { return *p; });
        case ORBEK_BGR24:
            return copy<Fn::Bgra32>(frame, 3,
                                    [](const unsigned char* p) { return Fn::Bgra32(p[2], p[1], p[0]); });
        case ORBEK_RGB24:
            return copy<Fn::Bgra32>(frame, 3,
                                    [](const unsigned char* p) { return Fn::Bgra32(p[0], p[1], p[2]); });
        case ORBEK_BGRA32:
            return copy<Fn::Bgra32>(frame, 4,
                                    [](const unsigned char* p) { return Fn::Bgra32(p[2], p[1], p[0]); });
        default:
            FN_THROW(FNESysError, "The camera " + name_ + " gives images of the unknown format " +
                                      std::to_string(frame.format));
        }
    }

private:
    [[noreturn]] void fail(const char* what, Reason& reason) const {
        FN_THROW(FNESysError, "The camera " + name_ + " " + what + ": " + reason.text());
    }

    template <class Pixel, class Convert>
    FNImageReference copy(const orbekFrame& frame, unsigned int bytes, Convert convert) const {
        constexpr unsigned int largest = 65535;
        if (frame.width == 0 || frame.height == 0 || frame.width > largest || frame.height > largest ||
            frame.stride < std::uint64_t{frame.width} * bytes || !frame.pixels)
            FN_THROW(FNESysError, "The camera " + name_ + " gives an image of " +
                                      std::to_string(frame.width) + " x " + std::to_string(frame.height) +
                                      " pixels in rows of " + std::to_string(frame.stride) + " bytes");
        FNImage<Pixel> image(frame.width, frame.height);
        Pixel* pixel = image.getExclusive();
        for (unsigned int y = 0; y < frame.height; ++y) {
            const auto* const row =
                static_cast<const unsigned char*>(frame.pixels) + std::size_t{y} * frame.stride;
            for (unsigned int x = 0; x < frame.width; ++x) *pixel++ = convert(row + std::size_t{x} * bytes);
        }
        return FNImageReferenceFactory::create(image);
    }

    Fn::Dll library_;
    std::string name_;
    orbekCamera camera_{};
};

/// One role of a camera. It has no settings that can be changed from here.
class PluginCamera final : public Fn::LiveVideoSource {
public:
    PluginCamera(const FNCountedPtr<OpenCamera>& open, OpenCamera::Shoot shoot)
        : open_(open), shoot_(shoot) {}

    FNImageReference grab() override {
        const FNImageReference image = open_->image(shoot_);
        w_ = image.w();
        h_ = image.h();
        return image;
    }
    std::string id() override { return open_->name(); }
    unsigned int gain() override { return ask(open_->camera().gain); }
    Range gainRange() override { return {}; }
    void setGain(unsigned int) override { refuse("gain"); }
    unsigned int contrast() override { return 0; }
    Range contrastRange() override { return {}; }
    void setContrast(unsigned int) override { refuse("contrast"); }
    unsigned int exposure() override { return ask(open_->camera().exposure); }
    unsigned int w() override { return w_; }
    unsigned int h() override { return h_; }

private:
    unsigned int ask(unsigned int (*setting)(void*)) const {
        return setting ? setting(open_->camera().self) : 0;
    }
    [[noreturn]] void refuse(const char* setting) const {
        FN_THROW(FNEBadFunCall, "The camera " + open_->name() + " has no " + setting + " that can be set");
    }

    FNCountedPtr<OpenCamera> open_;
    OpenCamera::Shoot shoot_;
    unsigned int w_ = 0, h_ = 0; ///< of the last image
};

} // namespace

bool isPluginCamera(const Fn::Dll& library) {
    return library.exports(openName);
}

FG::GrabberPair openPluginCamera(const Fn::Dll& library, const std::string& name) {
    const FNCountedPtr<OpenCamera> open(new OpenCamera(library, name));
    const orbekCamera& camera = open->camera();
    const auto role = [&](OpenCamera::Shoot shoot) {
        return FNCountedPtr<Fn::LiveVideoSource>(new PluginCamera(open, shoot));
    };
    return {role(camera.grab), FNCountedPtr<FG::StillImageSource>(new FG::StillImageSourceEmulator(
                                   role(camera.take ? camera.take : camera.grab)))};
}

} // namespace Orbek

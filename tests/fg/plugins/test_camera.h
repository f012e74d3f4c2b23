#pragma once

#include "fg/dll_frame_grabber_factory.h"

#include <cstdlib>

#define FG_PLUGIN_EXPORT extern "C" __attribute__((visibility("default")))

/// Shows a square that is as gray as its gain says.
class TestCamera final : public Fn::LiveVideoSource {
public:
    explicit TestCamera(const std::string& name) : name_(name) {}
    /// Tells the loading program's environment that the object is gone.
    ~TestCamera() override { setenv("FG_TEST_CAMERA", "gone", 1); }

    FNImageReference grab() override {
        FNImage<unsigned char> image(4, 3);
        image.fill(static_cast<unsigned char>(gain_));
        return FNImageReferenceFactory::create(image);
    }
    std::string id() override { return name_; }
    unsigned int gain() override { return gain_; }
    Range gainRange() override { return {1, 255}; }
    void setGain(unsigned int value) override {
        if (value > 255) FN_THROW(FNEOutOfRange, "gain of the test camera");
        gain_ = value;
    }
    unsigned int contrast() override { return 0; }
    Range contrastRange() override { return {}; }
    void setContrast(unsigned int) override { throw 7; }
    unsigned int w() override { return 4; }
    unsigned int h() override { return 3; }
    Fn::Package getVideoFormat() override { return Fn::Package(12); }

private:
    std::string name_;
    unsigned int gain_ = 1;
};

using CameraHandle = FNCountedPtr<Fn::LiveVideoSource>;

#ifdef __clang__
#pragma clang diagnostic ignored "-Wreturn-type-c-linkage" // handles travel between C++ programs
#endif

#pragma once

#include "fg/dll_frame_grabber_factory.h"

#include <cstdlib>
#include <stdexcept>

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
    unsigned int contrast() override { return 11; }
    Range contrastRange() override { return {12, 13}; }
    void setContrast(unsigned int) override { throw 7; }
    unsigned int exposure() override { return exposure_; }
    Range exposureRange() override { return {22, 23}; }
    void setExposure(unsigned int value) override { exposure_ = value; }
    unsigned int saturation() override { return saturation_; }
    Range saturationRange() override { return {32, 33}; }
    void setSaturation(unsigned int value) override { saturation_ = value; }
    unsigned int hue() override { return 41; }
    Range hueRange() override { return {42, 43}; }
    void setHue(unsigned int) override { throw std::invalid_argument("no hue"); }
    int configure() override { return 51; }
    int videoFormat() override { return 52; }
    void setVideoFormat(const Fn::Package& format) override {
        gain_ = static_cast<unsigned int>(format.toInt32());
    }
    unsigned int w() override { return 4; }
    unsigned int h() override { return 3; }
    Fn::Package getVideoFormat() override { return Fn::Package(12); }

private:
    std::string name_;
    unsigned int gain_ = 1, exposure_ = 21, saturation_ = 31;
};

using CameraHandle = FNCountedPtr<Fn::LiveVideoSource>;

#ifdef __clang__
#pragma clang diagnostic ignored "-Wreturn-type-c-linkage" // handles travel between C++ programs
#endif

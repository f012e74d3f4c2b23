#include "orbek/capture_device.h"

#include "drawn_image.h"
#include "orbek/image_io.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/implementation/video_format_body.h"
#include "support/recorded_dialog.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>

using namespace Orbek;

namespace {

Configuration configured(const std::string& settings) {
    std::istringstream text(settings);
    return Configuration(text);
}

/// A folder of pictures, 1, 2 and so on pixels wide, and a device that plays them.
struct Film : ScratchFolder {
    explicit Film(unsigned int frames = 3) {
        for (unsigned int w = 1; w <= frames; ++w)
            Pgm::save(grayPattern(w, 2), file(std::to_string(w) + ".pgm"));
    }
    std::string settings() const {
        return "ORBEK.CaptureDevices = door\n"
               "ORBEK.CaptureDevices.door = ImageFiles\n"
               "ORBEK.CaptureDevices.door.ImageFiles.FileLocation = Directory\n"
               "ORBEK.CaptureDevices.door.ImageFiles.FileLocation.Directory = " +
               path().string() + "\nORBEK.CaptureDevices.door.ImageFiles.Sorting = AscendingByName\n";
    }
};

TEST(CaptureDevice, PlaysTheFilesOfTheConfigurationInTurn) {
    const Film film;
    const CaptureDevice device = createCaptureDevice(configured(film.settings()), "door");
    for (const unsigned int w : {1u, 2u, 3u, 1u}) {
        const Image captured = device->capture(), expected = grayPattern(w, 2);
        ASSERT_EQ(captured->width(), w);
        EXPECT_TRUE(std::equal(captured->grayScaleRepresentation(),
                               captured->grayScaleRepresentation() + std::size_t{w} * 2,
                               expected->grayScaleRepresentation()));
        EXPECT_EQ(captured->name(), "door");
    }
    EXPECT_EQ(device->release()->width(), 1u) << "single pictures have a turn of their own";
    EXPECT_EQ(device->release()->width(), 2u);
    EXPECT_EQ(device->gain() + device->exposure(), 0u);
    EXPECT_EQ(device->configure() + device->videoFormatDialog(), 0);
    EXPECT_NO_THROW(device->control(device->capture(), {{{1, 1}, 1, 1, 0}}));
    EXPECT_NO_THROW(device->setVideoFormat(device->getVideoFormat()));
}

TEST(CaptureDevice, TheReadyMadeOneShowsTheSamplePeople) {
    const CaptureDevice device =
        createCaptureDevice(configured("ORBEK.Substitutions.INSTALLDIR = $ORBEKDIR\n"), "Files");
    for (const unsigned int height : {426u, 426u, 426u}) {
        const Image image = device->capture();
        EXPECT_EQ(image->height(), height);
        EXPECT_TRUE(image->isColor());
    }
}

TEST(CaptureDevice, WithoutASourceSaysSo) {
    const RecordedDialog dialog;
    const Film empty(0);
    for (const auto& [settings, reason] :
         {std::pair{empty.settings(), ": MultiFile::MultiFile: empty list not valid"},
          {"ORBEK.CaptureDevices.door = Prosilica\n", ""}}) {
        const CaptureDevice device = createCaptureDevice(configured(settings), "door");
        EXPECT_EQ(dialog.messages().size(), 1u) << settings;
        const std::string none =
            "FNEBadFunCall: The capture device ORBEK.CaptureDevices.door has no source of images" +
            std::string(reason);
        EXPECT_EQ(thrownBy([&] { device->capture(); }), none);
        EXPECT_EQ(thrownBy([&] { device->exposure(); }), none);
        EXPECT_EQ(thrownBy([&] { device->setVideoFormat(device->getVideoFormat()); }), none);
        EXPECT_EQ(thrownBy([&] { device->release(); }).substr(0, 15), "FNEBadFunCall: ");
        EXPECT_NO_THROW(device->control(grayPattern(2, 2), {}));
    }
    EXPECT_EQ(
        thrownBy([] { createCaptureDevice(configured("ORBEK.CaptureDevices.door = Webcam\n"), "door"); }),
        "FNEBadArg: could not create framegrabber for property Webcam");
}

TEST(CaptureDevice, AControllerIsForTheDeviceOfItsName) {
    const Film film;
    for (const auto& [controllers, available] : {std::pair{"back", true}, {"back door", false}}) {
        const CaptureDevice device = createCaptureDevice(
            configured(film.settings() + "ORBEK.CameraControllers = " + controllers + "\n"), "door");
        const Image image = device->capture();
        EXPECT_EQ(thrownBy([&] { device->control(image, {}); }) == "nothing thrown", available);
    }
}

TEST(CaptureDevice, LivesInAPlugInWhereOneIsConfigured) {
    const std::string settings = "ORBEK.CaptureDevices = gate\nORBEK.CaptureDevices.gate = Basler\n"
                                 "ORBEK.FgDllCache.DllPaths = Basler\nORBEK.FgDllCache.DllPaths.Basler = ";
    Image image;
    EXPECT_EQ(
        createCaptureDevice(configured(settings + FG_PLUGIN_video_only + "\n"), "gate")->release()->width(),
        4u)
        << "a plug-in may know video only";
    {
        const Configuration configuration = configured(settings + FG_PLUGIN_whole + "\n");
        const CaptureDevice device = createCaptureDevice(configuration, "gate");
        EXPECT_EQ(device->gain(), 1u);
        EXPECT_EQ(device->getVideoFormat().body()->package().toInt32(), 12);
        EXPECT_EQ(*device->release()->grayScaleRepresentation(), 1);
        image = device->capture();
        const Resources& resources =
            Configuration::Implementation::implementation(configuration)->resources();
        EXPECT_EQ(resources.dllFrameGrabberFactoryCache(), resources.dllFrameGrabberFactoryCache());
    }
    EXPECT_EQ(*image->grayScaleRepresentation(), 1) << "an image outlives its device and the configuration";
    EXPECT_EQ(image->name(), "gate");
    EXPECT_EQ(thrownBy([&] { createCaptureDevice(configured(settings + "/no/such.so\n"), "gate"); }),
              "FNESysError: Cannot load library: /no/such.so");
}

/// A device of the camera in C that is named so.
CaptureDevice cameraInC(const std::string& name) {
    return createCaptureDevice(configured("ORBEK.CaptureDevices." + name + " = DSLR\n" +
                                          "ORBEK.FgDllCache.DllPaths.DSLR = " ORBEK_C_CAMERA "\n"),
                               name);
}

TEST(CaptureDevice, MayBeACameraInC) {
    unsetenv("ORBEK_TEST_CAMERA");
    {
        const CaptureDevice device = cameraInC("gray");
        const Image frame = device->capture(), picture = device->release();
        EXPECT_FALSE(frame->isColor());
        EXPECT_EQ(frame->name(), "gray");
        const unsigned char rows[] = {0, 10, 100, 110}, taken[] = {1, 11, 101, 111};
        EXPECT_TRUE(std::equal(rows, rows + 4, frame->grayScaleRepresentation()));
        EXPECT_TRUE(std::equal(taken, taken + 4, picture->grayScaleRepresentation()));
        EXPECT_EQ(device->gain(), 11u);
        EXPECT_EQ(device->exposure(), 13u);
        EXPECT_EQ(getenv("ORBEK_TEST_CAMERA"), nullptr);
    }
    EXPECT_STREQ(getenv("ORBEK_TEST_CAMERA"), "closed");
    {
        const CaptureDevice plain = cameraInC("plain");
        EXPECT_EQ(*plain->release()->grayScaleRepresentation(), 0) << "the single picture is a frame";
        EXPECT_EQ(plain->gain() + plain->exposure(), 0u);
        unsetenv("ORBEK_TEST_CAMERA");
    }
    EXPECT_EQ(getenv("ORBEK_TEST_CAMERA"), nullptr);
    const struct {
        const char* name;
        Rgb second, third;                                 ///< pixels
    } colours[] = {{"bgr", {30, 40, 50}, {100, 110, 120}}, // blue first
                   {"rgb", {50, 40, 30}, {120, 110, 100}},
                   {"bgra", {40, 50, 60}, {100, 110, 120}}};
    for (const auto& [name, second, third] : colours) {
        const Image image = cameraInC(name)->capture();
        EXPECT_TRUE(image->isColor());
        EXPECT_EQ(image->colorRepresentation()[1], second) << name;
        EXPECT_EQ(image->colorRepresentation()[2], third) << name;
    }
}

TEST(CaptureDevice, WhatACameraInCDoesWrongIsTold) {
    for (const auto& [name, what] : {std::pair{"refused", "cannot be opened: it is unplugged"},
                                     {"silent", "cannot be opened: no reason given"},
                                     {"empty", "has no function for images"}})
        EXPECT_EQ(thrownBy([&] { cameraInC(name); }),
                  std::string("FNESysError: The camera ") + name + " " + what);
    const std::string noImage = "gives an image of ";
    for (const auto& [name, what] : {std::pair{"dark", "gives no image: " + std::string(255, 'x')},
                                     {"format", "gives images of the unknown format 5"},
                                     {"wide", noImage + "11 x 2 pixels in rows of 10 bytes"},
                                     {"huge", noImage + "2 x 65536 pixels in rows of 10 bytes"},
                                     {"flat", noImage + "2 x 0 pixels in rows of 10 bytes"},
                                     {"null", noImage + "2 x 2 pixels in rows of 10 bytes"}}) {
        const CaptureDevice device = cameraInC(name);
        EXPECT_EQ(thrownBy([&] { device->capture(); }),
                  std::string("FNESysError: The camera ") + name + " " + what);
    }
}

TEST(CaptureDevice, OfAnApplicationNeedsCaptureOnly) {
    class Still final : public CaptureDeviceBody {
        Image capture() override { return grayPattern(5, 4); }
    };
    const CaptureDevice device(new Still);
    EXPECT_EQ(device->release()->width(), 5u);
    EXPECT_EQ(device->gain() + device->exposure(), 0u);
    EXPECT_EQ(device->getVideoFormat().body()->package().size(), Fn::Package().size());
    EXPECT_NO_THROW(device->setVideoFormat(device->getVideoFormat()));
}

} // namespace

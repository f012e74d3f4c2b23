#include "fg/dll_frame_grabber_factory.h"
#include "fg/frame_grabber_factory.h"
#include "fg/multi_file.h"

#include "fn/deployment/app_config_db.h"
#include "fn/imagefile/image_file.h"
#include "support/recorded_dialog.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <chrono>
#include <sstream>

#include <dlfcn.h>
#include <sys/stat.h>

namespace {

using namespace Fn::Deployment;
using Images = std::vector<int>;

/// A component of type `T` with the settings in `text`, whose keys begin with "X.".
template <class T> Component componentOf(const std::string& text) {
    std::istringstream stream(text);
    return Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(stream)),
                     Property(type<T>(), "X", type<T>().defaultValue(), "", false));
}

/// A folder of three images: the one named n is n wide and n + 1 high, and all gray.
struct ThreeFiles : ScratchFolder {
    ThreeFiles() {
        for (const int n : {2, 1, 3}) {
            FNImage<unsigned char> image(static_cast<std::uint32_t>(n), static_cast<std::uint32_t>(n + 1));
            image.fill(static_cast<unsigned char>(40 * n));
            Fn::writeImage(FNImageReferenceFactory::create(image), name(n), FNImageCompressor::LOSSLESS);
        }
        std::filesystem::create_directory(file("0folder"));
    }
    std::string name(int n) const { return file(std::to_string(n) + ".pgm"); }
    std::string listed() const { // in the order 3, 1, 2
        return "X.FileLocation = Files\nX.FileLocation.Files = c a b\nX.FileLocation.Files.a = " + name(1) +
               "\nX.FileLocation.Files.b = " + name(2) + "\nX.FileLocation.Files.c = " + name(3) + "\n";
    }
    std::string folder() const {
        return "X.FileLocation = Directory\nX.FileLocation.Directory = " + path().string() + "\n";
    }
};

FG::MultiFile multiFile(const std::string& text) {
    return FG::MultiFile(componentOf<FG::MultiFileDef>(text), "cam");
}

Images widths(FG::MultiFile& grabber, int n) {
    Images result;
    for (int i = 0; i < n; ++i) result.push_back(static_cast<int>(grabber.grab().w()));
    return result;
}

TEST(MultiFile, DeliversItsFilesInOrder) {
    const ThreeFiles files;
    struct Case {
        std::string settings;
        Images order;
    };
    for (const Case& c :
         std::vector<Case>{{files.listed(), {3, 1, 2, 3, 1}},
                           {files.listed() + "X.ContinuousPlayback = false\n", {3, 1, 2, 2, 2}},
                           {files.folder() + "X.Sorting = AscendingByName\n", {1, 2, 3, 1, 2}},
                           {files.folder() + "X.Sorting = DescendingByName\nX.ContinuousPlayback = false\n",
                            {3, 2, 1, 1, 1}}})
        for (const char* caching : {"X.ImageCaching = true\n", "X.ImageCaching = false\n"}) {
            FG::MultiFile grabber = multiFile(c.settings + caching);
            EXPECT_EQ(grabber.w(), static_cast<unsigned>(c.order.front()));
            EXPECT_EQ(grabber.h(), static_cast<unsigned>(c.order.front() + 1));
            EXPECT_EQ(widths(grabber, 5), c.order) << c.settings << caching;
        }
}

TEST(MultiFile, TagsEachImageWithTimesOfItsOwn) {
    const ThreeFiles files;
    for (const auto& [rate, period] : {std::pair{"25", 40}, {"3", 333}, {"0.5", 2000}}) {
        FG::MultiFile grabber = multiFile(files.listed() + "X.CaptureFrameRate = " + rate +
                                          "\nX.ExposureTime = UInt\nX.ExposureTime.UInt = 1500\n");
        std::vector<FNImageReference> images;
        for (int i = 0; i < 5; ++i) images.push_back(grabber.grab());
        for (std::size_t i = 1; i < images.size(); ++i)
            EXPECT_EQ(*Fn::getImageCaptureTime(images[i].attributes()) -
                          *Fn::getImageCaptureTime(images[i - 1].attributes()),
                      std::chrono::milliseconds(period));
        EXPECT_EQ(*Fn::getImageExposureTime(images[4].attributes()), 1500u);
    }
    FG::MultiFile plain = multiFile(files.listed());
    EXPECT_FALSE(Fn::getImageExposureTime(plain.grab().attributes()).isSet());
}

TEST(MultiFile, DeliversNoFasterThanItsRate) {
    const ThreeFiles files;
    const auto start = std::chrono::steady_clock::now();
    FG::MultiFile grabber =
        multiFile(files.listed() + "X.DeliveryFrameRate = Float\nX.DeliveryFrameRate.Float = 50\n");
    widths(grabber, 4);
    // The first period begins when the grabber is made.
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(80));
}

TEST(MultiFile, SettingsHaveTheirDefaults) {
    EXPECT_FALSE(type<FG::MultiFileDef>().hasValue());
    EXPECT_FALSE(type<FG::DllFrameGrabberFactoryCacheDef>().hasValue());
    EXPECT_FALSE(type<FG::SupportedFrameGrabberDefs>().hasValue());
    const Component settings = componentOf<FG::MultiFileDef>("");
    for (const auto& [key, value] : {std::pair{"FileLocation", "Directory"},
                                     {"ImageCaching", "true"},
                                     {"Sorting", "No"},
                                     {"ContinuousPlayback", "true"},
                                     {"CaptureFrameRate", "25"},
                                     {"DeliveryFrameRate", "None"},
                                     {"ExposureTime", "None"}})
        EXPECT_EQ(settings.subComponent(key).read(true), value) << key;
    EXPECT_EQ(settings.subComponent("DeliveryFrameRate").subComponent("Float").read(true), "25");
    EXPECT_EQ(settings.subComponent("ExposureTime").subComponent("UInt").read(true), "8000");
}

TEST(MultiFile, LooksAgainAfterATenthOfThePeriodInWholeMilliseconds) {
    for (const auto& [rate, step] :
         {std::pair{1.0f, 100u}, {25.0f, 4u}, {99.0f, 1u}, {101.0f, 0u}, {1e5f, 0u}})
        EXPECT_EQ(FG::deliveryStep(1 / rate), step) << rate;
    EXPECT_EQ(FG::deliveryStep(1e30f), 1000000u);
}

TEST(MultiFile, ListsOnlyFilesAndTellsWhichIsNoImage) {
    const ThreeFiles files;
    ASSERT_EQ(mkfifo(files.file("pipe").c_str(), 0600), 0); // would never end
    FG::MultiFile grabber = multiFile(files.folder() + "X.Sorting = AscendingByName\n");
    EXPECT_EQ(widths(grabber, 4), (Images{1, 2, 3, 1}));
    const std::string readme = files.write("README", "of a camera");
    EXPECT_EQ(thrownBy([&] { multiFile(files.folder()); }),
              "FNEBadArg: MultiFile: file `" + readme +
                  "' cannot be read: Fn::readImage: Not a known image "
                  "format in " +
                  readme);
}

TEST(MultiFile, RefusesSettingsWithoutSense) {
    const ThreeFiles files;
    const ScratchFolder empty;
    const auto thrown = [&](const std::string& text) { return thrownBy([&] { multiFile(text); }); };
    const std::string delivery = files.listed() + "X.DeliveryFrameRate = Float\nX.DeliveryFrameRate.Float = ";
    EXPECT_EQ(thrown("X.CaptureFrameRate = 0\n"), "FNEBadArg: CaptureFrameRate must be bigger than zero");
    EXPECT_EQ(thrown("X.CaptureFrameRate = -1\n"), "FNEBadArg: CaptureFrameRate cannot be negative");
    EXPECT_EQ(thrown(delivery + "0\n"), "FNEBadArg: DeliveryFrameRate must be bigger than zero");
    EXPECT_EQ(thrown(delivery + "-1\n"), "FNEBadArg: DeliveryFrameRate cannot be negative");
    const std::string none = "FNEBadArg: MultiFile::MultiFile: empty list not valid";
    EXPECT_EQ(thrown("X.FileLocation = Files\n"), none);
    EXPECT_EQ(
        thrown("X.FileLocation = Directory\nX.FileLocation.Directory = " + empty.path().string() + "\n"),
        none);
    EXPECT_EQ(thrown("X.FileLocation = Directory\nX.FileLocation.Directory = /no/such\n"),
              "FNEIOError: MultiFile: directory `/no/such' cannot be read: No such file or directory");
    FG::MultiFile grabber = multiFile(files.listed());
    EXPECT_EQ(thrownBy([&] { grabber.setGain(1); }).substr(0, 15), "FNEBadFunCall: ");
    EXPECT_EQ(thrownBy([&] { grabber.setHue(1); }).substr(0, 15), "FNEBadFunCall: ");
    EXPECT_EQ(thrownBy([&] { grabber.setContrast(1); }),
              "FNEBadFunCall: MultiFile: files have no contrast to set");
    const auto still = grabber.stillImageSource();
    EXPECT_EQ(thrownBy([&] { still->setGain(1); }), "FNEBadFunCall: MultiFile: files have no gain to set");
    EXPECT_EQ(thrownBy([&] { still->setExposure(1); }),
              "FNEBadFunCall: MultiFile: files have no exposure to set");
    for (const unsigned int value : {grabber.gain(), grabber.contrast(), grabber.exposure(),
                                     grabber.saturation(), grabber.hue(), still->gain(), still->exposure()})
        EXPECT_EQ(value, 0u);
    const Fn::LiveVideoSource::Range noRange{};
    for (const auto& range : {grabber.gainRange(), grabber.contrastRange(), grabber.exposureRange(),
                              still->gainRange(), still->exposureRange()})
        EXPECT_EQ(range, noRange);
}

TEST(MultiFile, AFileThatCannotBeReadIsTriedAgain) {
    const ThreeFiles files;
    FG::MultiFile grabber = multiFile(files.listed() + "X.ImageCaching = false\n");
    EXPECT_EQ(widths(grabber, 1), Images{3});
    const std::string content = files.read("1.pgm");
    files.write("1.pgm", "P5 9");
    EXPECT_THROW(grabber.grab(), FNException);
    EXPECT_THROW(grabber.grab(), FNException);
    files.write("1.pgm", content);
    EXPECT_EQ(widths(grabber, 2), (Images{1, 2}));
}

TEST(MultiFile, StillImagesAreTheFilesBytesAndOutliveTheGrabber) {
    const ThreeFiles files;
    FNCountedPtr<FG::StillImageSource> still;
    {
        FG::MultiFile grabber = multiFile(files.listed());
        still = grabber.stillImageSource();
        grabber.grab(); // of the cache, whose position is its own
    }
    EXPECT_EQ(still->name(), "cam");
    for (const int n : {3, 1, 2, 3}) {
        const auto bytes = still->release();
        EXPECT_EQ(std::string(bytes.begin(), bytes.end()), files.read(std::to_string(n) + ".pgm"));
        EXPECT_EQ(still->extractImage(bytes, {}).w(), static_cast<unsigned>(n));
    }
    std::filesystem::remove(files.name(1));
    EXPECT_EQ(thrownBy([&] { still->release(); }),
              "FNEIOError: MultiFile: file `" + files.name(1) + "' cannot be read");
}

FG::DllFrameGrabberFactoryCache plugins(const std::string& text = {}) {
    return FG::DllFrameGrabberFactoryCache(componentOf<FG::DllFrameGrabberFactoryCacheDef>(text));
}

FG::GrabberPair create(const std::string& text, std::string* reason = nullptr) {
    return FG::FrameGrabberFactory<FG::FrameGrabberFullSet>::create2(
        componentOf<FG::FrameGrabberFactoryDef>(text), "front", plugins(), reason);
}

TEST(FrameGrabberFactory, MakesFilesAndLeavesOtherKindsEmpty) {
    const RecordedDialog dialog;
    const ThreeFiles files;
    const FG::GrabberPair made = create(
        "X = ImageFiles\nX.ImageFiles.FileLocation = Directory\nX.ImageFiles.FileLocation.Directory = " +
        files.path().string() + "\n");
    EXPECT_EQ(made.first->id(), "front");
    EXPECT_EQ(made.second->id(), "front");
    EXPECT_FALSE(create("X = Prosilica\n").first);
    EXPECT_TRUE(dialog.messages().empty());
    std::string reason;
    EXPECT_FALSE(create("X = ImageFiles\nX.ImageFiles.CaptureFrameRate = 0\n", &reason).first);
    EXPECT_EQ(reason, "CaptureFrameRate must be bigger than zero");
    EXPECT_EQ(dialog.messages(),
              std::vector<std::string>{"error: Could not initialize video capture device front: "
                                       "CaptureFrameRate must be bigger than zero"});
    EXPECT_EQ(thrownBy([] { create("X = Webcam\n"); }),
              "FNEBadArg: could not create framegrabber for property Webcam");
}

TEST(StillImageSourceEmulator, PicturesTravelAsPackages) {
    const ThreeFiles files;
    const FNCountedPtr<Fn::LiveVideoSource> source(new FG::MultiFile(multiFile(files.listed())));
    FG::StillImageSourceEmulator still(source);
    EXPECT_EQ(still.extractImage(still.release(), {}).toMono8()(0, 0), 120);
    EXPECT_EQ(thrownBy([&] { still.extractImage(FNRMem<unsigned char>(3), {}); }),
              "FNEBadArg: creating Package from memory: reading number of cores");
}

/// Whether the library is in this process's memory.
bool isLoaded(const char* path) {
    void* const handle = dlopen(path, RTLD_NOW | RTLD_NOLOAD);
    if (handle) dlclose(handle);
    return handle != nullptr;
}

TEST(DllFrameGrabberFactory, ALibraryStaysAsLongAsAnythingFromIt) {
    const Component settings = componentOf<FG::DllFrameGrabberFactoryCacheDef>("");
    setenv("FG_TEST_CAMERA", "alive", 1);
    FNImage<unsigned char> pixels;
    {
        FNImageReference image;
        {
            FG::GrabberPair camera;
            {
                const FG::DllFrameGrabberFactory factory(FG_PLUGIN_whole);
                camera = factory.createFG2(settings, "north");
                EXPECT_EQ(factory.createFG(settings, "south")->id(), "south");
            }
            camera.first->setGain(77);
            EXPECT_EQ(camera.second->gain(), 77u);
            EXPECT_EQ(camera.first->gainRange(), (Fn::LiveVideoSource::Range{1, 255}));
            EXPECT_EQ(camera.first->getVideoFormat().toInt32(), 12);
            EXPECT_EQ(thrownBy([&] { camera.first->setGain(256); }),
                      "FNEOutOfRange: gain of the test camera");
            EXPECT_EQ(thrownBy([&] { camera.first->setContrast(1); }).substr(0, 12), "FNEGeneric: ");
            image = camera.second->extractImage(camera.second->release(), {});
            image = camera.first->grab();
            setenv("FG_TEST_CAMERA", "alive", 1);
        }
        EXPECT_STREQ(getenv("FG_TEST_CAMERA"), "gone") << "a grabber goes before its library";
        ASSERT_TRUE(isLoaded(FG_PLUGIN_whole));
        pixels = image.toMono8();
        EXPECT_EQ(FNImageReference(image.serialize()).toMono8()(3, 2), 77);
    }
    EXPECT_TRUE(isLoaded(FG_PLUGIN_whole));
    EXPECT_EQ(pixels(3, 2), 77);
    pixels.getExclusive()[0] = 1;
    EXPECT_EQ(pixels(1, 0), 77);
    EXPECT_FALSE(isLoaded(FG_PLUGIN_whole)) << "the pixels are a copy now";
}

TEST(DllFrameGrabberFactory, EveryOperationReachesTheCamera) {
    using Range = Fn::LiveVideoSource::Range;
    const Component settings = componentOf<FG::DllFrameGrabberFactoryCacheDef>("");
    const FG::GrabberPair pair = FG::DllFrameGrabberFactory(FG_PLUGIN_whole).createFG2(settings, "north");
    Fn::LiveVideoSource& camera = *pair.first;
    FG::StillImageSource& still = *pair.second;
    EXPECT_EQ(camera.name(), "north");
    EXPECT_EQ(still.id(), "north");
    EXPECT_EQ(still.name(), "north");
    EXPECT_EQ(camera.contrast(), 11u);
    EXPECT_EQ(camera.exposure(), 21u);
    EXPECT_EQ(camera.saturation(), 31u);
    EXPECT_EQ(camera.hue(), 41u);
    EXPECT_EQ(camera.contrastRange(), (Range{12, 13}));
    EXPECT_EQ(camera.exposureRange(), (Range{22, 23}));
    EXPECT_EQ(camera.saturationRange(), (Range{32, 33}));
    EXPECT_EQ(camera.hueRange(), (Range{42, 43}));
    camera.setSaturation(34);
    EXPECT_EQ(camera.saturation(), 34u);
    EXPECT_EQ(thrownBy([&] { camera.setHue(1); }), "std::exception: no hue");
    still.setExposure(24);
    EXPECT_EQ(camera.exposure(), 24u);
    camera.setExposure(25);
    EXPECT_EQ(still.exposure(), 25u);
    EXPECT_EQ(still.exposureRange(), (Range{22, 23}));
    still.setGain(7);
    EXPECT_EQ(camera.gain(), 7u);
    EXPECT_EQ(still.gainRange(), (Range{1, 255}));
    camera.setVideoFormat(Fn::Package(99));
    EXPECT_EQ(camera.gain(), 99u);
    EXPECT_EQ(camera.configure(), 51);
    EXPECT_EQ(camera.videoFormat(), 52);
    EXPECT_EQ(camera.w(), 4u);
    EXPECT_EQ(camera.h(), 3u);

    const FNImageReference image = camera.get();
    EXPECT_EQ(image.w() * 10 + image.h(), 43u);
    EXPECT_FALSE(image.isColor());
    EXPECT_EQ(image.native(), FNImageReference::MONO8);
    EXPECT_EQ(image.toMono16()(0, 0), 99 * 256 + 128);
    EXPECT_EQ(image.toMonoFloat()(0, 0), 99 / 256.0f + 1 / 512.0f);
    EXPECT_EQ(image.toBgra32()(0, 0), Fn::Bgra32(99, 99, 99));
    EXPECT_EQ(image.toRgb48()(0, 0).g, 99 * 256 + 128);
    image.setSerializationStrategy(FNImageReference::COMPRESSED_PNG);
    EXPECT_EQ(image.getSerializationStrategy(), FNImageReference::COMPRESSED_PNG);
}

TEST(DllFrameGrabberFactory, RefusesLibrariesThatLackFunctions) {
    const Component settings = componentOf<FG::DllFrameGrabberFactoryCacheDef>("");
    const RecordedDialog dialog;
    EXPECT_EQ(thrownBy([] { FG::DllFrameGrabberFactory f("/no/such.so"); }),
              "FNESysError: Cannot load library: /no/such.so");
    EXPECT_EQ(thrownBy([] { FG::DllFrameGrabberFactory f(FG_PLUGIN_empty); }),
              "FNESysError: Symbol unknown: createFG");
    EXPECT_EQ(thrownBy([] { Fn::Dll().symbol("x"); }),
              "FNESysError: Symbolic name can not be resolved: x (library not loaded)");
    const FG::DllFrameGrabberFactory factory(FG_PLUGIN_video_only);
    EXPECT_EQ(factory.createFG(settings, "east")->grab().w(), 4u);
    EXPECT_EQ(thrownBy([&] { factory.createFG2(settings, "east"); }),
              "FNESysError: Symbol unknown: createFG2");
    EXPECT_EQ(thrownBy([&] { factory.createFG(settings, ""); }), "FNEBadArg: a camera without a name");
}

TEST(DllFrameGrabberFactoryCache, LoadsByKind) {
    FG::DllFrameGrabberFactoryCache cache =
        plugins(std::string("X.DllPaths = Basler UEye\nX.DllPaths.UEye = ") + FG_PLUGIN_video_only +
                "\nX.DllPaths.Basler = none.so\n");
    const Component settings = componentOf<FG::DllFrameGrabberFactoryCacheDef>("");
    EXPECT_EQ(cache.get("UEye").createFG(settings, "west")->id(), "west");
    EXPECT_TRUE(isLoaded(FG_PLUGIN_video_only)) << "kept by the cache";
    EXPECT_EQ(
        thrownBy([&] { cache.get("DSLR"); }),
        "FNEBadArg: DllFrameGrabberFactoryCache: could not locate Path for Dlls of type DSLR. Configured "
        "Types are: [Basler, UEye]");
}

} // namespace

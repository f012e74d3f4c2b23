#include "fn/deployment/app_config_db.h"
#include "fn/image_conversion.h"
#include "kx/facegeo.h"
#include "kx/full_frontal_creator.h"
#include "kx/token_face.h"
#include "support/settings.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <sstream>

namespace Kx {
namespace {

using namespace Fn::Deployment;

constexpr Fn::Bgra32 orange(200, 100, 50);
constexpr const char* tooMuchPadding = "Maximum padding ratio exceeded.";

/// A creator with these settings, "Key = value" each.
FullFrontal::Creator creator(const std::vector<std::string>& settings = {}) {
    std::string lines;
    for (const std::string& setting : settings) lines += "Crop." + setting + "\n";
    std::istringstream text(lines);
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB(text));
    return FullFrontal::Creator(Component(db, Property(type<FullFrontal::Creator>(), "Crop", "", "", false)));
}

/// Gray values that tell the column (the row) of a place: 50 for each pixel.
FNImage<unsigned short> ramp(bool ofRows, std::uint32_t w = 700, std::uint32_t h = 600) {
    FNImage<unsigned short> image(w, h);
    unsigned short* out = image.getExclusive();
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t x = 0; x < w; ++x)
            *out++ = static_cast<unsigned short>(50 * (ofRows ? y : x) + 25);
    return image;
}

/// Where the middle of a picture's pixel lies in the image that `cut` gets.
template <class Cut> FNPos sourceOf(FNGridPos pixel, Cut cut) {
    const auto read = [&](bool rows) { return static_cast<float>(cut(ramp(rows)).get(pixel)) / 50; };
    return {read(false), read(true)};
}

void expectNear(FNPos is, FNPos shall, float tolerance = 0.02f) {
    EXPECT_NEAR(is.x, shall.x, tolerance);
    EXPECT_NEAR(is.y, shall.y, tolerance);
}

Cmp::Face face(const FNImageReference& image, FNPos left, FNPos right) {
    return Cmp::Face(image, FacialFeatureLocation{left, 60, 7}, FacialFeatureLocation{right, 60, 8});
}
Cmp::Face face(FNPos left, FNPos right) {
    return face(FNImageReferenceFactory::create(ramp(false)), left, right);
}

FNPos turned(FNPos p, FNPos center, float angle) {
    const FNPos d = p - center;
    return center + FNPos(d.x * std::cos(angle) - d.y * std::sin(angle),
                          d.x * std::sin(angle) + d.y * std::cos(angle));
}

// ---- full frontal

TEST(FullFrontalCreator, CutsAroundTheHeadByTwoRatios) {
    const Cmp::Face portrait = face({250, 250}, {350, 250});
    const FNPos chin(300, 400), crown(300, 100), leftEar(200, 260), rightEar(410, 260);
    const auto corners = creator().getCropRect(portrait, chin, crown, leftEar, rightEar);
    expectNear(corners[0], {300 - 155.5f, 250 - 0.45f * 400});
    expectNear(corners[2], {300 + 155.5f, 250 + 0.55f * 400});

    const Cmp::Face picture = creator().extract(portrait, chin, crown, leftEar, rightEar);
    EXPECT_EQ(picture.image().w(), 311u);
    EXPECT_EQ(picture.image().h(), 400u);
    expectNear(picture.leftEye(), {105.5f, 180});
    expectNear(picture.rightEye(), {205.5f, 180});
    EXPECT_EQ(picture.leftEyeLocation().confidence, 7);
    expectNear(sourceOf({100, 50},
                        [&](const auto& image) {
                            FNPos left(250, 250), right(350, 250);
                            Img::Affine::Mapping toPicture;
                            return creator().crop(image, left, right, 0.75f, 0.55f, chin, crown, leftEar,
                                                  rightEar, toPicture);
                        }),
               corners[0] + FNPos(100.5f, 50.5f), 0.05f);

    const auto byWidth = creator({"ImageWidthStrategy = HeadWidthToImageWidthRatio",
                                  "ImageWidthStrategy.HeadWidthToImageWidthRatio = 0.5"})
                             .extract(portrait, 0.6f, 0.5f, chin, crown, leftEar, rightEar);
    EXPECT_EQ(byWidth.image().w(), 420u);
    EXPECT_EQ(byWidth.image().h(), 500u);
    expectNear(byWidth.leftEye(), {160, 250});

    const auto scaled = creator({"Scaling = Enabled", "Scaling.Enabled.TargetWidth = 200"})
                            .extract(portrait, chin, crown, leftEar, rightEar);
    EXPECT_EQ(scaled.image().w(), 200u);
    EXPECT_EQ(scaled.image().h(), 257u); // 200 * 400 / 311
    expectNear(scaled.leftEye(), {105.5f * 200 / 311, 180 * 257.0f / 400}, 0.1f);
}

TEST(FullFrontalCreator, EstimatesTheHeadFromTheEyes) {
    const float length = 100 * (1.669f + 1.766f), height = std::trunc(length / 0.75f + 0.5f);
    const Cmp::Face level = creator().extract(face({250, 250}, {350, 250}));
    EXPECT_EQ(level.image().h(), height);
    EXPECT_EQ(level.image().w(), std::trunc(height / 1.285714f + 0.5f));

    for (const float angle : {0.3f, -0.3f}) {
        const FNPos middle(300, 250), left = turned({250, 250}, middle, angle),
                                      right = turned({350, 250}, middle, angle);
        const Cmp::Face picture = creator().extract(face(left, right));
        EXPECT_NEAR(picture.leftEye().y, picture.rightEye().y, 0.01);
        EXPECT_NEAR(picture.leftEye().y, 0.45 * picture.image().h(), 0.1);
        EXPECT_NEAR((picture.leftEye().x + picture.rightEye().x) / 2, picture.image().w() / 2.0, 0.01);
        EXPECT_NEAR(picture.eyeDistance(), 100, 0.01);
    }
}

TEST(FullFrontalCreator, CarriesEveryAnnotationOver) {
    using Feature = Cmp::Face::FeatureLocation;
    const FNPos middle(300, 250);
    const auto feature = [](FNPos pos) { return Feature(new FacialFeatureLocation{pos, 60, 3}); };
    const auto picture =
        creator({"Scaling = Enabled"})
            .extract(Cmp::Face(FNImageReferenceFactory::create(ramp(false)),
                               Cmp::Face::FaceLocation(new FaceFinder::Location{middle, 120, 5, 0.2f}), {},
                               {}, feature(middle), feature({290, 300})));
    EXPECT_FALSE(picture.hasEyeFinderLeftEyeInfo());
    const float scale = 460 / std::trunc(std::trunc(120 * 3.435f / 0.75f + 0.5f) / 1.285714f + 0.5f);
    EXPECT_NEAR(picture.faceFinderLocation().rotationAngle, 0, 0.001);
    EXPECT_NEAR(picture.faceFinderLocation().width, 120 * scale, 0.5);
    EXPECT_EQ(picture.faceFinderLocation().confidence, 5);
    expectNear(picture.faceFinderLocation().pos, {230, 0.45f * picture.image().h()}, 0.1f);
    expectNear(picture.nasion(), picture.faceFinderLocation().pos, 0.1f);
    expectNear(picture.mouth() - picture.nasion(), turned(FNPos(-10, 50) * scale, {}, -0.2f), 0.3f);
    EXPECT_EQ(picture.mouthLocation().confidence, 3);
    ASSERT_TRUE(picture.hasNasionInfo());
    EXPECT_EQ(picture.nasionLocation().confidence, 3);
    EXPECT_NEAR(picture.nasionLocation().size, 60 * scale, 0.3);
}

TEST(FaceGeometry, EstimatesTheOutlineAlongAndAcrossTheEyes) {
    const FaceGeometry geometry(settingsOf<FaceGeometry>());
    // Eyes 100 apart on a slope of 4 to 3, either way: sides and ends of the head lie to the same sides.
    for (const auto& [left, right] :
         {std::pair{FNPos(100, 100), FNPos(160, 180)}, {FNPos(100, 180), FNPos(160, 100)}}) {
        const FaceGeometry::Points points = geometry.completed({left, right, {}, {}, {}, {}});
        expectNear(points.leftEar, {130 - 66, 140 - 88}, 1e-3f);
        expectNear(points.rightEar, {130 + 66, 140 + 88}, 1e-3f);
        expectNear(points.crown, {130 - 133.52f, 140 - 100.14f}, 1e-3f);
        expectNear(points.chin, {130 + 141.28f, 140 + 105.96f}, 1e-3f);
    }
    const FaceGeometry::Points level = geometry.completed({{100, 100}, {200, 100}, {7, 8}, {}, {}, {}});
    expectNear(level.chin, {7, 8}, 0);
    expectNear(level.crown, {150, 100 - 166.9f}, 1e-3f);
    expectNear(level.rightEar, {260, 100}, 1e-3f);
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  geometry.completed({{100, 100}, {100, 200}, {}, {}, {}, {}});
              }),
              "Invalid eye locations set. Both x values are the same.");
}

TEST(FullFrontalCreator, RefusesWhatTheStandardForbids) {
    const Cmp::Face level = face({250, 250}, {350, 250});
    const auto thrown = [&](const FullFrontal::Creator& c, const Cmp::Face& portrait, float length = 0.75f,
                            float position = 0.55f) {
        return thrownText<FNEBadArg>([&] { c.extract(portrait, length, position); });
    };
    const char
        *badPosition = "Configured target position of face is out of full frontal image specification",
        *badLength =
            "Configured ratio of face length to image height is out of full frontal image specification";
    EXPECT_EQ(thrown(creator(), level, 0.95f, 0.9f), badPosition);
    EXPECT_EQ(thrown(creator(), level, 0.95f, 0.7f), badLength);
    EXPECT_EQ(thrown(creator({"EnableISOTestForGeometricParameter = false"}), level, 0.95f, 0.9f),
              "nothing thrown");

    const auto upright = creator({"AllowRotation = false"});
    const auto leaning = [](float degrees) {
        return face({250, 250}, turned({350, 250}, {250, 250}, degrees * 3.14159265f / 180));
    };
    for (const float degrees : {4.99f, -4.99f}) {
        const auto corners = upright.getCropRect(leaning(degrees));
        EXPECT_EQ(corners[0].y, corners[1].y);
        EXPECT_EQ(corners[0].x, corners[3].x);
        EXPECT_EQ(thrown(upright, leaning(degrees)), "nothing thrown");
    }
    EXPECT_EQ(thrown(upright, leaning(5.01f)), "Face does not fit to rotation limits.");
    EXPECT_EQ(thrown(upright, leaning(-5.01f)), "Face does not fit to rotation limits.");

    EXPECT_EQ(thrown(creator(), face({250, 250}, {250, 250})),
              "Failed to extract full frontal image without valid annotation.");
    const Cmp::Face upended = face({250, 250}, {250, 350});
    EXPECT_EQ(thrown(creator(), upended), "Invalid eye locations set. Both x values are the same.");
    EXPECT_EQ(creator().extract(upended, {100, 300}, {400, 300}, {250, 190}, {250, 400}).image().h(), 400u);
    EXPECT_EQ(thrownText<FNEBadFunCall>([&] { creator().extract(Cmp::Face(level.image())); }),
              "There is no FaceFinder information for this face!");
}

TEST(FullFrontalCreator, PadsWithTheConfiguredColor) {
    const std::vector<std::string> color = {"PaddingColorRed = 200", "PaddingColorGreen = 100",
                                            "PaddingColorBlue = 50"};
    const auto corner = [&]<class T>(T pixel) {
        FNImage<T> image(400, 400);
        image.fill(pixel);
        const Cmp::Face portrait = face(FNImageReferenceFactory::create(image), {60, 60}, {130, 60});
        const FNImageReference picture = creator(color).extract(portrait).image();
        EXPECT_EQ(picture.native(), portrait.image().native());
        EXPECT_EQ(picture.to<T>()(150, 250), pixel) << "inside";
        return picture.to<T>()(0, 0);
    };
    constexpr int gray = 76 * 200 + 150 * 100 + 29 * 50;
    EXPECT_EQ(corner(Fn::Bgra32(1, 2, 3)), orange);
    EXPECT_EQ(corner(static_cast<unsigned char>(3)), gray >> 8);
    EXPECT_EQ(corner(static_cast<unsigned short>(3000)), gray);
    EXPECT_NEAR(corner(0.25f), (0.299 * 200 + 0.587 * 100 + 0.114 * 50) / 256, 1e-6);

    const auto limited = [&](const char* ratio, FNPos left, FNPos right) {
        return thrownText<FNEBadArg>(
            [&] { creator({std::string("PaddingRatio = ") + ratio}).extract(face(left, right)); });
    };
    EXPECT_EQ(limited("0", {250, 250}, {350, 250}), "nothing thrown");
    EXPECT_EQ(limited("0", {110, 250}, {210, 250}), tooMuchPadding); // 356 wide: 18 columns outside
    EXPECT_EQ(limited("0.06", {110, 250}, {210, 250}), "nothing thrown");
    EXPECT_EQ(limited("0.99", {-1000, 250}, {-900, 250}), tooMuchPadding);
    EXPECT_EQ(limited("1", {-1000, 250}, {-900, 250}), "nothing thrown");
    EXPECT_EQ(thrownText<FNEBadArg>([] { creator({"PaddingColorGreen = 256"}); }),
              "Crop.PaddingColorGreen: 256 is no value of a color channel, 0 to 255");
}

// ---- token images

TEST(TokenFace, PutsTheEyesWhereTheStandardHasThem) {
    const auto expectGeometry = [](const Cmp::Face& token, unsigned w, unsigned h, FNPos left, FNPos right) {
        EXPECT_EQ(token.image().w(), w);
        EXPECT_EQ(token.image().h(), h);
        expectNear(token.leftEye(), left, 0);
        expectNear(token.rightEye(), right, 0);
        EXPECT_EQ(token.leftEyeLocation().confidence, 7);
        EXPECT_FALSE(token.hasFaceFinderInfo());
    };
    expectGeometry(TokenFace::produceImage(face({250, 250}, {310, 250}), 1, orange), 240, 320,
                   {90.5f, 145.5f}, {150.5f, 145.5f});
    const Cmp::Face large = face({250, 250}, {350.3f, 250});
    expectGeometry(TokenFace::produceImage(large, 1, orange), 401, 535,
                   {201 - 401 / 8.0f, 0.453125f * 535 + 0.5f}, {201 + 401 / 8.0f, 0.453125f * 535 + 0.5f});
    expectGeometry(TokenFace::produceMinimalImage(large, 1, orange), 240, 320, {90.5f, 144.5f},
                   {149.5f, 144.5f});

    // The face finder's location stands in for eyes.
    const Cmp::Face found = TokenFace::produceImage(
        Cmp::Face(large.image(), FaceFinder::Location{{300, 250}, 60, 5, 0.1f}), 1, orange);
    EXPECT_FALSE(found.hasEyeFinderLeftEyeInfo());
    expectNear(found.faceFinderLocation().pos, {120.5f, 145.5f}, 0);
    EXPECT_EQ(found.faceFinderLocation().width, 60);
    EXPECT_EQ(
        thrownText<FNEBadFunCall>([&] { TokenFace::produceImage(Cmp::Face(large.image()), 1, orange); }),
        "There is no FaceFinder information for this face!");
}

TEST(TokenFace, TakesItsPixelsFromTheirPlaces) {
    const FNPos middle(330, 290);
    for (const float angle : {0.0f, 0.4f, -2.0f})
        for (const float distance : {60.0f, 80.0f}) {
            const FNPos left = turned(middle - FNPos(distance / 2, 0), middle, angle),
                        right = turned(middle + FNPos(distance / 2, 0), middle, angle);
            const float side = 4 * distance, eyeRow = 29 * distance / 12;
            expectNear(sourceOf({70, 40},
                                [&](const auto& image) {
                                    return TokenFace::produceImage(image, left, right, 1,
                                                                   static_cast<unsigned short>(0));
                                }),
                       turned(middle - FNPos(side / 2, eyeRow) + FNPos(70.5f, 40.5f), middle, angle), 0.05f);
            const float step = distance / 60;
            expectNear(sourceOf({70, 40},
                                [&](const auto& image) {
                                    return TokenFace::produceMinimalImage(image, left, right, 1,
                                                                          static_cast<unsigned short>(0));
                                }),
                       turned(middle + FNPos(70.5f - 120, 40.5f - 145) * step, middle, angle), 0.05f);
        }
}

TEST(TokenFace, PadsAsIfTheImageLayOnACanvas) {
    const auto image = Fn::convertImage<Fn::Bgra32>(ramp(true, 90, 70));
    FNImage<Fn::Bgra32> canvas(590, 570);
    canvas.fill(orange);
    for (std::uint32_t y = 0; y < 70; ++y)
        std::copy_n(image.row(y), 90, canvas.getExclusive() + (y + 250) * 590 + 250);
    const FNPos margin(250, 250);
    for (const auto& [left, right] : std::vector<std::pair<FNPos, FNPos>>{
             {{20, 30}, {65, 35}}, {{-20, 30}, {10, 20}}, {{60, 80}, {30, 5}}, {{85, 30}, {140, 30}}}) {
        const auto token = TokenFace::produceImage(image, left, right, 1, orange),
                   onCanvas = TokenFace::produceImage(canvas, left + margin, right + margin, 1, orange);
        ASSERT_EQ(token.size(), onCanvas.size());
        int worst = 0;
        for (std::size_t i = 0; i < token.size(); ++i)
            worst = std::max(worst, std::abs(token.data()[i].g - onCanvas.data()[i].g));
        EXPECT_LE(worst, 1) << "eyes at " << left.x << ", " << left.y; // rounding of larger coordinates
    }
}

TEST(TokenFace, KeepsGrayGrayAndPadsInItsPixels) {
    const auto corner = []<class T>(T pixel) {
        FNImage<T> image(100, 100);
        image.fill(pixel);
        return TokenFace::produceMinimalImage(
                   face(FNImageReferenceFactory::create(image), {30, 30}, {70, 30}), 1, {200, 100, 50, 0})
            .image();
    };
    constexpr int gray = 76 * 200 + 150 * 100 + 29 * 50 + 128;
    for (const auto& picture :
         {corner(static_cast<unsigned char>(7)), corner(static_cast<unsigned short>(7))}) {
        EXPECT_EQ(picture.native(), FNImageReference::MONO16);
        EXPECT_EQ(picture.toMono16()(0, 0), gray);
    }
    EXPECT_NEAR(corner(0.5f).toMonoFloat()(0, 0), 124.2 / 256 + 1 / 512.0, 1e-6);
    EXPECT_EQ(corner(0.5f).native(), FNImageReference::MONO_FLOAT);
    for (const auto& picture : {corner(Fn::Bgra32(1, 2, 3)), corner(Fn::Rgb48(1, 2, 3))}) {
        EXPECT_EQ(picture.native(), FNImageReference::BGRA32);
        EXPECT_EQ(picture.toBgra32()(0, 0), orange);
    }
    FNImage<unsigned char> bytes(100, 100);
    bytes.fill(77);
    const auto token = TokenFace::produceImage<unsigned char>(bytes, {30, 30}, {70, 30}, 1, 99);
    EXPECT_EQ(token(0, 0), 99);
    EXPECT_EQ(token(80, 100), 77);
}

TEST(TokenFace, LimitsItsPadding) {
    using Produce = Cmp::Face(const Cmp::Face&, float, const Fn::Bgra32&);
    const auto padded = [](Produce& produce, float ratio, float distance) {
        const FNImageReference image = FNImageReferenceFactory::create(ramp(false));
        // A tenth of the box lies to the left of the image.
        return thrownText<FNEBadArg>([&] {
            produce(face(image, {1.1f * distance, 250}, {2.1f * distance, 250}), ratio, orange);
        });
    };
    for (const float distance : {60.0f, 80.0f})
        for (Produce* produce :
             std::initializer_list<Produce*>{TokenFace::produceImage, TokenFace::produceMinimalImage}) {
            EXPECT_EQ(padded(*produce, 0.11f, distance), "nothing thrown") << distance;
            EXPECT_EQ(padded(*produce, 0.09f, distance), tooMuchPadding) << distance;
        }
}

TEST(TokenFace, ScalesTheSizesOfEyes) {
    const Cmp::Face portrait = face({250, 250}, {330, 250});
    EXPECT_NEAR(TokenFace::produceImage(portrait, 1, orange).leftEyeLocation().size, 60, 1e-3);
    EXPECT_NEAR(TokenFace::produceMinimalImage(portrait, 1, orange).rightEyeLocation().size, 45, 1e-3);
}

TEST(TokenFace, AnImageWhoseEyesCoincideStaysAsItIsAndHasTheEyesOfAToken) {
    const Cmp::Face portrait = face({250, 250}, {250, 250}),
                    found(portrait.image(), FaceFinder::Location{{250, 250}, 0, 0.7f, 0.1f});
    const auto w = static_cast<float>(portrait.image().w()), h = static_cast<float>(portrait.image().h());
    const FNPos middle(w / 2 + 0.5f, 0.453125f * h + 0.5f), aside(w / 8, 0);
    using Produce = Cmp::Face(const Cmp::Face&, float, const Fn::Bgra32&);
    const struct {
        Produce* produce;
        FNPos left, right, middle;
    } kinds[] = {{TokenFace::produceImage, middle - aside, middle + aside, middle},
                 {TokenFace::produceMinimalImage, {90.5f, 144.5f}, {149.5f, 144.5f}, {120.5f, 144.5f}}};
    for (const auto& kind : kinds) {
        const Cmp::Face token = kind.produce(portrait, 0, orange);
        EXPECT_EQ(token.image().toMono16().data(), portrait.image().toMono16().data());
        expectNear(token.leftEye(), kind.left, 0);
        expectNear(token.rightEye(), kind.right, 0);
        EXPECT_EQ(token.leftEyeLocation().confidence, portrait.leftEyeLocation().confidence);
        EXPECT_EQ(token.rightEyeLocation().size, portrait.rightEyeLocation().size);
        EXPECT_FALSE(token.hasFaceFinderInfo());
        const FaceFinder::Location location = kind.produce(found, 0, orange).faceFinderLocation();
        expectNear(location.pos, kind.middle, 0);
        EXPECT_EQ(location.confidence, 0.7f);
    }
}

TEST(TokenFace, RefusesEyesThatAreNoPlaces) {
    const float nan = std::nanf(""), infinity = std::numeric_limits<float>::infinity();
    const auto refused = [](FNPos left, FNPos right) {
        const Cmp::Face portrait = face(left, right);
        for (const auto& text :
             {thrownText<FNEBadArg>([&] { TokenFace::produceImage(portrait, 0.5f, orange); }),
              thrownText<FNEBadArg>([&] { creator().extract(portrait); })})
            EXPECT_TRUE(text.starts_with("Failed to cut out a face: ")) << text;
    };
    for (const float bad : {nan, infinity, -infinity, 1e30f}) {
        refused({bad, 250}, {350, 250});
        refused({250, 250}, {350, bad});
    }
    refused({0, 250}, {30000, 250});     // a side of more than 65535
    refused({0, 250}, {10000, 250});     // too many pixels
    refused({250, 250}, {250.01f, 250}); // none
}

} // namespace
} // namespace Kx

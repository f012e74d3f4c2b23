// What is measured in portraits, what is judged of it, and how portraits are cut: of drawn people, and of one
// of them with something painted over each time.

#include "golden_pictures.h"
#include "orbek/feature_test.h"
#include "orbek/full_frontal_creator.h"
#include "orbek/full_frontal_test.h"
#include "orbek/image_operations.h"
#include "orbek/lense_distortion_corrector.h"
#include "orbek/token_face.h"
#include "orbek/token_face_creator.h"

#include <algorithm>

namespace {

using namespace Orbek;
using ISO_19794_5::FullFrontal::Boundaries;
using ISO_19794_5::FullFrontal::Compliance;
using Portrait::Characteristics;

template <class Of> struct Measure {
    const char* name;
    float (Of::*value)() const;
};

constexpr Measure<Characteristics> measures[] = {
    {"eyeDistance", &Characteristics::eyeDistance},
    {"poseAngleRoll", &Characteristics::poseAngleRoll},
    {"deviationFromFrontalPose", &Characteristics::deviationFromFrontalPose},
    {"chin", &Characteristics::chin},
    {"crown", &Characteristics::crown},
    {"ear0", &Characteristics::ear0},
    {"ear1", &Characteristics::ear1},
    {"widthOfHead", &Characteristics::widthOfHead},
    {"lengthOfHead", &Characteristics::lengthOfHead},
    {"eye0Open", &Characteristics::eye0Open},
    {"eye1Open", &Characteristics::eye1Open},
    {"eye0GazeFrontal", &Characteristics::eye0GazeFrontal},
    {"eye1GazeFrontal", &Characteristics::eye1GazeFrontal},
    {"eye0Tinted", &Characteristics::eye0Tinted},
    {"eye1Tinted", &Characteristics::eye1Tinted},
    {"glasses", &Characteristics::glasses},
    {"mouthClosed", &Characteristics::mouthClosed},
    {"exposure", &Characteristics::exposure},
    {"hotSpots", &Characteristics::hotSpots},
    {"backgroundUniformity", &Characteristics::backgroundUniformity},
    {"deviationFromUniformLighting", &Characteristics::deviationFromUniformLighting},
    {"sharpness", &Characteristics::sharpness},
    {"isMale", &Characteristics::isMale},
    {"age", &Characteristics::age},
};
constexpr Measure<Characteristics> colourMeasures[] = {
    {"eye0Red", &Characteristics::eye0Red},
    {"eye1Red", &Characteristics::eye1Red},
    {"naturalSkinColour", &Characteristics::naturalSkinColour},
};

/// A digit for each, in this order.
constexpr bool (Compliance::*judgements[])() const = {
    &Compliance::isCompliant,
    &Compliance::isBestPractice,
    &Compliance::onlyOneFaceVisible,
    &Compliance::goodVerticalFacePosition,
    &Compliance::horizontallyCenteredFace,
    &Compliance::widthOfHead,
    &Compliance::lengthOfHead,
    &Compliance::widthOfHeadBestPractice,
    &Compliance::lengthOfHeadBestPractice,
    &Compliance::resolution,
    &Compliance::resolutionBestPractice,
    &Compliance::imageWidthToHeightBestPractice,
    &Compliance::goodExposure,
    &Compliance::goodGrayScaleProfile,
    &Compliance::hasNaturalSkinColour,
    &Compliance::noHotSpots,
    &Compliance::isBackgroundUniformBestPractice,
    &Compliance::isFrontal,
    &Compliance::isFrontalBestPractice,
    &Compliance::isLightingUniform,
    &Compliance::eyesOpenBestPractice,
    &Compliance::eyesGazeFrontalBestPractice,
    &Compliance::eyesNotRedBestPractice,
    &Compliance::noTintedGlasses,
    &Compliance::isSharp,
    &Compliance::mouthClosedBestPractice,
};

struct Placed {
    Image image;
    Eyes::Location eyes;
};

Placed placed(const Configuration& configuration, const Image& image) {
    const Face::Finder faces(configuration);
    const auto found = faces.find(image, 0.05f, 0.4f, 0, 0, static_cast<int>(image->width()),
                                  static_cast<int>(image->height()));
    return {image, Eyes::Finder(configuration).find(image, found.front()).front()};
}

bool within(int x, int y, Position middle, double radius) {
    const double dx = x + 0.5 - middle.x, dy = y + 0.5 - middle.y;
    return dx * dx + dy * dy <= radius * radius;
}

using Paint = std::function<void(int x, int y, Rgb& pixel)>;

/// What is painted over a person with eyes at these places, by name.
std::vector<std::pair<std::string, Paint>> paints(const Eyes::Location& eyes) {
    const Position e0 = eyes.first, e1 = eyes.second, middle{(e0.x + e1.x) / 2, (e0.y + e1.y) / 2};
    const float d = e1.x - e0.x;
    const auto mixed = [](unsigned char a, int b, double t) {
        return static_cast<unsigned char>(a * (1 - t) + b * t);
    };
    const auto shaded = [=](Rgb& pixel, double factor) {
        for (unsigned char* const channel : {&pixel.blue, &pixel.green, &pixel.red})
            *channel = static_cast<unsigned char>(std::min(255.0, *channel * factor));
    };
    // Where the head is not, roughly.
    const auto behind = [=](int x, int y) {
        const double dx = (x - middle.x) / (1.3 * d), dy = (y - middle.y - 0.2 * d) / (2.2 * d);
        return dx * dx + dy * dy > 1 && y < middle.y + 1.5 * d;
    };
    const auto inFrame = [=](int x, int y) {
        for (const Position eye : {e0, e1})
            if (within(x, y, eye, 0.4 * d) && !within(x, y, eye, 0.32 * d)) return true;
        return std::abs(y - middle.y) < 0.05 * d && std::abs(x - middle.x) < 0.1 * d;
    };
    return {
        {"glasses",
         [=](int x, int y, Rgb& pixel) {
             if (inFrame(x, y)) pixel = {20, 20, 20, 255};
         }},
        {"dark glasses",
         [=](int x, int y, Rgb& pixel) {
             if (inFrame(x, y))
                 pixel = {20, 20, 20, 255};
             else if (within(x, y, e0, 0.32 * d) || within(x, y, e1, 0.32 * d))
                 shaded(pixel, 0.4);
         }},
        {"one dark glass",
         [=](int x, int y, Rgb& pixel) {
             if (within(x, y, e1, 0.4 * d)) shaded(pixel, 0.5);
         }},
        {"red eyes",
         [=](int x, int y, Rgb& pixel) {
             if (within(x, y, e0, 0.06 * d)) pixel = {40, 30, 220, 255};
             if (within(x, y, e1, 0.1 * d)) pixel = {60, 50, 200, 255};
         }},
        {"glare",
         [=](int x, int y, Rgb& pixel) {
             if (within(x, y, {middle.x, middle.y - 0.5f * d}, 0.12 * d)) pixel = {252, 253, 254, 255};
             if (within(x, y, {e0.x, middle.y + 0.6f * d}, 0.08 * d)) pixel = {255, 255, 255, 255};
         }},
        {"light from a side",
         [=](int x, int, Rgb& pixel) { shaded(pixel, 0.35 + 0.65 * x / (2 * middle.x)); }},
        {"dark", [=](int, int, Rgb& pixel) { shaded(pixel, 0.3); }},
        {"bright", [=](int, int, Rgb& pixel) { shaded(pixel, 1.7); }},
        {"green", [=](int, int, Rgb& pixel) { pixel.green = mixed(pixel.green, 255, 0.5); }},
        {"slope behind",
         [=](int x, int y, Rgb& pixel) {
             if (behind(x, y))
                 pixel = {static_cast<unsigned char>(40 + y / 3), static_cast<unsigned char>(60 + x / 3), 90,
                          255};
         }},
        {"post behind",
         [=](int x, int y, Rgb& pixel) {
             if (behind(x, y) && x > middle.x + 1.55 * d && x < middle.x + 1.85 * d)
                 pixel = {30, 60, 90, 255};
         }},
        {"stripes behind",
         [=](int x, int y, Rgb& pixel) {
             if (behind(x, y)) pixel = x / 12 % 2 ? Rgb{200, 190, 180, 255} : Rgb{120, 130, 140, 255};
         }},
        {"islands behind",
         [=](int x, int y, Rgb& pixel) {
             if (behind(x, y) && x % 60 < 6 && y % 60 < 6) pixel = {60, 60, 60, 255};
         }},
        {"coarse",
         [=](int x, int y, Rgb& pixel) {
             if ((x + y) % 2) shaded(pixel, 0.8);
         }},
    };
}

void tellPortrait(GoldenFacts& facts, const std::string& name, const Characteristics& portrait,
                  const Configuration& configuration) {
    for (const auto& measure : measures)
        facts.number(name + "." + measure.name, (portrait.*measure.value)(), 1e-3);
    facts.number(name + ".grayScaleDensity", portrait.grayScaleDensity());
    facts.number(name + ".numberOfFaces", portrait.numberOfFaces());
    const auto scores = portrait.ethnicity();
    for (std::size_t i = 0; i < scores.size(); ++i)
        facts.number(name + ".ethnicity" + std::to_string(i), scores[i], 1e-3);
    const Box head = earToEarChinCrownSurroundingBox(portrait);
    std::ostringstream box;
    box << head.x0 << " " << head.y0 << " " << head.x1 << " " << head.y1;
    facts.text(name + ".head", box.str());
    const auto features = Portrait::Feature::Test(configuration).assess(portrait);
    std::ostringstream person;
    person << features.wearsGlasses() << static_cast<int>(features.gender())
           << static_cast<int>(features.ethnicity());
    facts.text(name + ".person", person.str());
    facts.number(name + ".person.age", features.age(), 1e-3);
    if (!portrait.isColor()) return;
    for (const auto& measure : colourMeasures)
        facts.number(name + "." + measure.name, (portrait.*measure.value)(), 1e-3);
    const auto compliance = ISO_19794_5::FullFrontal::Test(configuration).assess(portrait);
    std::string verdicts;
    for (const auto judgement : judgements) verdicts += (compliance.*judgement)() ? '1' : '0';
    facts.text(name + ".verdicts", verdicts);
}

TEST(PortraitGoldenWithModels, MeasuresAndJudgesAsItDid) {
    GoldenFacts facts("portraits");
    const Configuration configuration = configured();
    const Portrait::Analyzer analyzer(configuration);
    for (const std::string person : drawnPeople) {
        const Placed at = placed(configuration, drawnPerson(person));
        tellPortrait(facts, person, analyzer.analyze({at.image, at.eyes}), configuration);
    }
    const Image group = groupPicture();
    tellPortrait(facts, "group", analyzer.analyze({group, placed(configuration, group).eyes}), configuration);
    const Placed plain = placed(configuration, drawnPerson("plain"));
    for (const auto& [name, paint] : paints(plain.eyes)) {
        auto* const painting = new Painting(plain.image);
        const Image image(painting);
        painting->paint(paint);
        tellPortrait(facts, name, analyzer.analyze({image, plain.eyes}), configuration);
    }
}

/// Gray pixels of an application.
class GrayImage final : public ImageBody {
public:
    explicit GrayImage(const Image& image) : image_(image) {}
    bool isColor() const override { return false; }
    unsigned int width() const override { return image_->width(); }
    unsigned int height() const override { return image_->height(); }
    const unsigned char* grayScaleRepresentation() const override {
        return image_->grayScaleRepresentation();
    }
    const Rgb* colorRepresentation() const override { return image_->colorRepresentation(); }
    std::string name() const override { return "gray"; }

private:
    Image image_;
};

TEST(PortraitGoldenWithModels, MeasuresGrayPicturesAsItDid) {
    GoldenFacts facts("gray");
    const Configuration configuration = configured();
    const Placed plain = placed(configuration, drawnPerson("plain"));
    const std::pair<Image, Eyes::Location> gray(Image(new GrayImage(plain.image)), plain.eyes);
    const Portrait::Analyzer analyzer(configuration);
    EXPECT_FALSE(analyzer.analyze(gray).isColor());
    EXPECT_TRUE(analyzer.analyzeColor(gray).isColor());
    tellPortrait(facts, "gray", analyzer.analyze(gray), configuration);
    tellPortrait(facts, "as colours", analyzer.analyzeColor(gray), configuration);
}

TEST(PortraitGoldenWithModels, HasTheLimitsThatItHad) {
    GoldenFacts facts("limits");
    const auto limits = ISO_19794_5::FullFrontal::Test(configured()).boundaries();
    constexpr Measure<Boundaries> all[] = {
        {"leftBoundCenteredFace", &Boundaries::leftBoundCenteredFace},
        {"rightBoundCenteredFace", &Boundaries::rightBoundCenteredFace},
        {"upperBoundVerticalPosition", &Boundaries::upperBoundVerticalPosition},
        {"lowerBoundVerticalPosition", &Boundaries::lowerBoundVerticalPosition},
        {"minWidthOfHeadRatio", &Boundaries::minWidthOfHeadRatio},
        {"minLengthOfHeadRatio", &Boundaries::minLengthOfHeadRatio},
        {"maxWidthOfHeadRatio", &Boundaries::maxWidthOfHeadRatio},
        {"maxLengthOfHeadRatio", &Boundaries::maxLengthOfHeadRatio},
        {"minHeadWidth", &Boundaries::minHeadWidth},
        {"minWidthOfHeadRatioBestPractice", &Boundaries::minWidthOfHeadRatioBestPractice},
        {"minLengthOfHeadRatioBestPractice", &Boundaries::minLengthOfHeadRatioBestPractice},
        {"maxWidthOfHeadRatioBestPractice", &Boundaries::maxWidthOfHeadRatioBestPractice},
        {"maxLengthOfHeadRatioBestPractice", &Boundaries::maxLengthOfHeadRatioBestPractice},
        {"minHeadWidthBestPractice", &Boundaries::minHeadWidthBestPractice},
        {"minWidthToHeightRatioBestPractice", &Boundaries::minWidthToHeightRatioBestPractice},
        {"maxWidthToHeightRatioBestPractice", &Boundaries::maxWidthToHeightRatioBestPractice},
        {"lowExposerThreshold", &Boundaries::lowExposerThreshold},
        {"highExposerThreshold", &Boundaries::highExposerThreshold},
        {"minimalGrayScaleBounding", &Boundaries::minimalGrayScaleBounding},
        {"minimalSkinColourRatio", &Boundaries::minimalSkinColourRatio},
        {"maxFrontalPoseDeviation", &Boundaries::maxFrontalPoseDeviation},
        {"poseMaxRotation", &Boundaries::poseMaxRotation},
        {"maxFrontalPoseDeviationBestPractice", &Boundaries::maxFrontalPoseDeviationBestPractice},
        {"poseMaxRotationBestPractice", &Boundaries::poseMaxRotationBestPractice},
        {"maxDeviationFromLighting", &Boundaries::maxDeviationFromLighting},
        {"eyesOpenThreshold", &Boundaries::eyesOpenThreshold},
        {"eyesGazeFrontalThreshold", &Boundaries::eyesGazeFrontalThreshold},
        {"eyesNotRedThreshold", &Boundaries::eyesNotRedThreshold},
        {"minimalSharpness", &Boundaries::minimalSharpness},
        {"closedMouthThreshold", &Boundaries::closedMouthThreshold},
        {"hotSpotsThreshold", &Boundaries::hotSpotsThreshold},
        {"wearsGlassesThreshold", &Boundaries::wearsGlassesThreshold},
        {"tintedGlassesThreshold", &Boundaries::tintedGlassesThreshold},
    };
    for (const auto& limit : all) facts.number(limit.name, (limits.*limit.value)(), 1e-6);
}

/// Size, mean colours, and a sum that the place of each pixel goes into; the places of the eyes.
void tellPicture(GoldenFacts& facts, const std::string& name, const Image& image) {
    facts.number(name + ".width", image->width());
    facts.number(name + ".height", image->height());
    const Rgb* pixel = image->colorRepresentation();
    double sums[3] = {}, placed = 0;
    const std::size_t size = std::size_t{image->width()} * image->height();
    for (std::size_t i = 0; i < size; ++i, ++pixel) {
        sums[0] += pixel->blue;
        sums[1] += pixel->green;
        sums[2] += pixel->red;
        placed += static_cast<double>(i % 1009) / 1009 * (pixel->blue + 2 * pixel->green + 4 * pixel->red);
    }
    const auto n = static_cast<double>(size);
    facts.number(name + ".blue", sums[0] / n);
    facts.number(name + ".green", sums[1] / n);
    facts.number(name + ".red", sums[2] / n);
    facts.number(name + ".places", placed / n);
}

TEST(PortraitGoldenWithModels, CutsAndTurnsPicturesAsItDid) {
    GoldenFacts facts("pictures");
    const Configuration configuration = configured();
    const Configuration scaled =
        configured("ORBEK.CropFullFrontal.Scaling = Enabled\n"
                   "ORBEK.CropFullFrontal.ImageWidthStrategy = HeadWidthToImageWidthRatio\n"
                   "ORBEK.CropFullFrontal.PaddingColorRed = 10\n"
                   "ORBEK.CropTokenImage.PaddingColorGreen = 20\n");
    const auto tellCut = [&](const std::string& name, const std::pair<Image, Eyes::Location>& cut) {
        tellPicture(facts, name, cut.first);
        facts.number(name + ".x0", cut.second.first.x);
        facts.number(name + ".y0", cut.second.first.y);
        facts.number(name + ".x1", cut.second.second.x);
        facts.number(name + ".y1", cut.second.second.y);
    };
    for (const std::string person : drawnPeople) {
        const Placed at = placed(configuration, drawnPerson(person));
        const std::pair<Image, Eyes::Location> face(at.image, at.eyes);
        const ISO_19794_5::TokenFace::Creator token(configuration);
        tellCut(person + ".token", token.extract(face));
        tellCut(person + ".least token", token.extractMinimal(face));
        tellCut(person + ".token on green", ISO_19794_5::TokenFace::Creator(scaled).extract(face));
        tellCut(person + ".frontal", ISO_19794_5::FullFrontal::Creator(configuration).extract(face));
        tellCut(person + ".frontal scaled", ISO_19794_5::FullFrontal::Creator(scaled).extract(face));
        tellCut(person + ".frontal of its own",
                ISO_19794_5::FullFrontal::Creator(scaled).extract(face, 0.7f, 0.6f));
    }
    const Image image = drawnPerson("open");
    for (const int turn : {0, 1, 2})
        tellPicture(facts, "turned" + std::to_string(turn),
                    rotateImage(image, static_cast<ImageRotation>(turn)));
    for (const int smoothing : {0, 1, 2})
        for (const int radius : {0, 40})
            tellPicture(facts, "faded" + std::to_string(smoothing) + " " + std::to_string(radius),
                        vignetting(image, {200, 100, 50, 255}, 25, radius,
                                   static_cast<SmoothingFunction>(smoothing)));
    for (const float bend : {-0.8f, 0.5f})
        tellPicture(facts, "straight" + std::to_string(bend),
                    LenseDistortionCorrector(configuration, bend, image->width(), image->height(), 5, -7)
                        .undistort(image));
}

} // namespace

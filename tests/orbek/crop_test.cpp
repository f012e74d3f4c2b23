#include "drawn_image.h"
#include "orbek/full_frontal_creator.h"
#include "orbek/token_face_creator.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>

using namespace Orbek;

namespace {

namespace FullFrontal = ISO_19794_5::FullFrontal;
namespace TokenFace = ISO_19794_5::TokenFace;

const Eyes::Location eyes{{60, 80}, {100, 80}, 3, 4};

Configuration settings(const std::string& lines) {
    std::istringstream text(lines);
    return Configuration(text);
}

TEST(PortraitCreators, GiveThePictureAndTheEyesInIt) {
    const std::pair<Image, Eyes::Location> portrait{colorPattern(160, 200), eyes};
    const Configuration configuration = settings("");

    const auto [token, tokenEyes] = TokenFace::Creator(configuration).extract(portrait);
    EXPECT_EQ(token->width(), 160u);
    EXPECT_EQ(token->height(), 213u);
    EXPECT_EQ(token->name(), "");
    EXPECT_TRUE(token->isColor());
    EXPECT_EQ(tokenEyes.first.x, 60.5f);
    EXPECT_EQ(tokenEyes.secondConfidence, 4);

    const auto [minimal, minimalEyes] = TokenFace::Creator(configuration).extractMinimal(portrait);
    EXPECT_EQ(minimal->width(), 240u);
    EXPECT_EQ(minimalEyes.second, (Position{149.5f, 144.5f}));

    const FullFrontal::Creator creator(configuration);
    const auto [frontal, frontalEyes] = creator.extract(portrait);
    EXPECT_EQ(frontal->height(), 183u); // 40 * 3.435 / 0.75
    EXPECT_EQ(frontal->width(), 142u);
    EXPECT_NEAR(frontalEyes.first.x, 51, 0.01);
    EXPECT_EQ(creator.extract(portrait, 0.5f, 0.6f).first->height(), 275u);
    EXPECT_EQ(thrownBy([&] { creator.extract(portrait, 0.81f, 0.6f); }),
              "FNEBadArg: Configured ratio of face length to image height is out of full frontal image "
              "specification");
}

TEST(PortraitCreators, FollowTheConfiguration) {
    const std::pair<Image, Eyes::Location> portrait{colorPattern(160, 200), eyes};
    const TokenFace::Creator colored(settings("ORBEK.CropTokenImage.PaddingColorRed = 1\n"
                                              "ORBEK.CropTokenImage.PaddingColorGreen = 2\n"
                                              "ORBEK.CropTokenImage.PaddingColorBlue = 3\n"));
    EXPECT_EQ(colored.extract(portrait).first->colorRepresentation()[0], (Rgb{3, 2, 1, 255}));
    const Configuration strict = settings("ORBEK.CropTokenImage.PaddingRatio = 0.01\n"
                                          "ORBEK.CropFullFrontal.Scaling = Enabled\n"
                                          "ORBEK.CropFullFrontal.Scaling.Enabled.TargetWidth = 100\n");
    EXPECT_EQ(thrownBy([&] { TokenFace::Creator(strict).extractMinimal(portrait); }),
              "FNEBadArg: Maximum padding ratio exceeded.");
    EXPECT_EQ(FullFrontal::Creator(strict).extract(portrait).first->width(), 100u);
}

TEST(PortraitCreators, ReturnAnImageWhoseEyesCoincide) {
    const Image image = grayPattern(30, 20);
    const auto [token, tokenEyes] = TokenFace::Creator(settings("")).extract({image, {{5, 5}, {5, 5}, 0, 0}});
    EXPECT_EQ(token->grayScaleRepresentation(), image->grayScaleRepresentation());
    EXPECT_EQ(tokenEyes.first, (Position{11.75f, 9.5625f})) << "where a token image of 30 x 20 has it";
}

} // namespace

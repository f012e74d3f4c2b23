#include "drawn_image.h"
#include "orbek/image_operations.h"
#include "orbek/implementation/adapt.h"
#include "orbek/lense_distortion_corrector.h"
#include "orbek/token_face_creator.h"

#include <gtest/gtest.h>

#include <functional>
#include <sstream>

namespace Orbek {
namespace {

constexpr unsigned int side = 40;

/// An application's image whose memory somebody else has as soon as the image is gone.
class Borrowed final : public ImageBody {
public:
    Borrowed(std::vector<Rgb>& pixels, bool color) : pixels_(pixels), color_(color) {}
    ~Borrowed() override { std::ranges::fill(pixels_, Rgb{1, 2, 3, 4}); }
    bool isColor() const override { return color_; }
    unsigned int width() const override { return side; }
    unsigned int height() const override { return side; }
    const unsigned char* grayScaleRepresentation() const override { return &pixels_.data()->blue; }
    const Rgb* colorRepresentation() const override { return pixels_.data(); }
    std::string name() const override { return "borrowed"; }

private:
    std::vector<Rgb>& pixels_;
    bool color_;
};

std::vector<unsigned char> pixelsOf(const Image& image) {
    const std::size_t size = std::size_t{image->width()} * image->height();
    if (!image->isColor()) return {image->grayScaleRepresentation(), image->grayScaleRepresentation() + size};
    const auto* const first = &image->colorRepresentation()->blue;
    return {first, first + size * sizeof(Rgb)};
}

TEST(BorrowedPixels, AreThereAsLongAsAResultShowsThem) {
    std::istringstream nothing;
    const Configuration c(nothing);
    const auto vignette = [](int border, int radius) {
        return [=](const Image& image) {
            return vignetting(image, Rgb{9, 9, 9, 9}, border, radius, SmoothingFunction::Linear);
        };
    };
    const auto turned = [](int rotation) {
        return [=](const Image& image) { return rotateImage(image, static_cast<ImageRotation>(rotation)); };
    };
    const auto token = [&](float right) {
        return [&c, right](const Image& image) {
            return ISO_19794_5::TokenFace::Creator(c).extract({image, {{12, 20}, {right, 20}, 0, 0}}).first;
        };
    };
    const std::pair<const char*, std::function<Image(const Image&)>> operations[] = {
        {"vignetting without border", vignette(0, 0)},
        {"vignetting", vignette(3, 2)},
        {"no rotation", turned(7)},
        {"rotation", turned(static_cast<int>(ImageRotation::Half))},
        {"undistort",
         [&](const Image& i) { return LenseDistortionCorrector(c, 0, side, side, 0, 0).undistort(i); }},
        {"token of one eye", token(12)},
        {"token", token(24)},
        {"there and back", [](const Image& i) { return adapt(adapt(i), ""); }},
        {"the engine's gray",
         [](const Image& i) { return adapt(FNImageReferenceFactory::create(adapt(i).toMono8()), ""); }},
        {"the engine's colour",
         [](const Image& i) { return adapt(FNImageReferenceFactory::create(adapt(i).toBgra32()), ""); }},
    };
    for (const auto& [name, operate] : operations)
        for (const bool color : {false, true}) {
            std::vector<Rgb> memory(std::size_t{side} * side);
            for (std::size_t i = 0; i < memory.size(); ++i)
                memory[i] = {static_cast<unsigned char>(i * 37), static_cast<unsigned char>(i / 7), 5, 255};
            Image image(new Borrowed(memory, color));
            const std::vector<unsigned char> expected = pixelsOf(operate(image));
            const Image result = operate(image);
            image = Image();
            EXPECT_EQ(pixelsOf(result), expected) << name << (color ? ", colour" : ", gray");
        }
}

TEST(BorrowedPixels, AreCopiedByVignetting) {
    const Image image = colorPattern(9, 6);
    EXPECT_NE(vignetting(image, Rgb{}, 0, 0, SmoothingFunction::Hard)->colorRepresentation(),
              image->colorRepresentation());
}

} // namespace
} // namespace Orbek

#include "cmp/face_stream.h"

#include "support/recorded_dialog.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cmath>
#include <random>

namespace {

using Cmp::Evidence;
using Cmp::FaceStream;
using FaceInfo = Evidence::Frame::FaceInfo;
using FaceInfos = Evidence::Frame::FaceInfos;

Fn::TimeStamp at(int ms) {
    return Fn::TimeStamp(std::chrono::milliseconds(ms));
}

FaceInfo face(const std::string& id, float x, float y, float width = 10) {
    return {id, FaceFinder::Location{{x, y}, width, 0.5f, 0}, 1.5f};
}

/// Noise that hardly compresses.
template <class T> FNImageReference noise(std::uint32_t w, std::uint32_t h, unsigned seed = 1) {
    std::mt19937 random(seed);
    FNImage<T> image(w, h);
    for (T* p = image.getExclusive(); p != image.getExclusive() + image.size(); ++p) {
        const auto value = static_cast<unsigned char>(random());
        if constexpr (std::is_same_v<T, unsigned short>)
            *p = static_cast<unsigned short>(value * 257);
        else if constexpr (std::is_arithmetic_v<T>)
            *p = value;
        else
            *p = T(value, value, value);
    }
    return FNImageReferenceFactory::create(image);
}

Evidence::Frame frame(const FaceInfos& faces, int ms = 0, bool whole = false, unsigned seed = 1) {
    return {noise<unsigned char>(200, 150, seed), faces, at(ms), whole};
}

TEST(Evidence, KeepsTracksOfFaces) {
    Evidence evidence("e");
    evidence.push_back(frame({face("a", 50, 50)}, 10));
    evidence.push_back(frame({face("b", 90, 60), face("a", 51, 50)}, 20));
    evidence.push_back(frame({}, 30));
    evidence.push_back(frame({face("b", 91, 60)}, 40));
    for (const Evidence& e : {evidence, Evidence(evidence.serialize())}) {
        EXPECT_EQ(e.id(), "e");
        EXPECT_EQ(e.numberOfFrames(), 4u);
        EXPECT_EQ(e.numberOfFaceTracks(), 2u);
        EXPECT_EQ(e.numberOfFaces(), 4u);
        EXPECT_EQ(e.faceTrackNumberOfFrames("b"), 3u);
        EXPECT_EQ(e.trackedIds().at("b"), Cmp::EvidenceMetadata::Times(at(20), at(40)));
        const FaceStream stream("b", e);
        EXPECT_EQ(stream.startTime(), at(20));
        EXPECT_EQ(stream.endTime(), at(40));
        EXPECT_EQ(stream[2].faceInfo().location().pos.x, 91);
        EXPECT_EQ(FaceStream(stream.serialize())[0].faceInfo().location().pos.x, 90);
        EXPECT_EQ(thrownBy([&] { stream[1].faceInfo(); }),
                  "FNEBadArg: There is no face info for trackingID_ b in this face steam frame");
        EXPECT_EQ(thrownBy([&] { stream[3]; }),
                  "FNEBadArg: Evidence ID e, trackingID b: index 3 is out of range");
        EXPECT_EQ(thrownBy([&] { e.faceTrackFrame("c", 0); }),
                  "FNEBadArg: There is no face track with trackingID c within the evidence with ID e");
        EXPECT_EQ(thrownBy([&] { e[4]; }), "FNEBadArg: Evidence::operator[]: index out of range");
    }
}

TEST(Evidence, ReducedKeepsTheFirstAppearances) {
    Evidence evidence("e");
    for (int i = 0; i < 5; ++i)
        evidence.push_back(frame({face("a", 50, 50), face(i < 4 ? "b" : "c", 120, 60)}, i));
    const Evidence two = evidence.getReduced(2);
    EXPECT_EQ(two.numberOfFrames(), 3u);
    EXPECT_EQ(two.numberOfFaces(), 5u);
    EXPECT_EQ(two.trackedIds().at("c"), Cmp::EvidenceMetadata::Times(at(4), at(4)));
    EXPECT_EQ(evidence.getReduced(0).numberOfFrames(), 0u);
    EXPECT_EQ(evidence.getReduced(0).id(), "e");
}

TEST(EvidenceFrame, CropsComeBackAtTheirPlaces) {
    // Two faces whose crops overlap, and one at the border.
    const FaceInfos faces{face("a", 60.3f, 50.7f), face("b", 75.1f, 50), face("c", 195, 140)};
    const auto check = [&](const FNImageReference& image) {
        const Evidence::Frame written(image, faces, at(7), false);
        const Evidence::Frame read(written.serialize());
        const FNImage<unsigned char> original = image.toMono8(), back = read.img(false)->toMono8();
        ASSERT_EQ(back.w(), original.w());
        ASSERT_EQ(back.h(), original.h());
        std::size_t inside = 0, outside = 0;
        for (std::size_t i = 0; i < original.size(); ++i) {
            (back.data()[i] == original.data()[i] ? inside : outside) += 1;
            EXPECT_TRUE(back.data()[i] == original.data()[i] || back.data()[i] == 0);
        }
        EXPECT_GT(inside, 3000u);
        EXPECT_GT(outside, 15000u);
        EXPECT_EQ(read.img(false)->native(), image.native());
        EXPECT_EQ(read.img(true)->native(), FNImageReference::BGRA32);
        const Cmp::Face crop = read.getFaceForID("a", Evidence::Frame::CROPPED);
        EXPECT_EQ(crop.image().w(), 36u);
        EXPECT_EQ(crop.image().h(), 50u);
        EXPECT_NEAR(crop.facePosition().y, 50.7f - 31, 1e-4);
        EXPECT_NEAR(crop.facePosition().x, 60.3f - 42, 1e-4);
        const Cmp::Face thumb = read.getFaceForID("a", Evidence::Frame::THUMBNAIL);
        EXPECT_EQ(thumb.image().h(), 70u);
        EXPECT_NEAR(thumb.eyeDistance(), 10 * 70.0f / static_cast<float>(crop.image().h()), 1e-4);
        EXPECT_EQ(crop.eyeDistance(), 10) << "the thumbnail is scaled, not the crop";
    };
    check(noise<unsigned char>(200, 150));
    check(noise<unsigned short>(200, 150));
    check(noise<Fn::Bgra32>(200, 150));
}

TEST(EvidenceFrame, KeepsHowItsImagesAreWritten) {
    using Reference = FNImageReference;
    const Evidence::Frame plain = frame({face("a", 100, 75)}, 3);
    EXPECT_EQ(plain.getImageCompressionMethod(), Reference::UNCOMPRESSED_RAW);
    EXPECT_EQ(plain.getThumbnailFormat().height, 70);
    EXPECT_EQ(plain.getThumbnailFormat().strategy, Reference::UNCOMPRESSED_RAW);
    const auto sizeOf = [](const Evidence::Frame& f) {
        const FNImageReference crop = f.getFaceForID("a", Evidence::Frame::CROPPED).image();
        return std::pair(crop.w(), crop.h());
    };
    EXPECT_EQ(sizeOf(plain), std::pair(36u, 50u));

    for (const bool whole : {false, true}) {
        Evidence::Frame made = frame({face("a", 100, 75), face("b", 50, 75)}, 3, whole);
        const Evidence::Frame::FaceInfos both = made.faceInfos();
        EXPECT_EQ(sizeOf(made), std::pair(36u, 50u));
        made.setCroppingFactor(1.5f); // of crops that are there already
        EXPECT_EQ(sizeOf(made), std::pair(54u, 75u));
        made.setImageCompressionMethod(Reference::COMPRESSED_PNG);
        made.setThumbnailFormat({40, Reference::COMPRESSED_JPEGLS});
        Evidence evidence("e");
        evidence.push_back(frame({face("b", 50, 75)}, 2, whole));
        evidence.push_back(made);
        for (const Evidence::Frame& f : {made, evidence.getReduced(1)[1]}) {
            EXPECT_EQ(f.getImageCompressionMethod(), Reference::COMPRESSED_PNG);
            EXPECT_EQ(f.getThumbnailFormat().height, 40);
            EXPECT_EQ(f.getThumbnailFormat().strategy, Reference::COMPRESSED_JPEGLS);
            EXPECT_EQ(f.getSerializeWholeFrame(), whole);
            EXPECT_EQ(f.timeStamp(), at(3));
            const Cmp::Face crop = f.getFaceForID("a", Evidence::Frame::CROPPED),
                            thumb = f.getFaceForID("a", Evidence::Frame::THUMBNAIL);
            EXPECT_EQ(crop.image().getSerializationStrategy(), Reference::COMPRESSED_PNG);
            EXPECT_EQ(thumb.image().getSerializationStrategy(), Reference::COMPRESSED_JPEGLS);
            EXPECT_EQ(thumb.image().h(), 40u);
        }
        EXPECT_EQ(evidence.getReduced(1)[1].faceInfos().size(), 1u) << "of b the first only";
        EXPECT_EQ(evidence.getReduced(1)[1].img(false)->w(), 200u);
    }
    Evidence::Frame gray = frame({face("a", 100, 75)}, 3, true);
    gray.setImageCompressionMethod(Reference::COMPRESSED_PNG);
    EXPECT_EQ(gray.img(true)->getSerializationStrategy(), Reference::COMPRESSED_PNG);
    EXPECT_EQ(gray.img(false)->native(), Reference::BGRA32) << "kept in colour";
}

/// A frame of two crops of 2 by 2 pixels whose ids are given, the second one shifted by (1, 1).
Evidence::Frame overlapping(unsigned int width, unsigned int height, FNGridPos shift) {
    Fn::SerializableMap<std::string, Cmp::CroppedFace> crops;
    for (const auto& [id, gray] : {std::pair{"a", 100}, {"b", 200}}) {
        FNImage<unsigned char> image(2, 2);
        image.fill(static_cast<unsigned char>(gray));
        crops.emplace(id, Cmp::CroppedFace(Cmp::Face(FNImageReferenceFactory::create(image)),
                                           *id == 'a' ? FNGridPos(0, 0) : shift, 1));
    }
    return Evidence::Frame(Fn::Package(std::list<Fn::Package>{Fn::Package(false), Fn::Package(width),
                                                              Fn::Package(height), Fn::Package(crops),
                                                              Fn::Package(FaceInfos()), Fn::Package(at(0))}));
}

TEST(EvidenceFrame, TheGreaterIdStandsOnTopAndNothingReachesBeyondTheFrame) {
    const FNImage<unsigned char> image = overlapping(4, 3, {1, 1}).img(false)->toMono8();
    const std::vector<unsigned char> expected{100, 100, 0, 0, 100, 200, 200, 0, 0, 200, 200, 0};
    EXPECT_TRUE(std::equal(expected.begin(), expected.end(), image.data(), image.data() + image.size()));
    for (const FNGridPos shift : {FNGridPos(3, 1), FNGridPos(-1, 0), FNGridPos(1 << 30, 1 << 30)})
        EXPECT_EQ(thrownBy([&] { overlapping(4, 3, shift).img(false); }),
                  "FNEBadArg: Fn::blitIntoImage(): Invalid source size or offset");
    EXPECT_EQ(thrownBy([&] { overlapping(~0u, ~0u, {1, 1}).img(false); }).substr(0, 14), "FNEBadFormat: ");
}

TEST(EvidenceFrame, SaysWhatIsMissing) {
    EXPECT_EQ(thrownBy([] { Evidence::Frame().img(false); }),
              "FNEGeneric: Complete evidence frame requested, but not found");
    Evidence::Frame crops;
    crops.setSerializeWholeFrame(false);
    EXPECT_FALSE(Evidence::Frame(crops.serialize()).img(false)) << "there is nothing to build an image from";
    EXPECT_EQ(thrownBy([] {
                  frame({{"a", {}}}).serialize();
              }),
              "std::exception: Evidence frame describe faces which do not have location information");
    EXPECT_EQ(thrownBy([] { FaceInfo("a", {}).location(); }),
              "std::exception: location(): location is undefined! (ID = a)");
    EXPECT_EQ(thrownBy([] { face("a", 1, 1).pixVelocity(); }),
              "std::exception: pixVelocity(): pixel velocity is undefined! (ID = a)");
    const Evidence::Frame outside = frame({face("a", 500, 500)});
    EXPECT_EQ(thrownBy([&] { outside.getFaceForID("b", Evidence::Frame::CROPPED); }),
              "FNEBadArg: No data found in the frame for trackingID b");
    EXPECT_EQ(thrownBy([&] { outside.getFaceForID("a", Evidence::Frame::CROPPED); }),
              "FNEBadArg: Trying to get thumbnail for frame with height=0");
    EXPECT_EQ(thrownBy([&] {
                  frame({face("a", 50, 50)}).getFaceForID("a", static_cast<Evidence::Frame::FaceType>(7));
              }),
              "FNEBadArg: Unknown face type requested 7");
    EXPECT_EQ(thrownBy([] {
                  const Evidence::Frame rgb(noise<Fn::Rgb48>(100, 100), {face("a", 50, 50)}, at(0), false);
                  Evidence::Frame(rgb.serialize()).img(false);
              }),
              "FNEBadFormat: Unsupported image type in evidence");
}

TEST(Evidence, OneFaultyThumbnailIsAWarningAndTheNextFrameServes) {
    const RecordedDialog dialog;
    Evidence evidence("e");
    evidence.push_back(frame({face("a", 500, 500), face("b", 50, 50)}, 1, true));
    evidence.push_back(frame({face("a", 60, 50)}, 2, true, 5));
    const Fn::Package package = evidence.serialize();
    EXPECT_EQ(dialog.messages(),
              std::vector<std::string>{"warn: Trying to get thumbnail for frame with height=0"});
    const auto thumbs = Cmp::getThumbsFromSerializedEvidence(package);
    ASSERT_EQ(thumbs.size(), 2u);
    EXPECT_EQ(Cmp::Face(thumbs.at("a")).image().h(), 70u);

    EXPECT_EQ(Cmp::getMetaDataFromSerializedEvidence(package).endTime, at(2));
    const Fn::Package stripped = Cmp::stripThumbsFromSerializedEvidence(package);
    EXPECT_TRUE(Cmp::getThumbsFromSerializedEvidence(stripped).empty());
    EXPECT_EQ(Cmp::getImageDataFromSerializedEvidence(stripped),
              Cmp::getImageDataFromSerializedEvidence(package));
    EXPECT_TRUE(Evidence(stripped).serialize() == package) << "thumbnails are made again";
    std::list<Fn::Package> more(package);
    more.push_back(more.back());
    EXPECT_EQ(thrownBy([&] { Cmp::getImageDataFromSerializedEvidence(Fn::Package(more)); }).substr(0, 11),
              "FNEBadArg: ");
    const FaceStream stream("a", evidence);
    EXPECT_EQ(Cmp::getFirstFrameFromSerializedTrackedObjectData(stream.serialize())->w(), 200u);
    EXPECT_EQ(thrownBy([&] { Cmp::getImageDataFromSerializedEvidence(Fn::Package(1)); }).substr(0, 11),
              "FNEBadArg: ");
}

TEST(Evidence, ATrackTakesATenthOfItsFramesAsCrops) {
    Evidence crops("c");
    std::size_t whole = 0;
    for (int i = 0; i < 500; ++i) {
        // A face with an eye distance of 6 % of the width, which moves.
        const float t = static_cast<float>(i) / 50;
        const FNImageReference image = noise<unsigned char>(320, 240, static_cast<unsigned>(i));
        const FaceInfos faces{face("a", 160 + 60 * std::cos(t), 110 + 30 * std::sin(t), 19)};
        crops.push_back({image, faces, at(i * 40), false});
        whole += Fn::Package(Evidence::Frame(image, faces, at(i * 40), true)).size();
    }
    EXPECT_LT(crops.serialize().size(), whole / 10);
}

} // namespace

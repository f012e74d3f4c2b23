#include "drawn_image.h"
#include "orbek/enrollment.h"
#include "orbek/fir_builder.h"
#include "orbek/identification.h"
#include "orbek/image_io.h"
#include "orbek/implementation/adapt_sample.h"
#include "orbek/implementation/adapt_shape.h"
#include "orbek/verification.h"
#include "support/b7_setup.h"
#include "support/labelled_photos.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <atomic>
#include <map>
#include <thread>

namespace Orbek {
namespace {

// ---- samples

TEST(AdaptSample, CarriesWhatIsSetInBothDirections) {
    Sample sample(grayPattern(4, 3));
    EXPECT_FALSE(adapt(sample).hasEyes());
    EXPECT_FALSE(adapt(adapt(sample)).eyes.isSet());
    sample.eyes.set({{1, 2}, {3, 4}, 0.5f, 0.25f});
    const Vertex points[] = {{1, 2, 3}, {4, 5, 6}};
    const bool mask[] = {true, false};
    sample.vertexImage.set(createImageBody(points, mask, 2, 1, false));
    sample.pointSet.set(adapt(::ShapeImage::TexturedPointSet()));
    sample.secondEye3D.set({7, 8, 9});
    const Kx::SensorSample inner = adapt(sample);
    EXPECT_EQ(inner.rightEye->pos, (FNPos{3, 4}));
    EXPECT_EQ(inner.leftEye->confidence, 0.5f);
    EXPECT_EQ(inner.vertexImage->vertex({0, 0}).z, 3);
    EXPECT_TRUE(inner.pointSet);
    EXPECT_FALSE(inner.secondEye3D.isSet()) << "counts with the first only";
    sample.firstEye3D.set({1, 1, 1});
    const Sample back = adapt(adapt(sample));
    EXPECT_EQ(back.eyes.value().second, (Position{3, 4}));
    EXPECT_EQ(back.secondEye3D.value().y, 8);
    EXPECT_TRUE(back.pointSet.isSet());
    EXPECT_EQ(back.vertexImage.value()->width(), 2u);

    Sample half(grayPattern(1, 1));
    half.firstEye3D.set({1, 1, 1});
    EXPECT_EQ(thrownBy([&] { adapt(half); }),
              "std::exception: Attempt to retrieve Sample item Eye13D which is not set");
    Kx::SensorSample oneEyed(FNImageReference{});
    oneEyed.leftEye = FacialFeatureLocation();
    EXPECT_EQ(thrownBy([&] { adapt(oneEyed); }), "FNEBadFunCall: Optional data accessed but not set!");
}

// ---- feedbacks

struct Calls {
    std::string text;
    std::vector<Image> images;
    std::vector<FIR> firs;
    std::vector<float> scores;
    std::function<void(const std::string&)> atEach = [](const std::string&) {};

    void add(const std::string& call) {
        text += call + " ";
        atEach(call);
    }
};

/// Writes down what it is told.
template <class Body> class Told : public Body {
public:
    explicit Told(Calls& calls) : calls_(calls) {}
    void start() override { calls_.add("start"); }
    void processingImage(const Image& image) override {
        calls_.images.push_back(image);
        calls_.add("image");
    }
    void eyesFound(const Eyes::Location& eyes) override {
        calls_.add("eyes" + std::to_string(static_cast<int>(eyes.first.x)));
    }
    void eyesNotFound() override { calls_.add("blind"); }
    void end() override { calls_.add("end"); }

protected:
    Calls& calls_;
};

class EnrollmentTold final : public Told<Enrollment::FeedbackBody> {
public:
    using Told::Told;
    void success(const FIR& fir) override {
        calls_.firs.push_back(fir);
        calls_.add("success");
    }
    void failure() override { calls_.add("failure"); }
};
Enrollment::Feedback enrollment(Calls& calls) {
    return Enrollment::Feedback(new EnrollmentTold(calls));
}

class VerificationTold final : public Told<Verification::FeedbackBody> {
public:
    using Told::Told;
    void score(const Score& score) override {
        calls_.scores.push_back(score);
        calls_.add("score");
    }
    void match() override { calls_.add("match"); }
    void noMatch() override { calls_.add("noMatch"); }
};
Verification::Feedback verification(Calls& calls) {
    return Verification::Feedback(new VerificationTold(calls));
}

class IdentificationTold final : public Told<Identification::FeedbackBody> {
public:
    using Told::Told;
    void matches(const std::list<Match>& matches) override {
        std::string names = "matches:";
        for (const Match& match : matches) {
            names += match.name;
            calls_.scores.push_back(match.score);
        }
        calls_.add(names);
    }
};
Identification::Feedback identification(Calls& calls) {
    return Identification::Feedback(new IdentificationTold(calls));
}

/// A camera that sees no face, and remembers what it has delivered.
class EmptyRoom final : public CaptureDeviceBody {
public:
    explicit EmptyRoom(std::vector<Image>& delivered) : delivered_(delivered) {}
    Image capture() override {
        delivered_.push_back(grayPattern(40, 30));
        return delivered_.back();
    }

private:
    std::vector<Image>& delivered_;
};

/// Gray, and counts when it goes.
class Mortal final : public ImageBody {
public:
    explicit Mortal(int& gone) : gone_(gone) {}
    ~Mortal() override { ++gone_; }
    bool isColor() const override { return false; }
    unsigned int width() const override { return 40; }
    unsigned int height() const override { return 30; }
    const unsigned char* grayScaleRepresentation() const override { return pixels_.data(); }
    const Rgb* colorRepresentation() const override { return nullptr; }
    std::string name() const override { return "mortal"; }

private:
    int& gone_;
    std::vector<unsigned char> pixels_ = std::vector<unsigned char>(40 * 30, 7);
};

// ---- processors

/// The comparison has random weights, and a mapping from raw scores of 0 to 4000 to scores.
class ProcessorsWithModels : public B7Setup {
protected:
    static void SetUpTestSuite() {
        B7Setup::SetUpTestSuite();
        writeMappings();
    }

    static Configuration configuration(const std::string& more = {}) {
        const std::string b7 = "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.";
        std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n" + b7 +
                                "DataDir = " + folder().path().string() + "\n" + b7 +
                                "SampleSelector.SampleEvaluator.RegardDeviationFromFrontalPose = false\n" +
                                more);
        return Configuration(text);
    }

    /// A picture with eyes. @param seed pictures of other numbers show somebody else
    static Sample person(unsigned int seed) {
        std::mt19937 random(seed);
        std::vector<unsigned char> pixels(160 * 160);
        for (std::size_t i = 0; i < pixels.size(); ++i)
            pixels[i] = static_cast<unsigned char>(
                128 + 60 * std::sin(static_cast<double>(i % 160) / (4 + seed)) + random() % 40);
        return Sample(std::pair(Image(new DrawnImage(160, 160, pixels)),
                                Orbek::Eyes::Location{{50, 60}, {110, 60}, 1, 1}));
    }
    static FIR record(const Configuration& c, const std::list<Sample>& samples) {
        Calls calls;
        Enrollment::Processor(c).process(samples.begin(), samples.end(), enrollment(calls));
        return calls.firs.at(0);
    }
};

TEST_F(ProcessorsWithModels, AnEnrollmentTellsOfItsImagesInTheirOrder) {
    const Enrollment::Processor processor(configuration());
    Calls calls;
    const std::list<Sample> samples{person(1), Sample(grayPattern(60, 50)), person(2)};
    processor.process(samples.begin(), samples.end(), enrollment(calls));
    EXPECT_EQ(calls.text, "start image eyes50 image blind image eyes50 success end ");
    ASSERT_EQ(calls.images.size(), 3u);
    EXPECT_EQ(calls.images[1], std::next(samples.begin())->image) << "the application's own";
    EXPECT_EQ(calls.images[2], samples.back().image);

    Calls none;
    processor.process(samples.end(), samples.end(), enrollment(none));
    EXPECT_EQ(none.text, "start failure end ");
    processor.process(samples.begin(), samples.end(), Enrollment::Feedback());
    EXPECT_EQ(thrownBy([&] {
                  const std::list<Sample> null{person(1), Sample(Image())};
                  processor.process(null.begin(), null.end(), enrollment(none));
              }).substr(0, 9),
              "FNEBadArg");
    EXPECT_EQ(none.text, "start failure end ") << "a sample that cannot be used fails before the start";
    processor.process(std::next(samples.begin()), samples.end(), enrollment(none));
    EXPECT_EQ(none.images.front(), calls.images[1]) << "and leaves no image behind";
}

TEST_F(ProcessorsWithModels, WhatAFeedbackThrowsEndsTheProcess) {
    const Enrollment::Processor processor(configuration());
    const std::list<Sample> samples{person(1), person(2)};
    for (const char* call : {"start", "eyes50", "success", "end"}) {
        Calls broken, sound;
        broken.atEach = [&](const std::string& now) {
            if (now == call) throw std::out_of_range(call);
        };
        EXPECT_THROW(processor.process(samples.begin(), samples.end(), enrollment(broken)),
                     std::out_of_range);
        EXPECT_TRUE(broken.text.ends_with(std::string(call) + " ")) << broken.text;
        const std::string before = broken.text;
        processor.process(std::next(samples.begin()), samples.end(), enrollment(sound));
        EXPECT_EQ(sound.text, "start image eyes50 success end ");
        EXPECT_EQ(sound.images.front(), samples.back().image);
        EXPECT_EQ(broken.text, before);
    }
}

TEST_F(ProcessorsWithModels, AFeedbackMayUseTheProcessor) {
    const Enrollment::Processor processor(configuration());
    const std::list<Sample> samples{person(1)};
    Calls calls, inner;
    std::size_t merged = 0;
    calls.atEach = [&](const std::string& now) {
        if (now != "success") return;
        merged = processor.merge(calls.firs[0], calls.firs[0]).flatSize();
        processor.process(samples.begin(), samples.end(), enrollment(inner));
    };
    processor.process(samples.begin(), samples.end(), enrollment(calls));
    EXPECT_GE(merged, calls.firs[0].flatSize());
    EXPECT_EQ(inner.text, "start image eyes50 success end ");
    EXPECT_EQ(calls.text, "start image eyes50 success ") << "the inner one has taken its place";
}

TEST_F(ProcessorsWithModels, AVerificationEndsWithTheFirstMatch) {
    const Configuration c = configuration();
    const Verification::Processor processor(c);
    const FIR fir = record(c, {person(1)});
    const std::list<Sample> samples{person(2), Sample(grayPattern(60, 50)), person(1), person(2)};
    Calls calls;
    const auto two = std::next(samples.begin(), 2);
    processor.process(two, samples.end(), fir, 0, verification(calls));
    EXPECT_EQ(calls.text, "start image eyes50 score match end ");
    processor.process(samples.begin(), two, fir, 0, verification(calls));
    ASSERT_EQ(calls.scores.size(), 2u);
    ASSERT_GT(calls.scores[0], calls.scores[1]);
    const float threshold = (calls.scores[0] + calls.scores[1]) / 2;
    calls.text.clear();
    processor.process(samples.begin(), samples.end(), fir, threshold, verification(calls));
    EXPECT_EQ(calls.text, "start image eyes50 score image blind image eyes50 score match end ");
    calls.text.clear();
    processor.process(samples.begin(), two, fir, threshold, verification(calls));
    EXPECT_EQ(calls.text, "start image eyes50 score image blind noMatch end ");

    int gone = 0;
    {
        const std::list<Sample> more{person(1), Sample(Image(new Mortal(gone)))};
        calls.text.clear();
        processor.process(more.begin(), more.end(), fir, 0, verification(calls));
        EXPECT_EQ(calls.text, "start image eyes50 score match end ");
    }
    EXPECT_EQ(gone, 1) << "the processor keeps no image that it has not come to";
}

TEST_F(ProcessorsWithModels, AMergedRecordHasTheFeaturesOfBoth) {
    const Configuration c = configuration();
    const Enrollment::Processor processor(c);
    const FIR first = record(c, {person(1)}), second = record(c, {person(2)});
    const auto bytes = [](const FIR& fir) {
        std::ostringstream stream;
        fir.serialize(stream);
        return stream.str();
    };
    const auto place = [&](const FIR& merged, const FIR& part) {
        constexpr std::size_t enough = 500;
        const std::string feature = bytes(part);
        return bytes(merged).find(feature.substr(feature.size() - enough));
    };
    for (const auto& [one, other] : {std::pair{first, second}, {second, first}}) {
        const FIR merged = processor.merge(one, other);
        ASSERT_NE(place(merged, one), std::string::npos);
        ASSERT_NE(place(merged, other), std::string::npos);
        EXPECT_GT(place(merged, one), place(merged, other)) << "the old one is the second, and comes first";
    }
}

TEST_F(ProcessorsWithModels, AnIdentificationSeesThePopulationOfTheMoment) {
    const Configuration c = configuration();
    Population people(c);
    const Identification::Processor processor(c, people);
    const std::list<Sample> samples{Sample(grayPattern(60, 50)), person(1), person(2)};
    Calls calls;
    const auto identify = [&](float threshold, unsigned int maxMatches) {
        calls.text.clear();
        processor.process(samples.begin(), samples.end(), threshold, identification(calls), maxMatches);
        return calls.text;
    };
    EXPECT_EQ(identify(0, 5), "start image blind image eyes50 image eyes50 matches: end ");
    people.append(record(c, {person(2)}), "b");
    people.append(record(c, {person(1)}), "a");
    EXPECT_EQ(identify(0, 5), "start image blind image eyes50 matches:ab end ");
    ASSERT_EQ(calls.scores.size(), 2u);
    EXPECT_EQ(identify(calls.scores[1], 5), "start image blind image eyes50 matches:a end ");
    EXPECT_EQ(identify(0, 1), "start image blind image eyes50 matches:a end ");
    EXPECT_EQ(identify(0, 0), "start image blind image eyes50 image eyes50 matches: end ");
}

TEST_F(ProcessorsWithModels, DevicesDeliverTheImagesThatAreTold) {
    const Configuration c = configuration("ORBEK.StreamEnroller.TotalEnrollmentTime = 30\n"
                                          "ORBEK.StreamEnroller.MinImageTime = 0\n"
                                          "ORBEK.StreamVerifier.MaxNumOfImages = 3\n"
                                          "ORBEK.StreamVerifier.ImagePeriod = 1\n"
                                          "ORBEK.StreamIdentifier.TotalTime = 20\n");
    std::vector<Image> delivered;
    const CaptureDevice camera(new EmptyRoom(delivered));
    const auto expect = [&](const Calls& calls, const std::string& outcome) {
        std::string expected = "start ";
        for (std::size_t i = 0; i < calls.images.size(); ++i) expected += "image blind ";
        EXPECT_EQ(calls.text, expected + outcome + " end ");
        ASSERT_LE(calls.images.size(), delivered.size());
        EXPECT_TRUE(std::equal(calls.images.begin(), calls.images.end(), delivered.begin()));
        EXPECT_FALSE(delivered.empty());
        delivered.clear();
    };
    Calls enrolled, verified, identified;
    Enrollment::Processor(c).process(camera, enrollment(enrolled));
    expect(enrolled, "failure");
    Verification::Processor(c).process(camera, FIRBuilder(c).buildVoidFIR(), 0.5f, verification(verified));
    EXPECT_EQ(verified.images.size(), 3u);
    expect(verified, "noMatch");
    Identification::Processor(c, Population(c)).process(camera, 0.5f, identification(identified), 3);
    expect(identified, "matches:");
    EXPECT_EQ(thrownBy([&] { Enrollment::Processor(c).process(CaptureDevice(), enrollment(enrolled)); }),
              "FNEBadArg: Processor: the capture device is a null handle");
}

/// A camera that is not there.
class NoCamera final : public CaptureDeviceBody {
public:
    Image capture() override { throw std::range_error("no camera"); }
};

TEST_F(ProcessorsWithModels, ADeviceThatFailsSaysWhy) {
    const Configuration c = configuration();
    const CaptureDevice device(new NoCamera);
    Calls calls;
    const std::string reason = "std::exception: no camera";
    EXPECT_EQ(thrownBy([&] { Enrollment::Processor(c).process(device, enrollment(calls)); }), reason);
    EXPECT_EQ(thrownBy([&] {
                  const FIR fir = FIRBuilder(c).buildVoidFIR();
                  Verification::Processor(c).process(device, fir, 0.5f, verification(calls));
              }),
              reason);
    EXPECT_EQ(thrownBy([&] {
                  Identification::Processor(c, Population(c)).process(device, 0.5f, identification(calls), 3);
              }),
              reason);
    EXPECT_EQ(calls.text, "start start start ");
}

/// Plays drawn sample people.
CaptureDevice film(const std::string& person) {
    std::string names, files;
    for (const std::string number : {"1", "2", "3"}) {
        names += " p" + number;
        files += "ORBEK.CaptureDevices.Files.ImageFiles.FileLocation.Files.p" + number +
                 " = " ORBEK_SOURCE_DIR "/examples/images/" + person + number + ".jpg\n";
    }
    std::istringstream text("ORBEK.CaptureDevices.Files.ImageFiles.FileLocation.Files =" + names + "\n" +
                            files);
    return createCaptureDevice(Configuration(text), "Files");
}

TEST_F(ProcessorsWithModels, PeopleBeforeACameraAreEnrolledAndKnownAgain) {
    std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n"
                            "ORBEK.StreamEnroller.NumOfAcquisitions = 2\n"
                            "ORBEK.StreamEnroller.MinImageTime = 0\n"
                            "ORBEK.StreamVerifier.MaxNumOfImages = 2\n"
                            "ORBEK.StreamVerifier.ImagePeriod = 1\n"
                            "ORBEK.StreamIdentifier.TotalTime = 0\n");
    const Configuration c(text);
    /// What was told, with the eyes' places left out.
    const auto plain = [](const Calls& calls) {
        std::istringstream words(calls.text);
        std::string result;
        for (std::string word; words >> word;) result += (word.starts_with("eyes") ? "eyes" : word) + " ";
        return result;
    };
    Population people(c);
    std::map<std::string, FIR> firs;
    for (const std::string name : {"alice", "bob"}) {
        Calls calls;
        Enrollment::Processor(c).process(film(name), enrollment(calls));
        ASSERT_EQ(plain(calls), "start image eyes image eyes success end ");
        firs.insert({name, calls.firs.at(0)});
        people.append(calls.firs.at(0), name);
    }
    constexpr float threshold = 0.9f;
    Calls same, other, known;
    Verification::Processor(c).process(film("bob"), firs.at("bob"), threshold, verification(same));
    EXPECT_EQ(plain(same), "start image eyes score match end ");
    Verification::Processor(c).process(film("bob"), firs.at("alice"), threshold, verification(other));
    EXPECT_EQ(plain(other), "start image eyes score image eyes score noMatch end ");
    Identification::Processor(c, people).process(film("bob"), threshold, identification(known), 2);
    EXPECT_EQ(plain(known), "start image eyes matches:bob end ");
}

TEST_F(ProcessorsWithModels, ThreadsOnOneProcessorTakeTurns) {
    const Configuration c = configuration();
    const Enrollment::Processor processor(c);
    const std::list<Sample> samples{person(1), Sample(grayPattern(60, 50))};
    std::atomic<int> inside = 0, met = 0;
    const auto enrol = [&](Enrollment::Processor copy) {
        for (int i = 0; i < 5; ++i) {
            Calls calls;
            calls.atEach = [&](const std::string& now) {
                if (now == "start" && ++inside > 1) ++met;
                std::this_thread::yield();
                if (now == "end") --inside;
            };
            copy.process(samples.begin(), samples.end(), enrollment(calls));
            EXPECT_EQ(calls.text, "start image eyes50 image blind success end ");
            EXPECT_EQ(calls.images.size(), 2u);
            EXPECT_EQ(calls.images.at(0), samples.front().image);
        }
    };
    std::vector<std::thread> threads;
    for (int t = 0; t < 3; ++t) threads.emplace_back(enrol, processor);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(met, 0);
}

class ProcessorsOnPhotos : public ProcessorsWithModels {};

TEST_F(ProcessorsOnPhotos, APhotoIsEnrolledAndRecognized) {
    const std::filesystem::path photo = labelledPhotos() / "scenes/faces/celeba_001719.jpg";
    if (!std::filesystem::exists(photo)) GTEST_SKIP() << "no labelled photos";
    const Configuration c = configuration();
    const std::list<Sample> samples{Sample(ImageIO::load(photo.string()))};
    const FIR fir = record(c, samples);
    Calls calls;
    Verification::Processor(c).process(samples.begin(), samples.end(), fir, 0, verification(calls));
    ASSERT_EQ(calls.text.substr(0, 16), "start image eyes");
    EXPECT_NEAR(std::stoi(calls.text.substr(16)), 172, 5) << "the eye where the label has it";
    EXPECT_TRUE(calls.text.ends_with("score match end "));
    Calls other;
    const std::list<Sample> somebody{person(1)};
    Verification::Processor(c).process(somebody.begin(), somebody.end(), fir, 0, verification(other));
    EXPECT_GT(calls.scores.at(0), other.scores.at(0));
}

} // namespace
} // namespace Orbek

// Files of released formats, which every later version reads: what this one makes of a picture is what was
// made then, and what was made then means the same.

#include "golden_pictures.h"
#include "orbek/enrollment.h"
#include "orbek/facial_matching_engine.h"
#include "orbek/fir_builder.h"
#include "orbek/identification.h"
#include "orbek/token_face.h"
#include "orbek/verification.h"

#include <algorithm>

namespace {

using namespace Orbek;

std::filesystem::path stored(const std::string& name) {
    return goldenFolder() / "formats" / name;
}

std::string bytesOf(const std::filesystem::path& file) {
    std::ifstream stream(file, std::ios::binary);
    EXPECT_TRUE(stream) << file;
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// Once: what is there was released.
void store(const std::string& name, const std::string& bytes) {
    if (!std::filesystem::exists(stored(name))) std::ofstream(stored(name), std::ios::binary) << bytes;
}

std::string bytesOf(const FIR& fir) {
    std::ostringstream stream;
    fir.serialize(stream);
    return stream.str();
}

/// Writes down what happens.
template <class Body> struct Told : Body {
    void start() override { text += "start "; }
    void processingImage(const Image&) override { text += "image "; }
    void eyesFound(const Eyes::Location&) override { text += "eyes "; }
    void eyesNotFound() override { text += "blind "; }
    void end() override { text += "end"; }
    std::string text;
};
struct Enrolled final : Told<Enrollment::FeedbackBody> {
    void success(const FIR& made) override {
        fir.push_back(made);
        text += "record ";
    }
    void failure() override { text += "failure "; }
    std::vector<FIR> fir;
};
struct Verified final : Told<Verification::FeedbackBody> {
    void score(const Score& score) override { scores.push_back(score); }
    void match() override { text += "match "; }
    void noMatch() override { text += "no match "; }
    std::vector<float> scores;
};
struct Identified final : Told<Identification::FeedbackBody> {
    void matches(const std::list<Match>& found) override {
        for (const Match& match : found) {
            names += match.name + " ";
            scores.push_back(match.score);
        }
    }
    std::string names;
    std::vector<float> scores;
};

std::list<Sample> samples(const std::vector<std::string>& people) {
    std::list<Sample> result;
    for (const std::string& person : people) result.emplace_back(drawnPerson(person));
    return result;
}

FIR enrolled(const Configuration& configuration, const std::vector<std::string>& people) {
    auto* const told = new Enrolled;
    const Enrollment::Feedback feedback(told);
    const auto pictures = samples(people);
    Enrollment::Processor(configuration).process(pictures.begin(), pictures.end(), feedback);
    EXPECT_EQ(told->fir.size(), 1u) << told->text;
    return told->fir.at(0);
}

const std::string oneIsEnough = "ORBEK.SetEnroller.MinimumNumberOfGoodImages = 1\n";

TEST(RecordGoldenWithModels, MakesTheRecordsThatItMade) {
    const Configuration configuration = configured();
    for (const std::string person : drawnPeople) {
        const std::string name = "b7-" + person + ".fir", made = bytesOf(enrolled(configuration, {person}));
        if (writesGoldens()) store(name, made);
        EXPECT_TRUE(made == bytesOf(stored(name))) << name;
    }
    const std::string name = "b7-three.fir";
    const FIR three = enrolled(configuration, {"plain", "open", "lit"});
    if (writesGoldens()) store(name, bytesOf(three));
    EXPECT_TRUE(bytesOf(three) == bytesOf(stored(name))) << name;
}

TEST(RecordGoldenWithModels, ReadsAndComparesTheRecordsOfThen) {
    GoldenFacts facts("scores");
    for (const std::string normalization : {"Disabled", "Enabled"}) {
        const Configuration configuration = configured(
            "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.ScoreNormalization = " + normalization + "\n");
        const FIRBuilder builder(configuration);
        const FacialMatchingEngine engine(configuration);
        Population people(configuration);
        std::vector<FIR> records;
        std::vector<std::string> names(drawnPeople.begin(), drawnPeople.end());
        names.push_back("three");
        for (const std::string& name : names) {
            const std::string bytes = bytesOf(stored("b7-" + name + ".fir"));
            std::istringstream stream(bytes);
            records.push_back(builder.build(stream));
            EXPECT_EQ(bytesOf(records.back()), bytes) << "and writes it as it was";
            facts.text(normalization + "." + name + ".version", records.back().version());
            facts.number(normalization + "." + name + ".flatSize",
                         static_cast<double>(records.back().flatSize()));
            people.append(records.back(), name);
        }
        for (std::size_t i = 0; i < names.size(); ++i)
            for (std::size_t j = 0; j < names.size(); ++j)
                facts.number(normalization + "." + names[i] + " to " + names[j],
                             engine.compare(records[i], records[j]), 1e-6);
        const auto scores = engine.compare(records.front(), people);
        int i = 0;
        for (const Score& score : *scores)
            facts.number(normalization + ".all." + std::to_string(i++), score, 1e-6);
        const auto matches = engine.bestMatches(records.back(), people, 0.05f, 4);
        i = 0;
        for (const Match& match : *matches) {
            facts.text(normalization + ".best." + std::to_string(i), match.name);
            facts.number(normalization + ".best." + std::to_string(i++) + ".score", match.score, 1e-6);
        }
        const ScoreMappings rates(configuration);
        for (const float rate : {0.1f, 0.01f, 0.001f, 0.0001f}) {
            const std::string name = normalization + ".rate" + std::to_string(rate);
            facts.number(name + ".far", rates.requestFAR(rate), 1e-6);
            facts.number(name + ".frr", rates.requestFRR(rate), 1e-6);
            facts.number(name + ".expected far", rates.expectedFAR(rates.requestFAR(rate)), 1e-6);
            facts.number(name + ".expected frr", rates.expectedFRR(rates.requestFAR(rate)), 1e-6);
        }
        for (const float raw : {-500.0f, 0.0f, 3.0f, 1000.0f}) {
            const InternalScoreMappings mapping(configuration);
            facts.number(normalization + ".raw" + std::to_string(raw), mapping.convert(raw), 1e-6);
            facts.number(normalization + ".raw of " + std::to_string(raw),
                         mapping.convert(Score(mapping.convert(raw))), 1e-5);
        }
    }
}

TEST(RecordGoldenWithModels, ReadsPopulationsOfThen) {
    const Configuration configuration = configured();
    if (writesGoldens()) {
        Population people(configuration);
        for (const std::string person : drawnPeople) {
            std::ifstream stream(stored("b7-" + person + ".fir"), std::ios::binary);
            people.append(FIRBuilder(configuration).build(stream), person);
        }
        std::ostringstream bytes;
        people.save(bytes);
        store("people-b7.population", bytes.str());
    }
    const Population people = Population::load(configuration, stored("people-b7.population").string());
    EXPECT_EQ(people.ids(), std::vector<std::string>(drawnPeople.begin(), drawnPeople.end()));
    EXPECT_EQ(bytesOf(people.get("lit")), bytesOf(stored("b7-lit.fir")));
    std::ostringstream again;
    people.save(again);
    EXPECT_TRUE(again.str() == bytesOf(stored("people-b7.population")));
}

TEST(RecordGoldenWithModels, VerifiesAndIdentifiesAsItDid) {
    GoldenFacts facts("decisions");
    const Configuration configuration = configured();
    Population people(configuration);
    const FIRBuilder builder(configuration);
    std::vector<FIR> records;
    for (const std::string person : drawnPeople) {
        std::ifstream stream(stored("b7-" + person + ".fir"), std::ios::binary);
        records.push_back(builder.build(stream));
        people.append(records.back(), person);
    }
    for (const std::string person : drawnPeople)
        for (const float threshold : {0.3f, 0.9f}) {
            const std::string name = person + " at " + std::to_string(threshold);
            const auto pictures = samples({person, "plain", "turned"});
            auto* const verified = new Verified;
            const Verification::Feedback feedback(verified);
            Verification::Processor(configuration)
                .process(pictures.begin(), pictures.end(), records[1], threshold, feedback);
            facts.text(name + ".verified", verified->text);
            for (std::size_t i = 0; i < verified->scores.size(); ++i)
                facts.number(name + ".score" + std::to_string(i), verified->scores[i], 1e-3);
            auto* const identified = new Identified;
            const Identification::Feedback told(identified);
            Identification::Processor(configuration, people)
                .process(pictures.begin(), pictures.end(), threshold, told, 3);
            facts.text(name + ".identified", identified->text + ": " + identified->names);
            for (std::size_t i = 0; i < identified->scores.size(); ++i)
                facts.number(name + ".match" + std::to_string(i), identified->scores[i], 1e-3);
        }
}

TEST(RecordGoldenWithModels, ReadsAndWritesFacialRecordsAsItDid) {
    std::list<std::pair<Image, Eyes::Location>> faces;
    for (const char* const person : {"open", "lit"})
        faces.emplace_back(drawnPerson(person), Eyes::Location{});
    std::ostringstream written;
    ISO_19794_5::TokenFace::write(written, faces);
    if (writesGoldens()) store("token_faces.cbeff", written.str());
    const std::string then = bytesOf(stored("token_faces.cbeff"));
    EXPECT_EQ(written.str().substr(0, 200), then.substr(0, 200));
    GoldenFacts facts("facial_record");
    std::istringstream stream(then);
    int i = 0;
    for (const auto& [image, eyes] : ISO_19794_5::TokenFace::read(stream)) {
        const std::string name = std::to_string(i++);
        facts.number(name + ".width", image->width());
        facts.number(name + ".height", image->height());
        facts.number(name + ".x0", eyes.first.x);
        facts.number(name + ".y0", eyes.first.y);
        facts.number(name + ".x1", eyes.second.x);
        facts.number(name + ".y1", eyes.second.y);
        double sum = 0;
        for (unsigned int p = 0; p < image->width() * image->height(); ++p)
            sum += image->grayScaleRepresentation()[p];
        facts.number(name + ".mean", sum / (image->width() * image->height()));
    }
}

TEST(RecordGoldenWithModels, HasTheSettingsThatItHad) {
    GoldenFacts facts("settings");
    std::istringstream nothing;
    for (const auto& setting : Configuration(nothing).settings())
        facts.text(setting.key, setting.type + (setting.hasValue ? " = " + setting.defaultValue : ""));
}

} // namespace

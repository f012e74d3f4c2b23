#include "support/number_records.h"

#include "support/thrown.h"

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace NumberRecords;
using Cmp::Population;
using Cmp::Score;
using Cmp::Strategy;
using Probe = Strategy::Probe;
using Found = std::vector<std::pair<std::string, float>>;

FNCountedPtr<Algorithm> plain() {
    return FNCountedPtr<Algorithm>(new Algorithm);
}

Population population(const std::vector<std::pair<std::string, float>>& records) {
    Population result = Algorithm().createPopulation(0);
    for (const auto& [id, value] : records) result.add(record(value), id);
    return result;
}

Found found(const Cmp::Matches& matches) {
    Found result;
    for (const Cmp::Match& match : matches) result.emplace_back(match.id, match.score.value());
    return result;
}

TEST(Strategy, KeepsTheBestAboveTheThreshold) {
    const Population people =
        population({{"b", 0.25f}, {"a", 0.5f}, {"e", 0.5f}, {"c", 0.5f}, {"d", 0.75f}, {"f", 0}});
    struct Case {
        float probe, threshold;
        unsigned int limit;
        Found found;
    };
    const std::vector<Case> cases = {
        {0.5f,
         0.5f,
         9,
         {{"e", 1}, {"c", 1}, {"a", 1}, {"d", 0.75f}, {"b", 0.75f}}}, // not f: no more than 0.5
        {0.5f, 0.5f, 2, {{"e", 1}, {"c", 1}}},
        {0.5f, 0, 4, {{"e", 1}, {"c", 1}, {"a", 1}, {"d", 0.75f}}},
        {0.5f, 0, 0, {}},
        {0.5f, 1, 9, {}},
        {0, 0.75f, 9, {{"f", 1}}},
        {std::nanf(""), 0, 9, {}},
    };
    std::list<Probe> probes;
    for (const Case& c : cases) probes.emplace_back(record(c.probe), Score(c.threshold), c.limit);
    for (const unsigned int threads : {1u, 2u, 3u, 7u}) {
        const Strategy::Results results = strategy(threads, plain()).compare(probes, people);
        ASSERT_EQ(results.size(), cases.size());
        auto result = results.begin();
        for (const Case& c : cases) EXPECT_EQ(found(**result++), c.found) << c.probe << " " << c.threshold;
    }
}

TEST(Strategy, ThreadsMakeNoDifference) {
    std::mt19937 random(3);
    std::list<Population> people;
    for (const int size : {500, 0, 3, 257}) {
        people.push_back(population({}));
        for (int i = 0; i < size; ++i) // coarse scores and few ids: many equals
            people.back().add(record(static_cast<float>(random() % 50) / 50), std::to_string(random() % 90));
    }
    const Fn::View<Population> view(people);
    std::list<Strategy::RawProbe> probes;
    for (const float value : {0.1f, 0.5f, 0.9f})
        for (const unsigned int limit : {1u, 10u, 10000u}) probes.emplace_back(record(value), 0.3f, limit);
    const FNCountedPtr<Algorithm> counting(new Algorithm(true));
    const auto one = strategy(1, counting).compareRaw(probes, view.begin());
    unsigned int counted = 0;
    for (const unsigned int n : one.distributions->front()) counted += n;
    EXPECT_EQ(counted, 760u);
    EXPECT_EQ(one.matches->front().size(), 1u);
    for (unsigned int threads = 2; threads <= 8; ++threads) {
        const auto several = strategy(threads, counting).compareRaw(probes, view.begin());
        EXPECT_EQ(*several.matches, *one.matches) << threads;
        EXPECT_EQ(*several.distributions, *one.distributions) << threads;
    }
}

TEST(Strategy, NothingToSearchGivesEmptyLists) {
    const std::list<Probe> probes{{record(0), Score(0), 5}, {record(1), Score(0), 5}};
    for (const unsigned int threads : {1u, 4u})
        for (const bool counts : {false, true})
            for (const std::list<Population>& people : {std::list<Population>{}, {population({})}}) {
                const Strategy s = strategy(threads, FNCountedPtr<Algorithm>(new Algorithm(counts)));
                const auto results = s.compare(probes, Fn::View<Population>(people).begin());
                ASSERT_EQ(results.size(), 2u);
                EXPECT_TRUE(results.front()->empty() && results.back()->empty());
            }
    const auto galleries = Algorithm().prepareFew2Many({record(0)}, Fn::View<Population>({}).begin(), 3);
    ASSERT_EQ(galleries.size(), 1u);
    EXPECT_EQ(thrownBy([&] { galleries.front()->compare(); }),
              "FNEBadFunCall: Called compare on empty gallery");
    EXPECT_EQ(thrownBy([&] { strategy(0, plain()).compare(probes, population({})); }),
              "FNEBadArg: Number: Number of partitions has to be >= 1");
}

TEST(Strategy, ScoresOfAllRecordsInTheirOrder) {
    const Population people = population({{"x", 1}, {"y", 0.25f}, {"x", 0}});
    std::vector<float> scores;
    for (const Score& s : strategy(4, plain()).compare(record(0), people)) scores.push_back(s.value());
    EXPECT_EQ(scores, (std::vector<float>{0, 0.75f, 1}));
}

/// A walk that breaks.
class Broken final : public Algorithm {
    class Gallery final : public Cmp::Implementation::GalleryIterator::Body {
        std::size_t loadNextItems() override { FN_THROW(FNEIOError, "a broken gallery"); }
        std::span<const Cmp::Implementation::GalleryIterator::Item> compare() override { return {}; }
    };
    std::list<Cmp::Implementation::GalleryIterator> prepareFew2Many(const std::vector<Cmp::FIR>&,
                                                                    const Strategy::Populations&,
                                                                    unsigned int n) const override {
        using Body = FNCountedPtr<Cmp::Implementation::GalleryIterator::Body>;
        std::list<Cmp::Implementation::GalleryIterator> galleries;
        while (galleries.size() < n) galleries.emplace_back(Body(new Gallery));
        return galleries;
    }
};

/// A record of nobody's.
class Foreign final : public Cmp::FIR::Body {
    Fn::Package serialize() const override { return {}; }
    void createMemento(unsigned char*&) const override {}
    std::size_t mementoSize() const override { return 0; }
    std::string version() const override { return {}; }
};

TEST(Strategy, FailuresReachTheCaller) {
    const FNCountedPtr<Algorithm> broken(new Broken);
    const std::list<Probe> probes{{record(0), Score(0), 5}};
    EXPECT_EQ(thrownBy([&] { strategy(1, broken).compare(probes, population({})); }),
              "FNEIOError: a broken gallery");
    EXPECT_EQ(thrownBy([&] { strategy(3, broken).compare(probes, population({})); }),
              "FNEGeneric: a broken gallery");

    const Cmp::FIR foreign(FNCountedPtr<Cmp::FIR::Body>(new Foreign));
    Population people = population({{"a", 1}, {"b", 2}, {"a", 3}});
    EXPECT_THROW(people.add(foreign, "f"), std::bad_cast);
    EXPECT_THROW(strategy(2, plain()).compare({{foreign, Score(0), 5}}, people), std::bad_cast);
    const Population other(FNCountedPtr<Population::Body>(new Cmp::FeatureSets<Foreign>));
    EXPECT_THROW(strategy(2, plain()).compare(probes, other), std::bad_cast);

    people.remove("a");
    people.remove("z");
    EXPECT_EQ(people.get("a").serialize().toFloat(), 3);
    EXPECT_EQ(thrownBy([&] { people.get("z"); }), "FNEBadArg: Attempting to retrieve nonexisting element");
}

/// Takes the number of scores in the last bin from each score.
class Normalizing final : public Algorithm {
    Cmp::RawMatches normalizeRawScores(const Cmp::RawMatches& matches,
                                       const Cmp::ScoreHistogram& counts) const override {
        Cmp::RawMatches result;
        for (const auto& match : matches)
            result.emplace(match.score - static_cast<float>(counts[counts.size() - 1]), match.id);
        return result;
    }
};

TEST(Strategy, ConvertsNormalizedScores) {
    const Strategy s = strategy(1, FNCountedPtr<Algorithm>(new Normalizing));
    using Raw = std::list<Cmp::RawMatches>;
    using Histograms = std::list<Cmp::ScoreHistogram>;
    const auto results = [](const Raw& raw, const Histograms& histograms) {
        return Cmp::MultipleProbesRawMatchingResults{FNCountedPtr<Raw>(new Raw(raw)),
                                                     FNCountedPtr<Histograms>(new Histograms(histograms))};
    };
    const Raw raw{{{{2, "a"}, {3, "b"}}}, {}};
    EXPECT_EQ(found(*s.convert(results(raw, {})).front()), (Found{{"b", 3}, {"a", 2}}));
    EXPECT_EQ(found(*s.convert(results(raw, {{}, {}})).front()), (Found{{"b", 3}, {"a", 2}}));
    const Cmp::ScoreHistogram one(3, 1u);
    EXPECT_EQ(found(*s.convert(results(raw, {one, one})).front()), (Found{{"b", 2}, {"a", 1}}));
    EXPECT_EQ(thrownBy([&] { s.convert(results(raw, {one})); }),
              "FNEGeneric: Comparison algorithm: number of score distributions does not match the number of "
              "probes");
}

TEST(Sample, NamesTheFirstItemThatIsMissing) {
    const Cmp::Sample empty, image(FNImageReference(), {1, 2}, {3, 4});
    const Cmp::Sample shape(Fn::VertexImage(2, 2), {1, 2}, {3, 4}), stream{Cmp::FaceStream()};
    const auto missing = [](const Cmp::Sample& s, const Cmp::Sample::Requirements& r) {
        return thrownBy([&] { s.check(r); });
    };
    const std::string need = "FNEBadArg: Sample requirement not met: need ";
    EXPECT_EQ(missing(empty, {}), "nothing thrown");
    EXPECT_EQ(missing(empty, {true, true, true, true, true}), need + "intensity image");
    EXPECT_EQ(missing(image, {true, true, true, true, true}), need + "FaceStream");
    EXPECT_EQ(missing(stream, {false, true, true, true, true}), need + "intensity eye positions");
    EXPECT_EQ(missing(image, {true, true, false, true, true}), need + "shape vertex image or point set");
    EXPECT_EQ(missing(shape, {false, true, false, true, true}), need + "shape eye positions");
    const Cmp::Sample points(ShapeImage::TexturedPointSet(), {1, 2}, {3, 4});
    EXPECT_EQ(missing(points, {false, true, false, true, false}), "nothing thrown");
    EXPECT_NE(empty.id, image.id);
}

} // namespace

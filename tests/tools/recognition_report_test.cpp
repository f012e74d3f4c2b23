#include "cmp/score_mapping.h"
#include "eval/recognition.h"
#include "support/number_records.h"

#include <gtest/gtest.h>

namespace {

using namespace Eval;

/// Twenty people, far from each other, whose pictures are near each other. Number 1 looks like number 0, and
/// the last picture of number 19 shows no face.
EnrolledPeople twenty() {
    EnrolledPeople people;
    for (std::size_t person = 0; person < 20; ++person) {
        people.persons.push_back(std::to_string(person));
        const float place = static_cast<float>(std::max<std::size_t>(person, 1)) / 20;
        for (const float picture : {0.0f, 0.001f, 0.002f})
            people.singles.push_back({person, NumberRecords::record(place + picture)});
    }
    people.singles.back().record.reset();
    return people;
}

/// Says that a share of 1 - score of the impostors is above a score.
Cmp::Strategy strategy() {
    using namespace Cmp::Implementation;
    const auto line = [](float first, float last) {
        return Fn::InvertibleFunction<float, float>(FNVector<float>(std::vector{first, last}), 0, 1);
    };
    return {FNCountedPtr<NumberRecords::Algorithm>(new NumberRecords::Algorithm),
            FNCountedPtr<ScoreMapping>(new IdentityScoreMapping),
            FNCountedPtr<RatesMapping>(new RMap(line(1, 0), line(0, 1))), 1};
}

TEST(RecognitionReport, CountsPairsOfSinglePictures) {
    const VerificationReport report = verify(twenty(), strategy(), 2);
    EXPECT_EQ(report.persons, 20u);
    EXPECT_EQ(report.records, 60u);
    EXPECT_EQ(report.notEnrolled, 1u);
    EXPECT_EQ(report.genuine, 60u);
    EXPECT_EQ(report.impostor, 60u * 59 / 2 - 60);
    // 9 of 1710 impostor pairs are of the two who look alike, 2 of 60 genuine ones have no record.
    constexpr double alike = 9.0 / 1710, enrolled = 58.0 / 60;
    EXPECT_NEAR(report.trueAccepts[0].value, enrolled, 1e-9) << "at 0.01";
    EXPECT_LT(report.trueAccepts[1].value, 0.8) << "at 0.001, which only one of those who look alike reaches";
    EXPECT_LE(report.trueAccepts[0].least, enrolled);
    EXPECT_LT(report.trueAccepts[0].least, report.trueAccepts[0].most);
    EXPECT_NEAR(report.equalErrorRate.value, 1 - enrolled, 1e-6);
    EXPECT_FLOAT_EQ(static_cast<float>(report.requested[0]), 0.99f);
    EXPECT_NEAR(report.achieved[0], alike, 1e-9);
    EXPECT_EQ(report.curve.back().first, 1);
    EXPECT_TRUE(
        std::ranges::is_sorted(report.curve, std::ranges::greater(), [](auto& p) { return p.second; }));

    EnrolledPeople strangers = twenty();
    std::erase_if(strangers.singles, [](const PersonRecord& r) { return r.person != 3; });
    EXPECT_THROW(verify(strangers, strategy(), 1), FNEBadArg);
}

TEST(RecognitionReport, ComparesSinglesWithGalleryRecords) {
    EnrolledPeople people = twenty();
    std::erase_if(people.singles, [&, n = 0](const PersonRecord& r) mutable {
        if (n++ % 3 != 0) return false;
        people.galleries.push_back(r);
        return true;
    });
    const VerificationReport report = verify(people, strategy(), 1);
    EXPECT_EQ(report.genuine, 40u);
    EXPECT_EQ(report.impostor, 40u * 19);
    EXPECT_NEAR(report.achieved[0], 4.0 / 760, 1e-9);
    EXPECT_EQ(identify(people, strategy(), 1).probes, 40u);
}

TEST(RecognitionReport, SearchesForEachWithAndWithoutItsOwnRecord) {
    const IdentificationReport report = identify(twenty(), strategy(), 2);
    EXPECT_EQ(report.gallery, 20u) << "the first picture of each";
    EXPECT_EQ(report.probes, 40u);
    EXPECT_EQ(report.notEnrolled, 1u);
    // Two of each who look alike find the other as well; one has no record.
    EXPECT_NEAR(report.rank1, 35.0 / 40, 1e-9);
    EXPECT_NEAR(report.rank5, 39.0 / 40, 1e-9);
    EXPECT_NEAR(report.misses[0], 5.0 / 40, 1e-9) << "where one search in ten may find a stranger";
    EXPECT_GT(report.misses[1], 0.1) << "where none may";

    EnrolledPeople once = twenty();
    std::erase_if(once.singles, [n = 0](const PersonRecord&) mutable { return n++ % 3 != 0; });
    EXPECT_THROW(identify(once, strategy(), 1), FNEBadArg);
}

} // namespace

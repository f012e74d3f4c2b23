#pragma once

#include "cmp/strategy.h"
#include "eval/detect.h"
#include "eye/eyes_finder.h"
#include "labelled/labels.h"

#include <array>
#include <cstdint>
#include <filesystem>
#include <iosfwd>
#include <optional>
#include <string>
#include <vector>

/// How well people are recognised: records are made of pictures as enrolment makes them, packed, and compared
/// by the algorithm that the default configuration names. What the reports call a score is what the library
/// returns.

namespace Orbek {
class Resources;
}

namespace Eval {

/// Which pictures of named people to judge on.
struct PeopleSelection {
    std::vector<std::string> labels; ///< files in the format of labels.tsv, with persons
    std::optional<Labelled::Split> split;
    std::size_t picturesPerRecord = 1; ///< of the records that single pictures are compared with
    double mostYaw = 180;              ///< degrees; pictures without points to tell it by are left out then
    double mostLightAngle = 180;       ///< of the light from straight ahead, degrees
    unsigned jobs = 1;
};

/// A record of one or several pictures of a person.
struct PersonRecord {
    std::size_t person;             ///< number of the name
    std::optional<Cmp::FIR> record; ///< nothing if there is no picture with a face and eyes
};

/// Records of a selection.
struct EnrolledPeople {
    std::vector<std::string> persons;
    /// Of several pictures, one for each person who has more; empty if records are to be of one picture.
    std::vector<PersonRecord> galleries;
    std::vector<PersonRecord> singles; ///< the pictures that are in no gallery record, the best lit one first
    std::vector<std::string> failures; ///< files that could not be read
};

/// Makes records with the finders and the algorithm of the default configuration on a folder of models.
class Enrolment {
public:
    /// @param etc folder of the trained content, named "etc"
    /// @throws FNEBadArg for a folder of another name; FNEGeneric if a model is missing
    Enrolment(const std::filesystem::path& etc, const EyeDistances& eyeDistances);

    EnrolledPeople enrol(const PeopleSelection& selection) const;
    const Cmp::Strategy& strategy() const { return strategy_; }

private:
    Enrolment(const Orbek::Resources& resources, const EyeDistances& eyeDistances);
    std::optional<Cmp::FIR> record(const std::vector<Labelled::Row>& pictures,
                                   std::vector<std::string>& failures) const;

    EyeDistances eyeDistances_;
    FaceFinder faces_;
    EyesFinder eyes_;
    Cmp::Strategy strategy_;
};

/// A figure and its 95 % interval, by bootstrap over persons.
struct Interval {
    double value = 0, least = 0, most = 0;
};

struct VerificationReport {
    static constexpr std::array<double, 3> rates = {0.01, 0.001, 0.0001};

    std::size_t persons = 0, records = 0, notEnrolled = 0, genuine = 0, impostor = 0;
    Interval equalErrorRate;
    std::array<Interval, rates.size()> trueAccepts; ///< at the measured false acceptance rates
    std::array<double, rates.size()> thresholds;    ///< scores of those rates
    std::array<double, rates.size()> requested;     ///< scores that the library gives for them
    std::array<double, rates.size()> achieved;      ///< what rates these have here
    std::vector<std::pair<double, double>> curve;   ///< false acceptance and false rejection rates
    std::vector<std::string> failures;
};

/// Compares all singles with each other, or with the gallery records. Pairs with a picture that could not be
/// enrolled are rejected.
VerificationReport verify(const EnrolledPeople& people, const Cmp::Strategy& strategy, unsigned jobs);

struct IdentificationReport {
    static constexpr std::array<double, 2> rates = {0.1, 0.01};

    std::size_t gallery = 0, probes = 0, notEnrolled = 0;
    double rank1 = 0, rank5 = 0;
    /// Share of searches for people in the gallery that do not find them, where the threshold lets a search
    /// for somebody who is not in it find anybody with these rates.
    std::array<double, rates.size()> misses;
    std::array<double, rates.size()> thresholds;
    std::vector<std::pair<double, double>> curve; ///< false positive rate of searches, and misses
    std::vector<std::string> failures;
};

/// Searches for each single in the gallery records, or in the first single of each person who has more, once
/// as it is, and once without the person's own record.
IdentificationReport identify(const EnrolledPeople& people, const Cmp::Strategy& strategy, unsigned jobs);

void print(const VerificationReport& report, std::ostream& stream);
void print(const IdentificationReport& report, std::ostream& stream);
std::string toJson(const VerificationReport& report);
std::string toJson(const IdentificationReport& report);

} // namespace Eval

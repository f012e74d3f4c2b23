#include "eval/recognition.h"

#include "fn/deployment/app_config_db.h"
#include "fn/imagefile/image_file.h"
#include "labelled/pictures.h"
#include "labelled/portrait_truth.h"
#include "orbek/implementation/resources.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <mutex>
#include <numeric>
#include <ostream>
#include <random>

#include <nlohmann/json.hpp>

namespace Eval {
namespace {

constexpr int resamplings = 200;
/// Below all scores: of pairs that were never compared.
constexpr float rejected = -1;

Orbek::Resources resourcesOn(const std::filesystem::path& etc) {
    const std::filesystem::path folder = std::filesystem::canonical(etc);
    if (folder.filename() != "etc")
        FN_THROW(FNEBadArg, etc.string() + ": the folder of the trained content has to be named \"etc\"");
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("ORBEK.Substitutions.INSTALLDIR", folder.parent_path().string());
    return Orbek::Resources(db);
}

double lightAngle(const Labelled::Row& row) {
    return std::hypot(row.number("light_azimuth").value_or(0), row.number("light_elevation").value_or(0));
}

bool wanted(const Labelled::Row& row, const PeopleSelection& selection) {
    if (row.text("person").empty() || lightAngle(row) > selection.mostLightAngle) return false;
    if (selection.split && Labelled::splitOf(row.splitKey()) != *selection.split) return false;
    if (selection.mostYaw >= 180) return true;
    const auto points = Labelled::Points68::of(row);
    return points && std::abs(points->yaw()) <= selection.mostYaw;
}

/// Calls visit(a, b, score) for each record of a population and each probe, from several threads: probe by
/// probe.
template <class Visit>
void compareAll(const std::vector<PersonRecord>& probes, const std::vector<PersonRecord>& gallery,
                const Cmp::Strategy& strategy, unsigned jobs, Visit visit) {
    Cmp::Population population =
        strategy.algorithm()->createPopulation(static_cast<unsigned int>(gallery.size()));
    std::vector<std::size_t> places;
    for (std::size_t i = 0; i < gallery.size(); ++i)
        if (gallery[i].record) {
            population.add(*gallery[i].record, std::to_string(i));
            places.push_back(i);
        }
    Labelled::forEachOf(probes.size(), jobs, [&](std::size_t i) {
        std::vector<float> scores(gallery.size(), rejected);
        if (probes[i].record) {
            auto place = places.begin();
            for (const Cmp::Score score : strategy.compare(*probes[i].record, population))
                scores[*place++] = score.value();
        }
        visit(i, scores);
    });
}

struct Pair {
    float score;
    std::uint32_t first, second; ///< persons
};

/// Of pairs in descending order of score, each as often as its persons were drawn.
class WeightedPairs {
public:
    WeightedPairs(const std::vector<Pair>& pairs, const std::vector<double>& drawn)
        : pairs_(pairs), drawn_(drawn) {
        for (const Pair& pair : pairs) total_ += weight(pair);
    }
    double total() const { return total_; }
    double weight(const Pair& pair) const {
        // A person drawn twice is two people with the same pictures, whose genuine pairs are their own.
        return pair.first == pair.second ? drawn_[pair.first] : drawn_[pair.first] * drawn_[pair.second];
    }
    /// The score that this share is above.
    float threshold(double share) const {
        double sum = 0;
        for (const Pair& pair : pairs_) {
            sum += weight(pair);
            if (sum > share * total_) return pair.score;
        }
        return pairs_.empty() ? 0 : pairs_.back().score;
    }
    /// Share of pairs above a score.
    double above(float score) const {
        double sum = 0;
        for (const Pair& pair : pairs_) {
            if (!(pair.score > score)) break;
            sum += weight(pair);
        }
        return total_ > 0 ? sum / total_ : 0;
    }

private:
    const std::vector<Pair>& pairs_;
    const std::vector<double>& drawn_;
    double total_ = 0;
};

double equalErrorRate(const WeightedPairs& genuine, const WeightedPairs& impostor) {
    double low = 0, high = 1;
    for (int i = 0; i < 30; ++i) {
        const double far = (low + high) / 2;
        (1 - genuine.above(impostor.threshold(far)) > far ? low : high) = far;
    }
    return low;
}

/// What one resampling gives.
struct Sampled {
    double equal;
    std::array<double, VerificationReport::rates.size()> accepts;
};

Sampled sample(const std::vector<Pair>& genuine, const std::vector<Pair>& impostor,
               const std::vector<double>& drawn) {
    const WeightedPairs own(genuine, drawn), other(impostor, drawn);
    Sampled result{equalErrorRate(own, other), {}};
    for (std::size_t i = 0; i < VerificationReport::rates.size(); ++i)
        result.accepts[i] = own.above(other.threshold(VerificationReport::rates[i]));
    return result;
}

template <class Get> Interval interval(const Sampled& whole, std::vector<Sampled>& samples, Get get) {
    std::ranges::sort(samples, {}, get);
    const auto at = [&](double share) {
        return get(samples[static_cast<std::size_t>(share * static_cast<double>(samples.size() - 1))]);
    };
    return {get(whole), at(0.025), at(0.975)};
}

nlohmann::json jsonOf(const Interval& i) {
    return {{"value", i.value}, {"least", i.least}, {"most", i.most}};
}

template <class... Values> std::string line(const char* format, Values... values) {
    char text[200];
    std::snprintf(text, sizeof text, format, values...);
    return text;
}

} // namespace

Enrolment::Enrolment(const std::filesystem::path& etc, const EyeDistances& eyeDistances)
    : Enrolment(resourcesOn(etc), eyeDistances) {}

Enrolment::Enrolment(const Orbek::Resources& resources, const EyeDistances& eyeDistances)
    : eyeDistances_(eyeDistances), faces_(resources.faceFinder()), eyes_(resources.eyesFinder()),
      strategy_(resources.cmpStrategy()) {}

std::optional<Cmp::FIR> Enrolment::record(const std::vector<Labelled::Row>& pictures,
                                          std::vector<std::string>& failures) const {
    const Cmp::RecordBuilder builder = strategy_.algorithm()->createRecordBuilder();
    for (const Labelled::Row& row : pictures) {
        try {
            const FNImageReference image = Fn::readImage(row.image().string());
            std::list<FaceFinder::Location> reports;
            faces_.find(image, reports, eyeDistances_.least, eyeDistances_.most, FaceFinder::everywhere);
            if (reports.empty()) continue;
            bool foundLeft, foundRight;
            FacialFeatureLocation left, right;
            eyes_.find(reports.front(), image, foundLeft, left, foundRight, right);
            if (foundLeft && foundRight) builder->pushSample(Cmp::Sample(image, left.pos, right.pos));
        } catch (const FNEBadArg&) {
            // Eyes and mouth that no face can have: as if nothing was found.
        } catch (const std::exception& e) {
            failures.push_back(row.image().string() + ": " + e.what());
        }
    }
    if (builder->numberOfSamples() == 0) return {};
    return builder->generate();
}

EnrolledPeople Enrolment::enrol(const PeopleSelection& selection) const {
    std::map<std::string, std::vector<Labelled::Row>> byPerson;
    for (const std::string& labels : selection.labels)
        for (const Labelled::Row& row : Labelled::readLabels(labels))
            if (wanted(row, selection)) byPerson[labels + "/" + row.text("person")].push_back(row);

    struct Work {
        std::vector<Labelled::Row> pictures;
        PersonRecord* result;
    };
    EnrolledPeople people;
    std::vector<Work> galleries, singles;
    for (auto& [name, pictures] : byPerson) {
        std::ranges::stable_sort(pictures, {}, lightAngle);
        const std::size_t person = people.persons.size();
        people.persons.push_back(name.substr(name.rfind('/') + 1));
        auto next = pictures.begin();
        if (selection.picturesPerRecord > 1) {
            if (pictures.size() <= selection.picturesPerRecord) continue;
            next += static_cast<std::ptrdiff_t>(selection.picturesPerRecord);
            people.galleries.push_back({person, {}});
            galleries.push_back({{pictures.begin(), next}, nullptr});
        }
        for (; next != pictures.end(); ++next) {
            people.singles.push_back({person, {}});
            singles.push_back({{*next}, nullptr});
        }
    }
    for (std::size_t i = 0; i < galleries.size(); ++i) galleries[i].result = &people.galleries[i];
    for (std::size_t i = 0; i < singles.size(); ++i) singles[i].result = &people.singles[i];
    galleries.insert(galleries.end(), singles.begin(), singles.end());
    std::mutex mutex;
    Labelled::forEachOf(galleries.size(), selection.jobs, [&](std::size_t i) {
        std::vector<std::string> failures;
        galleries[i].result->record = record(galleries[i].pictures, failures);
        const std::lock_guard lock(mutex);
        people.failures.insert(people.failures.end(), failures.begin(), failures.end());
    });
    return people;
}

VerificationReport verify(const EnrolledPeople& people, const Cmp::Strategy& strategy, unsigned jobs) {
    const bool among = people.galleries.empty();
    const std::vector<PersonRecord>& gallery = among ? people.singles : people.galleries;
    std::vector<Pair> genuine, impostor;
    std::mutex mutex;
    compareAll(people.singles, gallery, strategy, jobs,
               [&](std::size_t probe, const std::vector<float>& scores) {
                   const std::lock_guard lock(mutex);
                   for (std::size_t i = 0; i < (among ? probe : scores.size()); ++i) {
                       const auto first = static_cast<std::uint32_t>(people.singles[probe].person),
                                  second = static_cast<std::uint32_t>(gallery[i].person);
                       (first == second ? genuine : impostor).push_back({scores[i], first, second});
                   }
               });
    const auto descending = [](const Pair& a, const Pair& b) {
        return std::tie(a.score, a.first, a.second) > std::tie(b.score, b.first, b.second);
    };
    std::ranges::sort(genuine, descending);
    std::ranges::sort(impostor, descending);
    if (genuine.empty() || impostor.empty())
        FN_THROW(FNEBadArg, "There are no two pictures of one person, or there is only one person");

    VerificationReport report;
    report.failures = people.failures;
    report.persons = people.persons.size();
    report.records = people.singles.size() + people.galleries.size();
    for (const auto* records : {&people.singles, &people.galleries})
        report.notEnrolled += static_cast<std::size_t>(
            std::ranges::count_if(*records, [](const PersonRecord& r) { return !r.record; }));
    report.genuine = genuine.size();
    report.impostor = impostor.size();

    const std::vector<double> once(report.persons, 1.0);
    const Sampled whole = sample(genuine, impostor, once);
    std::vector<Sampled> samples(resamplings);
    Labelled::forEachOf(samples.size(), jobs, [&](std::size_t i) {
        std::mt19937 random(static_cast<std::uint32_t>(i + 1));
        std::vector<double> drawn(report.persons);
        for (std::size_t k = 0; k < report.persons; ++k) ++drawn[random() % report.persons];
        samples[i] = sample(genuine, impostor, drawn);
    });
    report.equalErrorRate = interval(whole, samples, [](const Sampled& s) { return s.equal; });
    const WeightedPairs own(genuine, once), other(impostor, once);
    for (std::size_t i = 0; i < report.rates.size(); ++i) {
        report.trueAccepts[i] = interval(whole, samples, [i](const Sampled& s) { return s.accepts[i]; });
        report.thresholds[i] = other.threshold(report.rates[i]);
        report.requested[i] =
            strategy.ratesMapping()->requestFAR(static_cast<float>(report.rates[i])).value();
        report.achieved[i] = other.above(static_cast<float>(report.requested[i]));
    }
    constexpr double least = 1e-5, stepsPerDecade = 20;
    for (int i = 0; i <= -std::log10(least) * stepsPerDecade; ++i) {
        const double far = least * std::pow(10, i / stepsPerDecade);
        report.curve.emplace_back(far, 1 - own.above(other.threshold(far)));
    }
    return report;
}

IdentificationReport identify(const EnrolledPeople& people, const Cmp::Strategy& strategy, unsigned jobs) {
    std::vector<PersonRecord> gallery = people.galleries, probes;
    std::map<std::size_t, std::size_t> pictures;
    for (const PersonRecord& single : people.singles) ++pictures[single.person];
    std::size_t last = people.persons.size();
    for (const PersonRecord& single : people.singles) {
        const bool first = people.galleries.empty() && single.person != last;
        last = single.person;
        if (first && pictures[single.person] < 2) continue;
        (first ? gallery : probes).push_back(single);
    }
    if (gallery.empty() || probes.empty())
        FN_THROW(FNEBadArg, "There is nobody with more pictures than one record takes");

    IdentificationReport report;
    report.failures = people.failures;
    report.gallery = gallery.size();
    report.probes = probes.size();
    for (const auto* records : {&gallery, &probes})
        report.notEnrolled += static_cast<std::size_t>(
            std::ranges::count_if(*records, [](const PersonRecord& r) { return !r.record; }));
    std::vector<float> own(probes.size()), other(probes.size());
    std::vector<std::size_t> ranks(probes.size());
    compareAll(probes, gallery, strategy, jobs, [&](std::size_t probe, const std::vector<float>& scores) {
        own[probe] = other[probe] = rejected;
        for (std::size_t i = 0; i < scores.size(); ++i) {
            float& best = gallery[i].person == probes[probe].person ? own[probe] : other[probe];
            best = std::max(best, scores[i]);
        }
        ranks[probe] = 1;
        for (std::size_t i = 0; i < scores.size(); ++i)
            ranks[probe] += gallery[i].person != probes[probe].person && scores[i] >= own[probe];
    });
    const auto count = static_cast<double>(probes.size());
    report.rank1 = static_cast<double>(std::ranges::count(ranks, 1u)) / count;
    report.rank5 = static_cast<double>(std::ranges::count_if(ranks, [](auto r) { return r <= 5; })) / count;
    std::vector<float> thresholds = other;
    std::ranges::sort(thresholds, std::ranges::greater());
    const auto missesAt = [&](double rate) {
        const float threshold =
            thresholds[std::min(thresholds.size() - 1, static_cast<std::size_t>(rate * count))];
        std::size_t misses = 0;
        for (std::size_t i = 0; i < probes.size(); ++i) misses += own[i] <= threshold || ranks[i] > 1;
        return std::pair(static_cast<double>(misses) / count, static_cast<double>(threshold));
    };
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        std::tie(report.misses[i], report.thresholds[i]) = missesAt(report.rates[i]);
    for (const double rate : {0.001, 0.002, 0.005, 0.01, 0.02, 0.05, 0.1, 0.2, 0.5, 1.0})
        report.curve.emplace_back(rate, missesAt(rate).first);
    return report;
}

void print(const VerificationReport& report, std::ostream& stream) {
    stream << report.persons << " people, " << report.records << " records, " << report.notEnrolled
           << " of them could not be made; " << report.genuine << " genuine and " << report.impostor
           << " impostor pairs\n\n";
    const auto percent = [](const Interval& i) {
        return line("%6.2f %% (%.2f to %.2f)", 100 * i.value, 100 * i.least, 100 * i.most);
    };
    stream << "  equal error rate         " << percent(report.equalErrorRate) << "\n";
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        stream << line("  true accepts at FAR %-6g", report.rates[i]) << percent(report.trueAccepts[i])
               << line(", score %.4f", report.thresholds[i]) << "\n";
    stream << "\n";
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        stream << line("  requestFAR(%g): score %.4f, where the FAR is %.2g here, %.2f times that\n",
                       report.rates[i], report.requested[i], report.achieved[i],
                       report.achieved[i] / report.rates[i]);
}

void print(const IdentificationReport& report, std::ostream& stream) {
    stream << report.gallery << " people in the gallery, " << report.probes << " searches; "
           << report.notEnrolled << " records could not be made\n\n"
           << line("  rank 1  %6.2f %%\n  rank 5  %6.2f %%\n", 100 * report.rank1, 100 * report.rank5);
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        stream << line(
            "  misses  %6.2f %% where %g of the searches for strangers find somebody (score %.4f)\n",
            100 * report.misses[i], report.rates[i], report.thresholds[i]);
}

std::string toJson(const VerificationReport& report) {
    nlohmann::json json{{"persons", report.persons},
                        {"records", report.records},
                        {"not_enrolled", report.notEnrolled},
                        {"genuine", report.genuine},
                        {"impostor", report.impostor},
                        {"equal_error_rate", jsonOf(report.equalErrorRate)},
                        {"curve", report.curve},
                        {"failures", report.failures}};
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        json["rates"].push_back({{"far", report.rates[i]},
                                 {"true_accepts", jsonOf(report.trueAccepts[i])},
                                 {"threshold", report.thresholds[i]},
                                 {"requested_threshold", report.requested[i]},
                                 {"achieved_far", report.achieved[i]}});
    return json.dump(1);
}

std::string toJson(const IdentificationReport& report) {
    nlohmann::json json{
        {"gallery", report.gallery},  {"probes", report.probes}, {"not_enrolled", report.notEnrolled},
        {"rank1", report.rank1},      {"rank5", report.rank5},   {"curve", report.curve},
        {"failures", report.failures}};
    for (std::size_t i = 0; i < report.rates.size(); ++i)
        json["rates"].push_back(
            {{"fpir", report.rates[i]}, {"misses", report.misses[i]}, {"threshold", report.thresholds[i]}});
    return json.dump(1);
}

} // namespace Eval

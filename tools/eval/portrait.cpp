#include "eval/portrait.h"

#include "cmp/portrait/analyzer.h"
#include "fn/deployment/app_config_db.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/transform.h"
#include "img/affine/turns.h"
#include "labelled/found_eyes.h"
#include "labelled/portrait_truth.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace Eval {
namespace {

using Cmp::Portrait::Analyzer;
using Cmp::Portrait::Characteristics;

enum QuestionIndex {
    frontal,
    uniformLight,
    ordinaryLight,
    eyesOpen,
    eyeOpenByLids,
    gazeFrontal,
    mouthClosed,
    glasses,
    male,
    maleChild,
    white,
    black,
    asian,
    bestOfThree
};
enum QuantityIndex { age, agePerRange, chin, earLeft, earRight };

/// Thresholds are the defaults of the compliance and feature tests, with the sign of what is asked.
PortraitReport emptyReport() {
    return {{{"frontal, against yaw above 20 degrees", -0.42f},
             {"frontal light, against more than 45 degrees", 0.75f},
             {"light of any frontal portrait", 0.75f},
             {"eyes open (pictures of eyes)", -0.67f},
             {"eye open (by the lids' points)", -0.67f},
             {"gaze frontal (by both irises)", 0.5f},
             {"mouth closed", 0.5f},
             {"glasses", -0.8f},
             {"male, from 20 years on or of unknown age", 0},
             {"male, below 20 years", 0},
             {"white", 0},
             {"black", 0},
             {"asian", 0},
             {"largest ethnicity score is the right one", 0}},
            {{"age up to 80, years"},
             {"age by ranges, years"},
             {"chin, eye distances"},
             {"left ear, eye distances"},
             {"right ear, eye distances"}}};
}

/// Answers of one portrait.
class Judge {
public:
    Judge(const Characteristics& portrait, PortraitReport& report) : portrait_(portrait), report_(report) {}

    void ask(QuestionIndex question, float score, bool truth) {
        report_.questions[question].answers.push_back({score, truth});
    }
    void measure(QuantityIndex quantity, double measured, double truth) {
        report_.quantities[quantity].errors.push_back(static_cast<float>(measured - truth));
    }

    void judge(const Labelled::Row& row, const FNImageReference& image) {
        if (const auto pose = row.number("pose")) {
            ask(frontal, -portrait_.deviationFromFrontalPose(), *pose == 0);
            if (*pose == 0) ask(ordinaryLight, -portrait_.deviationFromUniformLighting(), true);
        }
        if (const auto light = Labelled::frontalLight(row))
            ask(uniformLight, -portrait_.deviationFromUniformLighting(), *light);
        if (const std::string text = row.text("glasses"); !text.empty())
            ask(glasses, portrait_.glasses(), text == "1");
        judgePerson(row);
        // Pictures under one lamp have the points of others of the same person.
        const auto points = Labelled::Points68::of(row);
        if (points && !row.number("light_azimuth")) judgePoints(row, *points, image);
    }

private:
    void judgePerson(const Labelled::Row& row) {
        constexpr double adult = 20, oldest = 80;
        const auto years = Labelled::ageOf(row);
        if (const std::string gender = row.text("gender"); !gender.empty())
            ask(years && *years < adult ? maleChild : male, portrait_.isMale(), gender == "m");
        if (years && *years <= oldest)
            measure(row.number("age") ? age : agePerRange, portrait_.age(), *years);
        const auto ethnicity = Labelled::ethnicityOf(row);
        if (!ethnicity || *ethnicity == Labelled::Ethnicity::other) return;
        const auto scores = portrait_.ethnicity();
        const float values[] = {scores.first, scores.second, scores.third};
        const auto truth = static_cast<std::size_t>(*ethnicity);
        for (const QuestionIndex q : {white, black, asian})
            ask(q, values[q - white], static_cast<std::size_t>(q - white) == truth);
        const auto best = static_cast<std::size_t>(std::max_element(values, values + 3) - values);
        ask(bestOfThree, best == truth ? 1.0f : -1.0f, true);
    }

    void judgePoints(const Labelled::Row& row, const Labelled::Points68& points,
                     const FNImageReference& image) {
        constexpr float openMouth = 0.1f, closedEye = 0.13f, openEye = 0.26f;
        constexpr float straight = 12, turned = 20;
        const float yaw = std::abs(points.yaw());
        if (!row.number("pose") && (yaw < straight || yaw > turned))
            ask(frontal, -portrait_.deviationFromFrontalPose(), yaw < straight);
        ask(mouthClosed, portrait_.mouthClosed(), points.lipGap() <= openMouth);
        for (const Labelled::Side side : {Labelled::Side::left, Labelled::Side::right}) {
            // The values of eye0 are read from the right side of the portrait.
            const bool first = side == Labelled::Side::right;
            const float opening = points.eyeOpening(side);
            if (opening < closedEye || opening > openEye)
                ask(eyeOpenByLids, first ? portrait_.eye0Open() : portrait_.eye1Open(), opening > openEye);
        }
        judgeGaze(points, image);
        const auto extent = points.extent(portrait_.eye0(), portrait_.eye1());
        const float d = portrait_.eyeDistance();
        measure(chin, portrait_.chin() / d, extent.chin);
        measure(earLeft, portrait_.ear0() / d, extent.left);
        measure(earRight, portrait_.ear1() / d, extent.right);
    }

    /// Where a single iris is seen is often wrong; what both tell is mostly right.
    void judgeGaze(const Labelled::Points68& points, const FNImageReference& image) {
        constexpr float ahead = 0.08f, away = 0.16f;
        const FNImage<float> gray = image.toMonoFloat();
        const auto left = points.irisOffset(gray, Labelled::Side::left),
                   right = points.irisOffset(gray, Labelled::Side::right);
        if (!left || !right) return;
        const auto [nearer, farther] = std::minmax({std::abs(*left), std::abs(*right)});
        if (farther < ahead || (nearer > away && *left * *right > 0))
            ask(gazeFrontal, std::min(portrait_.eye0GazeFrontal(), portrait_.eye1GazeFrontal()),
                farther < ahead);
    }

    const Characteristics& portrait_;
    PortraitReport& report_;
};

Analyzer makeAnalyzer(const std::string& etc) {
    using namespace Fn::Deployment;
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("Analyzer.DataDir", etc + "/portrait");
    return Analyzer(Component(db, Property(type<Analyzer>(), "Analyzer", "", "", false)));
}

/// A portrait with nothing but one eye, twice: as it is, and mirrored. How large it is in its picture, and
/// where, is what holds on average.
Cmp::Face faceOfEye(const FNImage<float>& eye) {
    constexpr std::int32_t size = 24, leftX = 38, rightX = 70, y = 32;
    constexpr float centreY = 0.6f;
    FNImage<float> scaled(size, size), portrait(108, 108);
    Img::Affine::transform(eye, scaled);
    const FNImage<float> mirrored = Img::Affine::vertReflection(scaled, scaled.box());
    portrait.fill(0.5f);
    const auto top = y - static_cast<std::int32_t>(std::lround(centreY * size));
    for (std::int32_t j = 0; j < size; ++j)
        for (std::int32_t i = 0; i < size; ++i) {
            portrait.set({leftX - size / 2 + i, top + j}, scaled.get({i, j}));
            portrait.set({rightX - size / 2 + i, top + j}, mirrored.get({i, j}));
        }
    return {FNImageReferenceFactory::create(portrait),
            {{static_cast<float>(leftX), static_cast<float>(y)}, 0, 0},
            {{static_cast<float>(rightX), static_cast<float>(y)}, 0, 0}};
}

class Measurement {
public:
    explicit Measurement(const std::string& etc) : find_(etc), analyzer_(makeAnalyzer(etc)) {}

    /// @return whether our finders found the face; nothing for a row without eyes
    std::optional<bool> judge(const Labelled::Row& row, PortraitReport& report) const {
        const FNImageReference image = Fn::readImage(row.image().string());
        if (const std::string open = row.text("eyes_open"); !open.empty()) {
            const Characteristics portrait = analyzer_.analyze(faceOfEye(image.toMonoFloat()));
            Judge(portrait, report).ask(eyesOpen, portrait.eye1Open(), open == "1");
            return false;
        }
        const auto left = row.position("eye_left"), right = row.position("eye_right");
        if (!left || !right || !(left->x < right->x)) return {};
        const auto eyes = find_(image, *left, *right);
        const Characteristics portrait =
            analyzer_.analyze(Cmp::Face(image, {eyes.left, 0, 0}, {eyes.right, 0, 0}));
        Judge(portrait, report).judge(row, image);
        return eyes.found;
    }

private:
    Labelled::EyesAsFound find_;
    Analyzer analyzer_;
};

void addTo(PortraitReport& report, const PortraitReport& more) {
    if (report.questions.empty()) report = emptyReport();
    for (std::size_t q = 0; q < report.questions.size(); ++q)
        report.questions[q].answers.insert(report.questions[q].answers.end(),
                                           more.questions[q].answers.begin(),
                                           more.questions[q].answers.end());
    for (std::size_t q = 0; q < report.quantities.size(); ++q)
        report.quantities[q].errors.insert(report.quantities[q].errors.end(),
                                           more.quantities[q].errors.begin(),
                                           more.quantities[q].errors.end());
}

double balancedAt(const Question& question, float threshold) {
    Question moved = question;
    moved.threshold = threshold;
    return moved.balanced();
}

void printReport(const PortraitReport& report, std::ostream& stream) {
    char line[200];
    for (const Question& q : report.questions) {
        if (q.answers.empty()) continue;
        std::snprintf(line, sizeof line, "  %-44.44s %6zu %6zu %7.1f %7.1f %8.1f %8.1f\n", q.name.c_str(),
                      q.count(true), q.count(false), 100 * q.right(true), 100 * q.right(false),
                      100 * q.balanced(), 100 * q.bestBalanced());
        stream << line;
    }
    for (const Quantity& q : report.quantities) {
        if (q.errors.empty()) continue;
        std::snprintf(line, sizeof line, "  %-44.44s %6zu   mean error %.3f, mean difference %+.3f\n",
                      q.name.c_str(), q.errors.size(), q.meanError(), q.bias());
        stream << line;
    }
}

nlohmann::json jsonOf(const PortraitReport& report) {
    nlohmann::json json = nlohmann::json::object();
    for (const Question& q : report.questions)
        if (!q.answers.empty())
            json[q.name] = {{"yes", q.count(true)},
                            {"no", q.count(false)},
                            {"yes_right", q.right(true)},
                            {"no_right", q.right(false)},
                            {"threshold", q.threshold},
                            {"balanced", q.balanced()},
                            {"balanced_at_best", q.bestBalanced()}};
    for (const Quantity& q : report.quantities)
        if (!q.errors.empty())
            json[q.name] = {
                {"count", q.errors.size()}, {"mean_error", q.meanError()}, {"mean_difference", q.bias()}};
    return json;
}

} // namespace

std::size_t Question::count(bool truth) const {
    return static_cast<std::size_t>(
        std::count_if(answers.begin(), answers.end(), [&](const Answer& a) { return a.truth == truth; }));
}

double Question::right(bool truth) const {
    const auto told = std::count_if(answers.begin(), answers.end(), [&](const Answer& a) {
        return a.truth == truth && (a.score > threshold) == truth;
    });
    const std::size_t all = count(truth);
    return all == 0 ? 1 : static_cast<double>(told) / static_cast<double>(all);
}

double Question::balanced() const {
    if (count(false) == 0) return right(true);
    return count(true) == 0 ? right(false) : (right(true) + right(false)) / 2;
}

double Question::bestBalanced() const {
    std::vector<float> scores;
    for (const Answer& answer : answers) scores.push_back(answer.score);
    std::sort(scores.begin(), scores.end());
    constexpr std::size_t steps = 200;
    double best = balanced();
    if (count(true) == 0 || count(false) == 0) return best;
    for (std::size_t i = 0; i < steps && !scores.empty(); ++i)
        best = std::max(best, balancedAt(*this, scores[i * scores.size() / steps]));
    return best;
}

double Quantity::meanError() const {
    double sum = 0;
    for (const float error : errors) sum += static_cast<double>(std::abs(error));
    return sum / static_cast<double>(std::max<std::size_t>(errors.size(), 1));
}

double Quantity::bias() const {
    double sum = 0;
    for (const float error : errors) sum += static_cast<double>(error);
    return sum / static_cast<double>(std::max<std::size_t>(errors.size(), 1));
}

PortraitReports measurePortraits(const std::string& etc, const Labelled::Selection& selection) {
    std::vector<Labelled::Row> rows;
    for (const std::string& labels : selection.labels)
        for (const Labelled::Row& row : Labelled::readLabels(labels))
            if (!selection.split || Labelled::splitOf(row.splitKey()) == *selection.split)
                rows.push_back(row);
    struct Judged {
        PortraitReport report = emptyReport();
        std::optional<bool> found;
        std::string failure;
    };
    std::vector<Judged> judged(rows.size());
    const Measurement measurement(etc);
    Labelled::forEachOf(rows.size(), selection.jobs, [&](std::size_t i) {
        try {
            judged[i].found = measurement.judge(rows[i], judged[i].report);
        } catch (const std::exception& e) {
            judged[i].failure = rows[i].image().string() + ": " + e.what();
        }
    });
    PortraitReports reports;
    reports.all = emptyReport();
    for (std::size_t i = 0; i < rows.size(); ++i) {
        if (!judged[i].failure.empty()) reports.failures.push_back(judged[i].failure);
        if (!judged[i].found) continue;
        ++reports.portraits;
        reports.found += *judged[i].found;
        addTo(reports.all, judged[i].report);
        if (!selection.groupColumn.empty()) {
            const std::string group = rows[i].text(selection.groupColumn);
            addTo(reports.groups[group.empty() ? "unknown" : group], judged[i].report);
        }
    }
    return reports;
}

void printPortraits(const PortraitReports& reports, std::ostream& stream) {
    stream << reports.portraits << " portraits, the eyes of " << reports.found << " found by the finders\n\n";
    char line[200];
    std::snprintf(line, sizeof line, "  %-44s %6s %6s %7s %7s %8s %8s\n", "", "yes", "no", "right", "right",
                  "balanced", "at best");
    stream << line;
    printReport(reports.all, stream);
    for (const auto& [group, report] : reports.groups) {
        stream << "\n  " << group << "\n";
        printReport(report, stream);
    }
}

std::string portraitsJson(const PortraitReports& reports) {
    nlohmann::json json{{"portraits", reports.portraits},
                        {"found", reports.found},
                        {"all", jsonOf(reports.all)},
                        {"groups", nlohmann::json::object()},
                        {"failures", reports.failures}};
    for (const auto& [group, report] : reports.groups) json["groups"][group] = jsonOf(report);
    return json.dump(1);
}

} // namespace Eval

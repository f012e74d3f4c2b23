#include "eval/life.h"

#include "fn/exception.h"
#include "fn/imagefile/image_file.h"
#include "labelled/finder_access.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <mutex>
#include <set>

#include <nlohmann/json.hpp>

namespace Eval {
namespace {

struct EyesInFrame {
    FNImage<unsigned char> image;
    FacialFeatureLocation left, right;
};

using Rows = std::vector<Labelled::Row>;

/// The rows of each take, in the order of its frames.
std::map<std::string, Rows> takesOf(const Labelled::Selection& selection) {
    std::map<std::string, Rows> takes;
    for (const std::string& labels : selection.labels)
        for (const Labelled::Row& row : Labelled::readLabels(labels)) {
            if (row.text("sequence").empty() || !row.number("live"))
                FN_THROW(FNEBadFormat,
                         labels + ": has a row without a sequence, or without whether it is live");
            if (!selection.split || Labelled::splitOf(row.splitKey()) == *selection.split)
                takes[row.text("sequence")].push_back(row);
        }
    for (auto& [name, rows] : takes)
        std::ranges::sort(rows, {}, [](const Labelled::Row& row) { return row.number("frame").value_or(0); });
    return takes;
}

/// The greatest threshold at which two frames pass, if it is greater than `least`, which is returned
/// otherwise.
int reachOf(const EyesInFrame& first, const EyesInFrame& later, Cmp::LifeChecker::Settings settings,
            int least) {
    constexpr int bitsOfAPixel = 8;
    const auto passes = [&](int threshold) {
        settings.threshold = threshold;
        return Cmp::LifeChecker(settings).test(later.image, later.left, later.right, first.image, first.left,
                                               first.right);
    };
    int low = least, high = settings.templateWidth * settings.templateHeight * bitsOfAPixel + 1;
    if (!passes(low + 1)) return low;
    for (++low; high - low > 1;) {
        const int middle = (low + high) / 2;
        (passes(middle) ? low : high) = middle;
    }
    return low;
}

} // namespace

LifeReport measureLife(const std::string& etc, const Labelled::Selection& selection,
                       const EyeDistances& eyeDistances, const Cmp::LifeChecker::Settings& settings) {
    const std::map<std::string, Rows> rowsOf = takesOf(selection);
    const Kx::Implementation::EyeFinder finder(Labelled::makeFaceFinder(etc),
                                               Labelled::makeEyesFinder(etc, "Strict"), false);
    LifeReport report;
    for (const auto& [name, rows] : rowsOf)
        report.takes.push_back(
            {name, rows.front().text("person"), rows.front().number("live") == 1, rows.size()});
    std::mutex mutex; // guards the failures
    Labelled::forEachOf(report.takes.size(), selection.jobs, [&](std::size_t i) {
        LifeTake& take = report.takes[i];
        std::vector<EyesInFrame> first;
        for (const Labelled::Row& row : rowsOf.at(take.sequence)) try {
                const FNImageReference image = Fn::readImage(row.image().string());
                EyesInFrame frame{image.toMono8(), {}, {}};
                if (finder.find(image, frame.left, frame.right, eyeDistances.least, eyeDistances.most) !=
                    Kx::Implementation::EyeFinder::BothEyes)
                    continue;
                ++take.withEyes;
                if (first.empty())
                    first.push_back(frame);
                else
                    take.reach = reachOf(first.front(), frame, settings, take.reach);
            } catch (const FNException& e) {
                const std::lock_guard lock(mutex);
                report.failures.push_back(row.image().string() + ": " + e.what());
            }
    });
    return report;
}

void printLife(const LifeReport& report, const std::vector<int>& thresholds, std::ostream& stream) {
    std::set<std::string> people;
    long live = 0;
    for (const LifeTake& take : report.takes) {
        people.insert(take.person);
        live += take.live;
    }
    const long photos = static_cast<long>(report.takes.size()) - live;
    stream << live << " takes of living faces and " << photos << " of photos, of " << people.size()
           << " people\n\n"
           << "threshold  alive  photos that pass\n";
    for (const int threshold : thresholds) {
        const auto passing = [&](bool alive) {
            return std::ranges::count_if(report.takes, [&](const LifeTake& take) {
                return take.live == alive && take.reach >= threshold;
            });
        };
        char line[100];
        std::snprintf(line, sizeof line, "%9d  %2ld/%-2ld  %2ld/%-2ld\n", threshold,
                      static_cast<long>(passing(true)), live, static_cast<long>(passing(false)), photos);
        stream << line;
    }
    stream << "\ntake                    alive  frames  with eyes  passes up to\n";
    for (const LifeTake& take : report.takes) {
        char line[200];
        std::snprintf(line, sizeof line, "%-22s  %5s  %6zu  %9zu  %12d\n", take.sequence.c_str(),
                      take.live ? "yes" : "no", take.frames, take.withEyes, take.reach);
        stream << line;
    }
}

std::string lifeJson(const LifeReport& report) {
    nlohmann::json takes = nlohmann::json::array();
    for (const LifeTake& take : report.takes)
        takes.push_back({{"sequence", take.sequence},
                         {"person", take.person},
                         {"live", take.live},
                         {"frames", take.frames},
                         {"with_eyes", take.withEyes},
                         {"passes_up_to", take.reach}});
    return nlohmann::json{{"takes", takes}}.dump(1) + "\n";
}

} // namespace Eval

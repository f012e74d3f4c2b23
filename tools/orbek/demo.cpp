// orbek demo: enrols the people of a folder, verifies and identifies pictures that were kept back, and makes
// a page of it.

#include "command.h"
#include "configuration_file.h"
#include "demo_page.h"
#include "enrolment.h"
#include "gallery_import.h"
#include "gallery_search.h"
#include "parallel.h"
#include "record_file.h"
#include "whole_file.h"

#include <algorithm>
#include <chrono>
#include <memory>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
namespace fs = std::filesystem;

struct DemoOptions : CommonOptions {
    std::string photos;
    std::string folder = "demo";
    float far = 0.001f;
    unsigned int jobs = 0;
};

constexpr std::size_t shownCandidates = 3;
/// From so many people on, one is left out of the gallery, to be a stranger.
constexpr std::size_t enoughForStranger = 4;

/// "bob" for bob1.jpg, bob-2.jpg and bob_0003.jpg.
std::string personOf(const fs::path& file) {
    const std::string name = file.stem().string();
    const std::size_t last = name.find_last_not_of("0123456789");
    const std::size_t end = last == std::string::npos ? last : name.find_last_not_of("-_ .", last);
    return end == std::string::npos ? name : name.substr(0, end + 1);
}

/// The people of a folder: a folder for each, or pictures that are named after them.
std::vector<PictureTree::Folder> peopleIn(const std::string& photos, Output& output) {
    const bool folders =
        std::ranges::any_of(fs::directory_iterator(photos),
                            [](const fs::directory_entry& entry) { return entry.is_directory(); });
    if (folders) {
        const PictureTree tree = picturesBelow(photos);
        for (const std::string& complaint : tree.complaints) output.complaint(complaint);
        return tree.folders;
    }
    std::vector<PictureTree::Folder> people;
    for (const fs::path& file : pictureFiles({photos})) {
        const std::string name = personOf(file);
        const auto known = std::ranges::find(people, name, &PictureTree::Folder::name);
        if (known != people.end())
            known->pictures.push_back(file);
        else
            people.push_back({name, {file}});
    }
    return people;
}

/// Who is enrolled with which pictures, and which are kept back: of each person with several the last one,
/// and the last person as a stranger.
Demonstration plan(std::vector<PictureTree::Folder> people, float far) {
    Demonstration plan;
    plan.far = far;
    std::optional<PictureTree::Folder> stranger;
    if (people.size() >= enoughForStranger) {
        stranger = people.back();
        people.pop_back();
    }
    for (auto& [name, pictures] : people) {
        if (pictures.size() > 1) {
            plan.probes.push_back({name, {pictures.back(), {}}, plan.people.size(), {}, {}});
            pictures.pop_back();
        }
        plan.people.push_back({name, {}, false});
        for (const fs::path& picture : pictures) plan.people.back().pictures.push_back({picture, {}});
    }
    if (stranger) plan.probes.push_back({stranger->name, {stranger->pictures.front(), {}}, {}, {}, {}});
    return plan;
}

std::optional<Eyes::Location> eyesOf(const Json& picture) {
    const Json& eyes = picture.at("eyes");
    if (eyes.is_null()) return {};
    const auto place = [&](const char* eye) { return eyes.at(eye).get<std::array<float, 3>>(); };
    const auto left = place("left"), right = place("right");
    Eyes::Location location{};
    location.first = {left[0], left[1]};
    location.second = {right[0], right[1]};
    return location;
}

/// A record of some pictures, in which the eyes are filled in.
std::optional<FIR> enrol(const Enrollment::Processor& processor, std::span<Demonstration::Picture> pictures,
                         Output& output) {
    std::vector<fs::path> files;
    for (const auto& picture : pictures) files.push_back(picture.file);
    const auto tell = [&](const Json& told) {
        const auto picture = std::ranges::find(pictures, fs::path(told.at("file").get<std::string>()),
                                               &Demonstration::Picture::file);
        picture->eyes = eyesOf(told);
        picture->readable = true;
    };
    try {
        return enrolPictures(processor, files, output, tell);
    } catch (const std::exception& e) {
        output.complaint(files.front().string(), e.what());
        return {};
    }
}

int demonstrate(const DemoOptions& options) {
    const auto begin = std::chrono::steady_clock::now();
    Output output(options);
    Demonstration demo = plan(peopleIn(options.photos, output), options.far);
    const Configuration configuration = openConfiguration(options.configuration);
    const FIRBuilder builder(configuration);
    demo.threshold = ScoreMappings(configuration).requestFAR(options.far);
    std::vector<Enrollment::Processor> processors;
    for (unsigned int i = 0; i < options.jobs; ++i) processors.emplace_back(configuration);

    fs::create_directories(options.folder);
    const fs::path galleryName = fs::path(options.folder) / "people.gallery";
    fs::remove(galleryName);
    GalleryFile::create(galleryName.string());
    GalleryFile gallery(galleryName.string());
    std::vector<std::optional<FIR>> records(demo.people.size()), probes(demo.probes.size());
    inParallel(options.jobs, records.size() + probes.size(), [&](std::size_t thread, std::size_t i) {
        if (i < records.size())
            records[i] = enrol(processors[thread], demo.people[i].pictures, output);
        else
            probes[i - records.size()] =
                enrol(processors[thread], std::span(&demo.probes[i - records.size()].picture, 1), output);
    });

    std::vector<GalleryFile::Entry> entries;
    std::size_t pictures = 0;
    for (std::size_t i = 0; i < records.size(); ++i) {
        Demonstration::Person& person = demo.people[i];
        pictures += person.pictures.size();
        person.enrolled = records[i].has_value();
        if (person.enrolled)
            entries.push_back(entryOf(person.name, *records[i]));
        else
            output.complaint(person.name, "not enrolled, too few usable pictures");
        output.result(
            {{"id", person.name}, {"pictures", person.pictures.size()}, {"enrolled", person.enrolled}});
    }
    (void)gallery.add(entries, GalleryFile::Present::Kept, builder);
    if (entries.empty()) throw UnreadableInput(options.photos + ": nobody could be enrolled");

    const GallerySearch search(configuration, options.jobs);
    const FacialMatchingEngine engine(configuration);
    for (std::size_t i = 0; i < probes.size(); ++i) {
        Demonstration::Probe& probe = demo.probes[i];
        Json told = {{"file", probe.picture.file.string()}};
        if (!probes[i]) {
            output.complaint(probe.picture.file.string(), "no eyes found");
            continue;
        }
        if (probe.person && demo.people[*probe.person].enrolled) {
            probe.score = engine.compare(*records[*probe.person], *probes[i]);
            told["claimed"] = probe.name;
            told["score"] = rounded(*probe.score, 6);
            told["match"] = *probe.score > demo.threshold;
        }
        const std::list<Match> matches = search.bestMatches(*probes[i], gallery, 0.0f, shownCandidates);
        for (const Match& match : matches) {
            const auto person = std::ranges::find(demo.people, match.name, &Demonstration::Person::name);
            probe.candidates.push_back({static_cast<std::size_t>(person - demo.people.begin()), match.score});
        }
        const bool found = !matches.empty() && matches.front().score > demo.threshold;
        told["identified"] = found ? Json(matches.front().name) : Json();
        if (found) told["candidate_score"] = rounded(matches.front().score, 6);
        output.result(told);
    }
    demo.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
    const fs::path page = fs::path(options.folder) / "index.html";
    writeWhole(page.string(), demonstrationPage(demo));
    output.result({{"page", page.string()},
                   {"gallery", galleryName.string()},
                   {"people", entries.size()},
                   {"pictures", pictures},
                   {"threshold", rounded(demo.threshold, 6)},
                   {"seconds", rounded(demo.seconds, 2)}});
    return output.complained() ? unreadable : done;
}

} // namespace

Command demoCommand(CLI::App& program) {
    const auto options = std::make_shared<DemoOptions>();
    CLI::App* const app = addCommand(
        program, "demo",
        "Enrol the people of a folder, compare pictures that were kept back, and make a page to look at.\n"
        "Each folder below it is one person; without folders, pictures are named after people: bob1.jpg.\n"
        "Exit status: 0 done, 1 failed, 2 a picture could not be used.",
        *options);
    app->add_option("photos", options->photos, "Folder of photos")
        ->required()
        ->check(CLI::ExistingDirectory)
        ->type_name("DIR");
    app->add_option("-o,--output", options->folder,
                    "Folder for index.html and people.gallery, which are replaced")
        ->type_name("DIR")
        ->capture_default_str();
    addShare(*app, "--far", options->far, "Share of other people that may be taken for a person");
    addJobs(*app, options->jobs);
    return {app, [options] { return demonstrate(*options); }};
}

} // namespace Orbek::Tool

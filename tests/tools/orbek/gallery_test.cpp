#include "gallery_search.h"
#include "recognition_tool.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <set>
#include <thread>

#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using Ids = std::set<std::string>;

class GalleryToolWithModels : public RecognitionToolWithModels {
protected:
    static Ids ids(const std::string& gallery) {
        Ids ids;
        for (const auto& line : run({"gallery", "list", gallery}).lines()) ids.insert(line["id"]);
        return ids;
    }
    static Ids idsOf(const ProgramRun& run) {
        Ids ids;
        for (const auto& line : run.lines())
            if (line.contains("id")) ids.insert(line["id"]);
        return ids;
    }
    /// Folders of one picture each, with the ids.
    static Ids makeTree(const ScratchFolder& scratch, const std::string& name) {
        Ids ids;
        for (const auto& entry : fs::directory_iterator(image(""))) {
            if (!entry.path().filename().string().ends_with("1.jpg")) continue;
            const std::string id = name + "/" + entry.path().stem().string();
            fs::create_directories(scratch.path() / id);
            fs::copy_file(entry.path(), scratch.path() / id / "1.jpg");
            ids.insert(entry.path().stem().string());
        }
        return ids;
    }
    static std::string emptyGallery(const ScratchFolder& scratch) {
        EXPECT_EQ(run({"gallery", "create", scratch.file("g")}).status, 0);
        return scratch.file("g");
    }
    static void change(const std::string& gallery, const std::string& sql) {
        sqlite3* database = nullptr;
        ASSERT_EQ(sqlite3_open(gallery.c_str(), &database), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(database, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK) << sql;
        sqlite3_close(database);
    }
};

TEST_F(GalleryToolWithModels, PeopleOfAFolderTreeAreFound) {
    const ScratchFolder scratch;
    const std::string gallery = emptyGallery(scratch);
    for (const char* name : {"alice1", "bob1", "bob2"}) {
        const fs::path folder = scratch.path() / "tree/class" / std::string(name, std::strlen(name) - 1);
        fs::create_directories(folder);
        fs::copy_file(image(std::string(name) + ".jpg"), folder / (std::string(name) + ".jpg"));
    }
    const std::string broken = scratch.write("tree/class/bob/broken.jpg", "nothing"),
                      faceless =
                          scratch.write("tree/class/alice/f.pgm", "P5\n4 4\n255\n" + std::string(16, 9));
    fs::create_directories(scratch.path() / "tree/nobody");
    fs::copy_file(faceless, scratch.path() / "tree/nobody/f.pgm");
    fs::copy_file(faceless, scratch.path() / "tree/f.pgm");
    const ProgramRun imported = run({"gallery", "import", gallery, scratch.file("tree"), "--jobs", "2"});
    EXPECT_EQ(imported.status, 2);
    for (const std::string& complaint :
         {broken + ": ", faceless + ": no eyes found\n", scratch.file("tree") + ": 1 image files outside",
          std::string("nobody: not enrolled, too few usable pictures\n")})
        EXPECT_NE(imported.complaints.find("orbek: " + complaint), std::string::npos) << complaint;
    EXPECT_EQ(ids(gallery), (Ids{"class/alice", "class/bob"}));
    const auto lines = imported.lines();
    EXPECT_EQ(lines.back(), nlohmann::json({{"enrolled", 2}, {"present", 0}, {"failed", 1}}));
    const auto bob = std::ranges::find_if(lines, [](const auto& line) { return line["id"] == "class/bob"; });
    EXPECT_EQ((*bob)["pictures"], 3);
    EXPECT_EQ((*bob)["usable"], 2);
    EXPECT_EQ(run({"gallery", "import", gallery, scratch.file("tree")}).lines().back()["present"], 2);

    const ProgramRun found = run({"identify", gallery, image("bob2.jpg"), broken, "--far", "0.99"});
    EXPECT_EQ(found.status, 0);
    EXPECT_EQ(found.complaints, "") << "the second picture is not asked";
    EXPECT_EQ(found.lines().at(1)["matches"][0]["id"], "class/bob");
    EXPECT_EQ(run({"identify", gallery, image("bob2.jpg"), "--far", "1", "--top", "1"})
                  .lines()[1]["matches"]
                  .size(),
              1u);
    const ProgramRun nobody = run({"identify", gallery, image("erik1.jpg"), "--far", "0"});
    EXPECT_EQ(nobody.status, 1);
    EXPECT_TRUE(nobody.lines().at(1)["matches"].empty());
    EXPECT_EQ(run({"identify", gallery, faceless, broken}).status, 2);

    EXPECT_EQ(run({"gallery", "add", gallery, "bob", record(scratch, "bob3")}).status, 0);
    EXPECT_EQ(run({"gallery", "add", gallery, "bob", image("bob4.jpg")}).complaints,
              "orbek: " + gallery + ": has \"bob\" already\n");
    EXPECT_EQ(run({"gallery", "add", gallery, "bob", image("bob4.jpg"), "--replace"}).status, 0);
    const ProgramRun removed = run({"gallery", "remove", gallery, "class/bob", "carl", "class/alice"});
    EXPECT_EQ(removed.status, 2);
    EXPECT_EQ(removed.complaints, "orbek: " + gallery + ": has no \"carl\"\n");
    EXPECT_EQ(ids(gallery), Ids{"bob"});
}

TEST_F(GalleryToolWithModels, ASearchInPartsFindsWhatOneInMemoryFinds) {
    using namespace Orbek;
    const ScratchFolder scratch;
    const std::string file = scratch.file("g");
    Configuration configuration(folder().file("b7.conf"));
    const FIRBuilder builder(configuration);
    std::vector<std::string> people;
    for (const char* name : {"alice1", "bob1", "carl1", "erik1", "bob2"}) {
        (void)record(scratch, name);
        people.push_back(scratch.read(std::string(name) + ".fir"));
    }
    std::vector<Tool::GalleryFile::Entry> entries; // those of one person have the same scores
    for (std::size_t i = 0; i < 2500; ++i) entries.push_back({std::to_string(i), people[i % 4]});
    Tool::GalleryFile::create(file);
    Tool::GalleryFile gallery(file);
    (void)gallery.add(entries, Tool::GalleryFile::Present::Kept, builder);
    (void)gallery.remove({"0", "7", "1023", "1024", "2001"});
    change(file,
           "UPDATE entry SET rowid = 9e18 WHERE id = '2499'; UPDATE entry SET rowid = -9e18 WHERE id = '9'");

    const auto recordOf = [&](const std::string& person) {
        return builder.build(reinterpret_cast<const unsigned char*>(person.data()),
                             static_cast<unsigned int>(person.size()));
    };
    const FIR probe = recordOf(people[4]);
    const std::string normalization = "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.ScoreNormalization";
    for (const char* choice : {"Disabled", "Enabled"}) {
        configuration.setValue(normalization, choice);
        const Configuration chosen = configuration;
        Population all(chosen);
        for (const std::string& id : gallery.ids()) all.append(recordOf(people[std::stoul(id) % 4]), id);
        for (const unsigned int top : {1u, 700u, 3000u}) {
            const auto expected = FacialMatchingEngine(chosen).bestMatches(probe, all, 0.0f, top);
            const auto found = Tool::GallerySearch(chosen, 3).bestMatches(probe, gallery, 0.0f, top);
            ASSERT_EQ(found.size(), std::min(top, 2495u)) << choice;
            ASSERT_EQ(expected->size(), found.size()) << choice;
            // The one that has no other to be compared with at once is rounded in another way.
            EXPECT_TRUE(std::ranges::equal(*expected, found, [](const Match& a, const Match& b) {
                return std::abs(a.score - b.score) < 1e-5f;
            })) << choice;
            Ids names;
            for (const Match& match : found) names.insert(match.name);
            EXPECT_EQ(names.size(), found.size()) << choice;
        }
    }
}

TEST_F(GalleryToolWithModels, HasAllThatAKilledImportTold) {
    const ScratchFolder scratch;
    const std::string gallery = emptyGallery(scratch);
    const Ids people = makeTree(scratch, "tree");
    for (const std::size_t told : {1u, 2u, 5u}) {
        (void)std::fflush(stdout);
        scratch.write("told", ""); // what the run before has told does not count
        const std::size_t left = people.size() - ids(gallery).size();
        const pid_t child = fork();
        if (child == 0) {
            (void)!freopen(scratch.file("told").c_str(), "w", stdout);
            const std::string config = folder().file("b7.conf");
            execl(ORBEK_BINARY_DIR "/bin/orbek", "orbek", "gallery", "import", gallery.c_str(),
                  scratch.file("tree").c_str(), "--json", "--config", config.c_str(), nullptr);
            _exit(127);
        }
        const auto lines = [&] { return std::ranges::count(scratch.read("told"), '\n'); };
        for (; waitpid(child, nullptr, WNOHANG) == 0; usleep(1000))
            if (static_cast<std::size_t>(lines()) >= told) kill(child, SIGKILL);
        const std::string text = scratch.read("told");
        const Ids before = idsOf({0, text.substr(0, text.rfind('\n') + 1), ""}), there = ids(gallery);
        EXPECT_GE(before.size(), std::min(told, left));
        EXPECT_TRUE(std::ranges::includes(there, before)) << there.size() << " of " << before.size();
        EXPECT_LE(there.size(), people.size());
    }
    EXPECT_EQ(run({"gallery", "import", gallery, scratch.file("tree")}).status, 0);
    EXPECT_EQ(ids(gallery), people);
    EXPECT_EQ(run({"identify", gallery, image("carl1.jpg"), "--far", "0.9"}).status, 0);
}

TEST_F(GalleryToolWithModels, SeveralProcessesWriteAndReadAtOnce) {
    const ScratchFolder scratch;
    const std::string gallery = emptyGallery(scratch);
    const Ids people = makeTree(scratch, "tree");
    makeTree(scratch, "all/again");
    std::vector<ProgramRun> runs(4);
    {
        std::vector<std::jthread> threads;
        for (std::size_t i = 0; i < runs.size(); ++i)
            threads.emplace_back([&, i] {
                if (i < 2)
                    runs[i] = run({"gallery", "import", gallery, scratch.file(i == 0 ? "tree" : "all")});
                else if (i == 2)
                    runs[i] = run({"gallery", "import", gallery, scratch.file("tree")});
                else
                    for (int k = 0; k < 6; ++k) {
                        runs[i] = run({"identify", gallery, image("carl1.jpg"), "--far", "0.5"});
                        if (runs[i].status > 1) break;
                    }
            });
    }
    for (const ProgramRun& run : runs) EXPECT_LE(run.status, 1) << run.complaints;
    Ids all = people;
    for (const std::string& id : people) all.insert("again/" + id);
    EXPECT_EQ(ids(gallery), all);
    std::size_t enrolled = 0;
    for (const ProgramRun& run : {runs[0], runs[1], runs[2]})
        enrolled += run.lines().back()["enrolled"].get<std::size_t>();
    EXPECT_EQ(enrolled, all.size()) << "each by one of the processes";
}

TEST_F(GalleryToolWithModels, FilesThatAreNoGalleriesAreNamed) {
    const ScratchFolder scratch;
    const std::string gallery = emptyGallery(scratch);
    EXPECT_EQ(run({"gallery", "create", gallery}).complaints, "orbek: " + gallery + ": exists already\n");
    EXPECT_EQ(run({"gallery", "create", "/no/such/g"}).status, 1);
    const std::string bob = record(scratch, "bob1");
    for (const char* id : {"a", "b", "c", "d", "e", "f", "g", "h", "i", "j", "k", "l", "m"})
        ASSERT_EQ(run({"gallery", "add", gallery, id, bob}).status, 0);
    const std::string whole = scratch.read("g");
    std::string damaged = whole;
    std::fill(damaged.begin() + 40000, damaged.begin() + 70000, 'x');
    struct Case {
        const char* name;
        std::string content, complaint;
    };
    for (const auto& [name, content, complaint] :
         {Case{"text", std::string(1000, 'x'), "is not a gallery"}, Case{"empty", "", "is not a gallery"},
          Case{"cut", whole.substr(0, 65536), "is damaged"}, Case{"damaged", damaged, "is damaged"}}) {
        const std::string file = scratch.write(name, content);
        const ProgramRun run = this->run({"identify", file, image("bob1.jpg")});
        EXPECT_EQ(run.status, 2) << name;
        EXPECT_EQ(run.complaints.rfind("orbek: " + file + ": " + complaint, 0), 0u) << run.complaints;
        EXPECT_EQ(this->run({"gallery", "add", file, "n", bob}).status, 2) << name;
    }
    EXPECT_EQ(run({"gallery", "list", "/no/such.gallery"}).complaints,
              "orbek: /no/such.gallery: cannot be used (No such file or directory)\n");

    // Records of another generation, and a table beside ours.
    std::string other = scratch.read("bob1.fir"), hex;
    other.replace(other.find("B7"), 2, "Z9");
    for (const char c : other) {
        constexpr const char* digits = "0123456789ABCDEF";
        hex += {digits[static_cast<unsigned char>(c) >> 4], digits[c & 15]};
    }
    change(gallery, "DELETE FROM entry; INSERT INTO entry VALUES ('zoe', X'" + hex + "')");
    for (const auto& arguments : {std::vector<std::string>{"identify", gallery, image("bob1.jpg")},
                                  {"gallery", "add", gallery, "bob", bob}}) {
        const ProgramRun run = this->run(arguments);
        EXPECT_EQ(run.status, 2);
        EXPECT_EQ(run.complaints.rfind("orbek: " + gallery + ": the record of \"zoe\" is ", 0), 0u);
        EXPECT_NE(run.complaints.find("wrong version [Z9"), std::string::npos) << run.complaints;
    }
    change(gallery, "CREATE TABLE more (x)");
    EXPECT_EQ(run({"gallery", "list", gallery}).complaints, "orbek: " + gallery + ": is not a gallery\n");
}

} // namespace

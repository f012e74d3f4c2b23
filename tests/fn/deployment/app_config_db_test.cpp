#include "fn/deployment/app_file_config_db.h"
#include "support/recorded_dialog.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <csignal>
#include <sstream>

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

AppVolatileConfigDB parsed(const std::string& text) {
    std::istringstream stream(text);
    return AppVolatileConfigDB(stream);
}

std::string parseFailure(const std::string& text) {
    return thrownBy([&] { parsed(text); });
}

TEST(ConfigText, ValuesAreTheTrimmedRestOfTheLine) {
    const struct {
        const char* line;
        const char* value;
    } cases[] = {{"a.b=1", "1"},
                 {"a.b = 1", "1"},
                 {"  a.b\t=\t1  ", "1"},
                 {"a.b =", ""},
                 {"a.b = b = c # d", "b = c # d"},
                 {"a.b = \"q\"", "\"q\""},
                 {"a.b = 50%", "50%"},
                 {"a.b=x\ty", "x\ty"}};
    for (const auto& c : cases) EXPECT_EQ(parsed(c.line).get("a.b"), c.value) << c.line;
}

TEST(ConfigText, CommentsAndBlankLinesCarryNothing) {
    AppVolatileConfigDB db = parsed("# a = 1\n\n   \t\n  # b = 2\r\n");
    EXPECT_FALSE(db.exists("a"));
    EXPECT_FALSE(db.exists("b"));
    EXPECT_EQ(db.name(), "Unnamed");
}

TEST(ConfigText, TheFirstOccurrenceOfAKeyStands) {
    EXPECT_EQ(parsed("k = 1\nk = 2").get("k"), "1");
    EXPECT_EQ(parsed("aA0_.*-<>,: = all").get("aA0_.*-<>,:"), "all");
}

TEST(ConfigText, FaultsNameLineAndColumn) {
    EXPECT_EQ(
        parseFailure("a b = 1"),
        "FNEIOError: AppConfigDB[Unnamed,line:1,column:2,char:b,hex:62]: syntax error, invalid char in key.");
    EXPECT_EQ(parseFailure("a = 1\n = 1"),
              "FNEIOError: AppConfigDB[Unnamed,line:2]: syntax error, found key with length zero.");
    EXPECT_EQ(parseFailure("  a.b  "),
              "FNEIOError: AppConfigDB[Unnamed,line:1,column:5] syntax error, missing '='.");
    EXPECT_EQ(parseFailure("k\x01 = 1"), "FNEIOError: AppConfigDB[Unnamed,line:1,column:1,char:\x01,hex:01]: "
                                         "syntax error, invalid char in key.");
    EXPECT_EQ(parseFailure("\xC3\xA4 = 1"),
              "FNEIOError: AppConfigDB[Unnamed,line:1]: syntax error, found key with length zero.");
}

TEST(ConfigText, ALineEndTakesOneMoreLineEndWithIt) {
    const std::string fault = ",column:1] syntax error, missing '='.";
    for (const auto& [text, line] :
         {std::pair{"a=1\r\nx", "2"}, std::pair{"a=1\n\nx", "2"}, std::pair{"a=1\rx", "2"},
          std::pair{"a=1\n\n\nx", "3"}, std::pair{"\n\nx", "2"}})
        EXPECT_EQ(parseFailure(text), std::string("FNEIOError: AppConfigDB[Unnamed,line:") + line + fault)
            << text;
}

TEST(ConfigDatabase, KeysAreChecked) {
    AppVolatileConfigDB db;
    for (const auto& call :
         {std::function<void()>([&] { db.set("a b", "1"); }), std::function<void()>([&] { db.get("a b"); }),
          std::function<void()>([&] { db.exists("a b"); }), std::function<void()>([&] { db.remove("a b"); })})
        EXPECT_EQ(thrownBy(call), "FNEBadArg: AppConfigDB[Unnamed,char: ,hex:20]: invalid char in key 'a b'");
    EXPECT_EQ(thrownBy([&] { db.get("none"); }), "FNEBadArg: Configuration key 'none' doesn't exist");
    EXPECT_NO_THROW(db.remove("none"));
    EXPECT_EQ(AppConfigDB::makeCompatibleKey(std::string("a b\xFF=<c>\0d", 10)), "ab<c>");
}

class ConfigFile : public testing::Test {
protected:
    /// Makes the file, applies the change, and waits until it is written.
    void change(const std::string& before, const std::function<void(AppFileConfigDB&)>& apply) {
        scratch_.write("c.conf", before);
        AppFileConfigDB db(scratch_.file("c.conf").c_str(), false);
        apply(db);
    }
    ScratchFolder scratch_;
};

TEST_F(ConfigFile, IsRewrittenInTheOrderOfItsKeysWithTheOldStateBeside) {
    change("# comment\nz = 1\na = 2\n", [](AppConfigDB& db) { db.set("m", "3"); });
    EXPECT_EQ(scratch_.read("c.conf"), "a = 2\nm = 3\nz = 1\n");
    EXPECT_EQ(scratch_.read("c.conf.bak"), "# comment\nz = 1\na = 2\n");
    change("a = 1\n", [](AppConfigDB& db) { db.remove("a"); });
    EXPECT_EQ(scratch_.read("c.conf"), "");
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(scratch_.path()), {}), 2)
        << "no temporary is left";
}

TEST_F(ConfigFile, StoresControlCharactersAndPercentAsCodes) {
    change("", [](AppConfigDB& db) {
        db.set("k", "50%");
        db.set("l", "a\nb\x1f");
        EXPECT_EQ(db.get("k"), "50%");
        EXPECT_EQ(db.get("l"), "a\nb\x1f");
    });
    EXPECT_EQ(scratch_.read("c.conf"), "k = 50%25\nl = a%0ab%1f\n");
    const AppFileConfigDB again(scratch_.file("c.conf").c_str(), false);
    EXPECT_EQ(again.get("l"), "a\nb\x1f");

    scratch_.write("h.conf", "a = x%zzy\nb = %4\nc = %\nd = %41%\n");
    const AppFileConfigDB hand(scratch_.file("h.conf").c_str(), false);
    EXPECT_EQ(hand.get("a"), "x%y");
    EXPECT_EQ(hand.get("b"), "%4");
    EXPECT_EQ(hand.get("c"), "%");
    EXPECT_EQ(hand.get("d"), "A%");
}

TEST_F(ConfigFile, IsMadeOnlyWhenAskedFor) {
    const std::string name = scratch_.file("new.conf");
    EXPECT_EQ(thrownBy([&] { AppFileConfigDB(name.c_str(), false); }),
              "FNEIOError: Error opening config file [" + name + "] for reading");
    { AppFileConfigDB made(name.c_str(), true); }
    EXPECT_TRUE(std::filesystem::exists(name));
    EXPECT_EQ(thrownBy([&] { AppFileConfigDB("/no/such/folder/c.conf", true); }),
              "FNEIOError: Error opening config file [/no/such/folder/c.conf] for writing");
    EXPECT_EQ(thrownBy([&] { AppFileConfigDB(scratch_.path().c_str(), false); }),
              "FNEIOError: Error reading text file");
    scratch_.write("bad.conf", "a\n");
    EXPECT_EQ(thrownBy([&] { AppFileConfigDB(scratch_.file("bad.conf").c_str(), false); }),
              "FNEIOError: AppConfigDB[" + scratch_.file("bad.conf") +
                  ",line:1,column:1] syntax error, missing '='.");
}

TEST_F(ConfigFile, RefreshShowsChangesFromOutside) {
    scratch_.write("c.conf", "a = 1\n");
    AppFileConfigDB db(scratch_.file("c.conf").c_str(), false);
    scratch_.write("c.conf", "b = 2\n");
    EXPECT_TRUE(db.exists("a"));
    db.refresh();
    EXPECT_FALSE(db.exists("a"));
    EXPECT_EQ(db.get("b"), "2");
}

TEST_F(ConfigFile, KeepsItsAccessRights) {
    scratch_.write("c.conf", "a = 1\n");
    chmod(scratch_.file("c.conf").c_str(), 0600);
    { AppFileConfigDB(scratch_.file("c.conf").c_str(), false).set("a", "2"); }
    struct stat status;
    stat(scratch_.file("c.conf").c_str(), &status);
    EXPECT_EQ(status.st_mode & 0777, 0600u);
}

TEST_F(ConfigFile, AFailedWriteIsThrownByEveryLaterAccess) {
    const std::string folder = scratch_.file("sub");
    std::filesystem::create_directory(folder);
    scratch_.write("sub/c.conf", "a = 1\n");
    AppFileConfigDB db((folder + "/c.conf").c_str(), false);
    std::filesystem::remove_all(folder);
    EXPECT_NO_THROW(db.set("a", "2"));
    std::string failure;
    for (int i = 0; i < 2000 && failure.empty(); ++i) {
        usleep(5000);
        const std::string thrown = thrownBy([&] { db.exists("a"); });
        if (thrown != "nothing thrown") failure = thrown;
    }
    EXPECT_EQ(failure, "FNEIOError: Error opening temporary config file [" + folder + "/c.conf-" +
                           std::to_string(getpid()) + ".tmp] for writing");
    EXPECT_EQ(thrownBy([&] { db.get("a"); }), failure);
    EXPECT_EQ(thrownBy([&] { db.set("a", "3"); }), failure);
    EXPECT_EQ(thrownBy([&] { db.remove("a"); }), failure);
}

TEST_F(ConfigFile, AFailedWriteIsToldAtOnceAndLeavesTheOldFileAlone) {
    // A folder in the place of the file to move away: the new text is written, but cannot take its place.
    std::filesystem::create_directories(scratch_.file("sub/blocked.conf.bak/x"));
    const std::string blocked = scratch_.write("sub/blocked.conf", "a = 1\n");
    const RecordedDialog dialog;
    AppFileConfigDB db(blocked.c_str(), false);
    EXPECT_NO_THROW(db.flush()) << "nothing to write";
    db.set("a", "2");
    const std::string failure = thrownBy([&] { db.flush(); });
    EXPECT_EQ(failure.rfind("FNEIOError: Error removing backup config file [" + blocked + ".bak]:", 0), 0u)
        << failure;
    EXPECT_EQ(dialog.messages(),
              std::vector<std::string>{"error: Changes of the configuration are not stored: " +
                                       failure.substr(std::string("FNEIOError: ").size())});
    EXPECT_EQ(thrownBy([&] { db.flush(); }), failure) << "still so";
    EXPECT_EQ(scratch_.read("sub/blocked.conf"), "a = 1\n");
    for (const auto& entry : std::filesystem::directory_iterator(scratch_.file("sub")))
        EXPECT_NE(entry.path().extension(), ".tmp");
}

TEST_F(ConfigFile, FlushWaitsForAllChanges) {
    scratch_.write("c.conf", "");
    AppFileConfigDB db(scratch_.file("c.conf").c_str(), false);
    for (int i = 0; i < 100; ++i) db.set("a", std::to_string(i));
    db.flush();
    EXPECT_EQ(scratch_.read("c.conf"), "a = 99\n");
}

TEST_F(ConfigFile, TellsItsLinesAsTheyAreMeant) {
    scratch_.write("c.conf", "# one\r\nb = 1%41\n\na = 2\nb = 3\n");
    const AppFileConfigDB db(scratch_.file("c.conf").c_str(), false);
    std::string lines;
    for (const auto& [number, key, value] : db.lines())
        lines += std::to_string(number) + " " + key + " " + value + ";";
    EXPECT_EQ(lines, "2 b 1A;3 a 2;4 b 3;");
    EXPECT_EQ(db.get("b"), "1A");
}

TEST_F(ConfigFile, LogsAccessWhenItSaysSo) {
    const RecordedDialog dialog;
    change("FNAppConfigLogAccess = yes\na = 1\n", [](AppConfigDB& db) {
        db.exists("a");
        db.get("a");
        db.set("a", "2");
        db.remove("a");
    });
    EXPECT_EQ(dialog.messages(),
              (std::vector<std::string>{"info: AppConfig: querying 'a'", "info: AppConfig: getting  'a'",
                                        "info: AppConfig: changing  'a'", "info: AppConfig: removing  'a'"}));
}

/// Counts up in a key for ever; the parent kills it in the midst.
[[noreturn]] void writeUntilKilled(const std::string& file, long first, int announce) {
    AppFileConfigDB db(file.c_str(), false);
    const std::string padding(20000, 'x');
    for (long i = first;; ++i) {
        db.set("a", std::to_string(i) + padding);
        if (write(announce, &i, sizeof i) != sizeof i) _exit(1);
        usleep(200);
    }
}

TEST_F(ConfigFile, SurvivesKillsAtAnyMomentOfAWrite) {
    const std::string file = scratch_.write("c.conf", "a = 0\nb = kept\n");
    long lastSeen = 0, kills = 0, progressed = 0;
    for (; kills < 60; ++kills) {
        int pipe[2];
        ASSERT_EQ(::pipe(pipe), 0);
        const pid_t child = fork();
        ASSERT_GE(child, 0);
        if (child == 0) writeUntilKilled(file, 1000000 * (kills + 1), pipe[1]);
        close(pipe[1]);
        long announced = 0;
        ASSERT_EQ(read(pipe[0], &announced, sizeof announced), static_cast<ssize_t>(sizeof announced));
        usleep(static_cast<useconds_t>(500 + kills * 377 % 9000));
        kill(child, SIGKILL);
        waitpid(child, nullptr, 0);
        for (long next = 0; read(pipe[0], &next, sizeof next) == sizeof next;) announced = next;
        close(pipe[0]);

        const AppFileConfigDB after(file.c_str(), false);
        ASSERT_EQ(after.get("b"), "kept") << "kill " << kills;
        const std::string value = after.get("a");
        const long stored = std::stol(value);
        ASSERT_LE(stored, announced + 1);
        ASSERT_GE(stored, lastSeen) << "the file went back";
        ASSERT_TRUE(stored == 0 || value.size() == 20000 + std::to_string(stored).size()) << "a torn line";
        progressed += stored != lastSeen;
        lastSeen = stored;
        for (const auto& entry : std::filesystem::directory_iterator(scratch_.path()))
            if (entry.path().extension() == ".tmp") std::filesystem::remove(entry.path());
    }
    EXPECT_GT(progressed, 0) << "some children got to write before they died, on a busy machine, too";
}

TEST_F(ConfigFile, ServesSeveralThreads) {
    scratch_.write("c.conf", "");
    {
        AppFileConfigDB db(scratch_.file("c.conf").c_str(), false);
        Fn::AsyncFunctor run;
        std::atomic<int> done = 0;
        for (int t = 0; t < 3; ++t)
            run(
                [&, t] {
                    for (int i = 0; i < 200; ++i) {
                        const std::string key = "k" + std::to_string(t) + "." + std::to_string(i % 10);
                        db.set(key, std::to_string(i));
                        db.get(key);
                        if (i % 50 == 0 && t == 0) db.exists("k1.1");
                    }
                    ++done;
                },
                {}, "setter");
        while (done < 3) usleep(1000);
    }
    EXPECT_EQ(AppFileConfigDB(scratch_.file("c.conf").c_str(), false).get("k2.9"), "199");
}

} // namespace

#include "fn/message/translator.h"
#include "support/recorded_dialog.h"

#include <gtest/gtest.h>

#include <iostream>
#include <sstream>

namespace {

using Messages = std::vector<std::string>;

/// Loads a table for German.
FNTranslator loaded(const std::string& table) {
    FNTranslator translator("Ger");
    std::istringstream stream(table);
    translator.loadDb(stream, "t.db");
    return translator;
}

TEST(StdDialog, WritesALineOfEachKindToItsStream) {
    FNStdDialog dialog;
    testing::internal::CaptureStderr();
    testing::internal::CaptureStdout();
    dialog.log("a");
    dialog.info("b");
    dialog.warn("c");
    dialog.error("d");
    const std::string out = testing::internal::GetCapturedStdout(),
                      err = testing::internal::GetCapturedStderr();
    EXPECT_TRUE(out.starts_with("[") && out.ends_with("]Info: b\n")) << out;
    for (const char* const line : {"]a\n", "]Warning: c\n", "]Error: d\n"})
        EXPECT_NE(err.find(line), std::string::npos) << line;
}

TEST(Translator, TakesTheTextsOfItsLanguage) {
    const RecordedDialog dialog;
    const FNTranslator translator = loaded("# table\n"
                                           "{ \"yes\" { \"Eng\" \"yes\" } { \"Ger\" \"ja\" } } # done\n"
                                           "{\"no\"\r\n"
                                           "  {\"Ger\" \"nein, \\\"niemals\\\"\"}\n"
                                           "} { \"none\" }\n"
                                           "{ \"eng\" { \"Eng\" \"e\" } }");
    EXPECT_EQ(translator.translate("yes"), "ja");
    EXPECT_EQ(translator.translate("no"), "nein, \"niemals\"");
    EXPECT_EQ(translator.translate("none"), "none");
    EXPECT_EQ(translator.translate("eng"), "eng");
    EXPECT_EQ(translator.translate("Foo"), "Bar");
    EXPECT_EQ(dialog.messages(), Messages{});
}

TEST(Translator, AFaultStopsTheLoadingAndKeepsWhatWasRead) {
    const std::string good = "{ \"a\" { \"Ger\" \"A\" } }\n";
    const std::string late = "\n{ \"b\" { \"Ger\" \"B\" } }\n";
    for (const std::string& fault :
         {std::string("x"), std::string("}"), std::string("\"a\""), std::string("{ {"),
          std::string("{ \"a\" \"b\""), std::string("{ \"open"), std::string("{ \"bad \\q\" }"),
          std::string("{ \"end\\"), "{ \"" + std::string(1025, 'k') + "\" }", std::string(8097, ' ')}) {
        const RecordedDialog dialog;
        const FNTranslator translator = loaded(good + fault + late);
        EXPECT_EQ(dialog.messages(), Messages{"error: Parser error in t.db line 2"}) << fault.substr(0, 40);
        EXPECT_EQ(translator.translate("a"), "A");
        EXPECT_EQ(translator.translate("b"), "b");
    }
    const RecordedDialog dialog;
    loaded("{ \"" + std::string(1024, 'k') + "\" }\n" + std::string(8096, ' '));
    EXPECT_EQ(dialog.messages(), Messages{}) << "the longest that fit";
}

TEST(Translator, AMissingFileIsAWarning) {
    const RecordedDialog dialog;
    FNTranslator("Eng").loadDb("/no/such.db");
    EXPECT_EQ(dialog.messages(),
              Messages{"warn: Tessarin I18N: Could not open file: /no/such.db for reading"});
}

TEST(Dialog, StandardDialogMarksKindAndTime) {
    FNDialog::set({});
    EXPECT_EQ(FNDialog::get()->name(), "StdDlg");
    std::ostringstream text;
    std::streambuf* const before = std::cerr.rdbuf(text.rdbuf());
    FNDialog::warn("careful");
    std::cerr.rdbuf(before);
    const std::string line = text.str();
    EXPECT_EQ(line.substr(line.find(']')), "]Warning: careful\n");
    EXPECT_EQ(line.find(' '), line.rfind(' ', line.find(']'))) << "date, one blank, time";
}

TEST(Dialog, CompositePassesOnInTheOrderOfNames) {
    struct Child final : FNDialog::Body {
        Child(std::string& all, char name) : all_(all), name_(name) {}
        void log(const std::string& m) override { all_ += name_ + m; }
        void info(const std::string& m) override { all_ += name_ + m; }
        void warn(const std::string& m) override { all_ += name_ + m; }
        void error(const std::string& m) override { all_ += name_ + m; }
        std::string name() const override { return "Child"; }
        std::string& all_;
        char name_;
    };
    std::string all;
    FNCompositeDialog composite;
    composite.add("2", FNCountedPtr<FNDialog::Body>(new Child(all, 'b')));
    composite.add("1", FNCountedPtr<FNDialog::Body>(new Child(all, 'a')));
    composite.info("!");
    composite.remove("1");
    composite.error("?");
    EXPECT_EQ(all, "a!b!b?");
}

} // namespace

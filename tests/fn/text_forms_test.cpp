#include "fn/mime64.h"
#include "fn/text_forms.h"

#include <gtest/gtest.h>

namespace {

TEST(TextForms, PatternsMatchFromTheirOpenEnds) {
    const struct {
        const char* text;
        const char* pattern;
        bool matches;
    } cases[] = {{"abc", "", true},     {"", "", true},        {"", "*", true},         {"abc", "***", true},
                 {"abc", "a", true},    {"abc", "b", false},   {"abc", "*c", true},     {"abcd", "*c", false},
                 {"abc", "*b*", true},  {"abc", "*d*", false}, {"", "a", false},        {"", "*a", false},
                 {"abc", "a*c", true},  {"abcd", "a*c", true}, {"c", "*abc", false},    {"abab", "*b", true},
                 {"xab", "a*b", false}, {"ab", "ab*ab", true}, {"abcabc", "*a*c", true}};
    for (const auto& c : cases)
        EXPECT_EQ(Fn::matchString(c.text, c.pattern), c.matches) << c.text << " " << c.pattern;
}

TEST(TextForms, SplittingDropsEmptyParts) {
    EXPECT_EQ(Fn::splitText("..a..b.", '.'), (std::list<std::string>{"a", "b"}));
    EXPECT_TRUE(Fn::splitText("...", '.').empty());
}

TEST(TextForms, Base64OfEveryTailLength) {
    for (const auto& [text, coded] :
         {std::pair{"", ""}, std::pair{"M", "TQ=="}, std::pair{"Ma", "TWE="}, std::pair{"Man", "TWFu"}}) {
        const std::string bytes = text;
        FNRMem<unsigned char> block(bytes.size());
        std::copy(bytes.begin(), bytes.end(), block.getExclusive());
        EXPECT_EQ(FNEncodeMime64(block), coded);
        const FNRMem<unsigned char> decoded = FNDecodeMime64(coded);
        EXPECT_EQ(std::string(decoded.begin(), decoded.end()), bytes);
    }
    EXPECT_EQ(FNEncodeMime64(FNRMem<unsigned char>(300)).find('\n'), std::string::npos);
}

} // namespace

#include "fn/deployment/value_check.h"

#include "fn/deployment/composite_values.h"
#include "fn/deployment/leaf_values.h"

#include <gtest/gtest.h>

namespace {

using namespace Fn::Deployment;

struct Colours {
    static std::list<std::string> enumeration() { return {"red", "green"}; }
    static std::string typeId() { return "Colours"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<None>::create("Plain", ""), property<Int>::create("Mixed", "")), "",
                    false);
    }
};

TEST(ValueCheck, RefusesWhatAReaderWouldRefuseOrMisread) {
    const struct {
        Type type;
        std::vector<const char*> good;
        std::vector<const char*> bad;
        const char* reason; ///< of the first bad one
    } cases[] = {
        {type<Bool>(),
         {"true", "false"},
         {"yes", "", "TRUE", "true ", "1"},
         "\"yes\" is none of true, false"},
        {type<Int>(),
         {"0", "-2147483648", "+7", " 5"},
         {"12abc", "", "abc", "2147483648", "1.5", "1e3", "nan"},
         "\"12abc\" is not of the type Int"},
        {type<UInt>(), {"4294967295"}, {"-1", "4294967296", "x"}, "\"-1\" is not of the type UInt"},
        {type<Int64>(),
         {"-9223372036854775808"},
         {"9223372036854775808", "5s"},
         "\"9223372036854775808\" is not of the type Int64"},
        {type<UInt64>(),
         {"18446744073709551615"},
         {"-1", "18446744073709551616"},
         "\"-1\" is not of the type UInt64"},
        {type<Float>(),
         {"0.5", "-1e-3", "12", "3.", ".5"},
         {"nan", "inf", "1e400", "0,5", "", "0.5x", "1 2"},
         "\"nan\" is not of the type Float"},
        {type<String>(), {"", "any text = $X"}, {}, ""},
        {type<Enum<Colours>>(), {"red", "green"}, {"blue", "", "Red"}, "\"blue\" is none of red, green"},
        {type<Alternative<Colours>>(),
         {"Plain", "Mixed"},
         {"Colours"},
         "\"Colours\" is none of Plain, Mixed"},
        {type<AlternativeN<Int, Float>>(), {"Int"}, {"Bool"}, "\"Bool\" is none of Int, Float"},
        {type<Container<Int>>(), {"", "a b  c", "0,1"}, {"a a", "a.b", "a$"}, "names \"a\" twice"},
        {type<Binary<Colours>>(), {}, {"!!"}, "is not the Base64 text of a package"},
        {type<Colours>(), {}, {"", "x"}, "is a group of keys and has no value"},
    };
    for (const auto& c : cases) {
        for (const char* text : c.good) EXPECT_EQ(faultOfValue(c.type, text), "") << c.type.id();
        for (const char* text : c.bad) EXPECT_NE(faultOfValue(c.type, text), "") << c.type.id() << text;
        if (!c.bad.empty()) EXPECT_EQ(faultOfValue(c.type, c.bad.front()), c.reason);
    }
}

} // namespace

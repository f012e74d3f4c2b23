#include "fn/deployment/composite_values.h"
#include "fn/deployment/tree_tools.h"
#include "fn/deployment/unique_id_scope.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <functional>
#include <limits>
#include <sstream>

namespace {

using namespace Fn::Deployment;
using Names = std::list<std::string>;

struct Colours {
    static Names enumeration() { return {"Red", "Green"}; }
};
using Colour = Enum<Colours>;

struct Shape {
    static std::string typeId() { return "Shape"; }
    static Type define() {
        return Type(typeId(), "A shape.",
                    properties(property<Float>::create("Radius", "In metres."),
                               property<Container<String>>::create("Tags", "")),
                    "", false);
    }
};
struct Shapes {
    static std::string typeId() { return "Shapes"; }
    static Type define() {
        return Type(typeId(), "Kinds of shapes.",
                    properties(property<Shape>::create("Circle", ""), property<None>::create("Nothing", "")),
                    "", false);
    }
};
struct NoChoice {
    static std::string typeId() { return "NoChoice"; }
    static Type define() { return Type(typeId(), "", "", false); }
};

TEST(LeafValues, ConvertAsStreamsDo) {
    EXPECT_EQ(Int::stringToValue("12abc"), 12);
    EXPECT_EQ(Int::stringToValue("  -7"), -7);
    EXPECT_EQ(Int64::stringToValue("-9223372036854775808"), std::numeric_limits<std::int64_t>::min());
    EXPECT_EQ(UInt64::stringToValue("18446744073709551615"), std::numeric_limits<std::uint64_t>::max());
    EXPECT_EQ(Float::stringToValue("1e-3 m"), 1e-3f);
    EXPECT_EQ(Float::valueToString(0.1f), "0.1");
    EXPECT_EQ(Float::valueToString(1234567.0f), "1.23457e+06");
    EXPECT_EQ(UInt::valueToString(4000000000u), "4000000000");
    EXPECT_TRUE(Bool::stringToValue("true"));
    EXPECT_EQ(Bool::valueToString(false), "false");
}

TEST(LeafValues, RefuseWhatIsNoValue) {
    const struct {
        std::function<void()> call;
        const char* text;
    } cases[] = {{[] { Int::stringToValue("abc"); }, "[abc] to int"},
                 {[] { Int::stringToValue("4000000000"); }, "[4000000000] to int"},
                 {[] { UInt::stringToValue(""); }, "[] to unsigned int"},
                 {[] { Int64::stringToValue("x"); }, "[x] to int64"},
                 {[] { UInt64::stringToValue("x"); }, "[x] to unsigned int64"},
                 {[] { Float::stringToValue("."); }, "[.] to float"},
                 {[] { Bool::stringToValue("True"); }, "[True] to bool"}};
    for (const auto& c : cases)
        EXPECT_EQ(thrownBy(c.call), std::string("FNEGeneric: Converting from invalid string ") + c.text);
}

TEST(CompositeValues, DescribeThemselves) {
    const struct {
        Type type;
        const char* id;
        const char* doc;
        const char* defaultValue;
        bool hasValue;
    } cases[] = {
        {type<Colour>(), "Enum<Red,Green>", "One element out of [Red,Green].", "Red", true},
        {type<Alternative<Shapes>>(), "Alternative<Shapes>", "One Element out of [Circle,Nothing].", "Circle",
         true},
        {type<AlternativeN<None, Float>>(), "OldAlternative<None,Float>", "One element out of [None,Float].",
         "None", true},
        {type<Option<Shape>>(), "Alternative<Option<Shape>>", "One Element out of [Disabled,Enabled].",
         "Disabled", true},
        {type<Container<Float>>(), "Container<Float>",
         "This container can hold named elements of type Float.", "", true},
        {type<Vector<Int, 3>>(), "Vector<Int,3>", "Vector of Int with 3 elements.", "", false},
        {type<Matrix<Int, 2, 1>>(), "Matrix<Int,2,1>", "Matrix of Int with 2 rows and 1 columns.", "", false},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.type.id(), c.id);
        EXPECT_EQ(c.type.doc(), c.doc);
        EXPECT_EQ(c.type.defaultValue(), c.defaultValue);
        EXPECT_EQ(c.type.hasValue(), c.hasValue);
    }
    const auto& option = delegateType(type<Option<Shape>>());
    EXPECT_EQ(option.id(), "Option<Shape>");
    EXPECT_EQ(findProperty(option.properties(), "Enabled")->doc(), "Option enabled: A shape.");
    EXPECT_EQ((type<Matrix<Int, 2, 1>>().properties().back().name()), "1,0");
    EXPECT_EQ((type<Matrix<Int, 2, 3>>().properties().size()), 6u);
    EXPECT_EQ((type<Vector<Int, 3>>().properties().size()), 3u);
}

TEST(CompositeValues, AllowTheirWordsOnly) {
    EXPECT_EQ(Colour::stringToValue("Green"), "Green");
    EXPECT_EQ(
        thrownBy([] { Colour::stringToValue("Blue"); }),
        "FNEBadArg: Enum<Red,Green> Value Error:  does not allow value `Blue' for stringToValue operation.");
    EXPECT_EQ(
        thrownBy([] { AlternativeN<None, Float>::valueToString("Int"); }),
        "FNEBadArg: OldAlternative<None,Float> Value Error:  does not allow value `Int' for valueToString "
        "operation.");
    EXPECT_EQ(Alternative<Shapes>::valueToString("Nothing"), "Nothing");
    EXPECT_EQ(thrownBy([] { Alternative<Shapes>::stringToValue("X"); }),
              "FNEBadArg: Alternative<Shapes> Value Error: \n does not allow value 'X' for stringToValue "
              "operation.\n Valid property names are: ['Circle', 'Nothing'].");
    EXPECT_EQ(thrownBy([] { Alternative<NoChoice>::stringToValue("X"); }),
              "FNEBadArg: Alternative<NoChoice> Type Error:  does not provide any properties!");
}

TEST(CompositeValues, ContainersListTheirNames) {
    EXPECT_EQ(ContainerBase::valueToString({"a", "b"}), "a b ");
    EXPECT_EQ(ContainerBase::stringToValue("  a  b "), (Names{"a", "b"}));
    EXPECT_EQ(thrownBy([] {
                  ContainerBase::valueToString({"a", "a"});
              }),
              "FNEBadArg: Duplicate identifier not allowed: a");
}

TEST(CompositeValues, IdListsSplitAtTheOutermostCommas) {
    EXPECT_EQ(OldAlternativeBase::typeIdList("OldAlternative<Vector<Float,4>,None>"),
              (Names{"Vector<Float,4>", "None"}));
    EXPECT_EQ((getAllValues(type<AlternativeN<Vector<Float, 4>, None>>())),
              (Names{"Vector<Float,4>", "None"}));
    EXPECT_EQ(getAllValues(type<Bool>()), (Names{"true", "false"}));
    EXPECT_EQ(getAllValues(type<Alternative<Shapes>>()), (Names{"Circle", "Nothing"}));
    EXPECT_EQ(getAllValues(type<Colour>()), (Names{"Red", "Green"}));
    EXPECT_TRUE(getAllValues(type<Float>()).empty());
    for (const char* none : {"Enum", "Enum<A", "Enum A>", "A>B<"})
        EXPECT_TRUE(EnumBase::enumeration(none).empty());
}

TEST(CompositeValues, MissingInnerTypesAreNamed) {
    EXPECT_EQ(thrownBy([] { delegateType(Type("Alternative<X>", "", "", true)); }),
              "FNESysError: alternative of type 'Alternative<X>' no delegate type found.");
    EXPECT_EQ(thrownBy([] { containedType(Type("Container<X>", "", "", true)); }),
              "FNESysError: container of type 'Container<X>' no containt type found.");
}

struct Packed : Fn::SerializableList<int> {
    using Fn::SerializableList<int>::SerializableList;
    static std::string typeId() { return "Packed"; }
};

TEST(CompositeValues, BinariesKeepPackages) {
    Packed value;
    value.insert(value.end(), {1, -2, 300000});
    const std::string text = Binary<Packed>::valueToString(value);
    EXPECT_EQ(text, "AAAABwAAAAQAAAAEAAAABAAAAAQAAAAEAAAABAAAAAQAAAADAAAAAQAAAAEAAAAB/////gAAAAEABJPg");
    EXPECT_EQ(Binary<Packed>::stringToValue(text), value);
    EXPECT_THROW(Binary<Packed>::stringToValue("AAAA"), FNEBadArg);
}

Type withDefault(const Default& imposed) {
    return Type("Outer", "", properties(property<Alternative<Shapes>>::create("Choice", "")), {imposed}, "",
                false);
}

TEST(Type, DefaultsMustLeadToAMemberOfTheirType) {
    EXPECT_NO_THROW(withDefault(defaultValue<Float>::create("Choice.Circle.Radius", 2.0f)));
    EXPECT_NO_THROW(withDefault(defaultValue<String>::create("Choice.Circle.Tags.any", std::string("t"))));
    EXPECT_EQ(
        thrownBy([] { withDefault(defaultValue<Int>::create("Choice.Square.Side", 2)); }),
        "FNEBadArg: Invalid default value specification. Type Outer does not have member Choice.Square.Side, "
        "Lookup failed for member Square");
    EXPECT_EQ(
        thrownBy([] { withDefault(defaultValue<Int>::create("Choice.Circle.Radius", 2)); }),
        "FNEBadArg: Invalid default value specification. Type Outer's member Choice.Circle.Radius is not of "
        "type Int but of type Float");
}

TEST(TreeTools, PrintPathsAndTypes) {
    const Property root(type<Shapes>(), "Root", "", "", false);
    std::ostringstream paths, types;
    TreeTools::printProperties(TreeTools::getProperties(root), paths);
    EXPECT_EQ(paths.str(),
              "Root\nRoot.Circle\nRoot.Circle.Radius\nRoot.Circle.Tags\nRoot.Circle.Tags.ContaintType\n"
              "Root.Nothing\n");
    TreeTools::printTypes(TreeTools::getTypes(type<Container<Float>>()), types);
    EXPECT_EQ(types.str(), "Container<Float>: \n  This container can hold named elements of type Float.\n"
                           "  [ (Float, ContaintType, ) ]\n"
                           "Float: \n  A decimal floating-point numeric value.\n  [ ]\n");
}

} // namespace

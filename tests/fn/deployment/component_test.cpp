#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/unique_id_scope.h"
#include "fn/text_forms.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <functional>
#include <thread>

namespace {

using namespace Fn::Deployment;

struct Lens {
    static std::string typeId() { return "Lens"; }
    static Type define() {
        return Type(typeId(), "A lens.",
                    properties(propertyWithDefault<Float>::create("Focus", 50.0f, "In millimetres."),
                               property<String>::create("Maker", "")),
                    "", false);
    }
};
struct Mounts {
    static std::string typeId() { return "Mounts"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<Lens>::create("Fixed", ""), property<None>::create("Bare", "")),
                    std::list<Default>{defaultValue<Float>::create("Fixed.Focus", 35.0f)}, "", false);
    }
};
struct Root {
    static std::string typeId() { return "RootType"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<Lens>::create("Lens", ""),
                               property<Container<Lens>>::create("Lenses", ""),
                               property<Alternative<Mounts>>::create("Mount", ""),
                               property<Lens>::create("Locked", "", true), property<Bool>::create("Flag", ""),
                               property<AlternativeN<None, Float>>::create("Old", ""),
                               property<UniqueIdScope>::create("Ids", ""),
                               property<Container<String>>::create("Substitutions", "")),
                    std::list<Default>{
                        defaultValue<String>::create("Lenses.wide.Maker", std::string("$HOUSE/optics")),
                        defaultValue<Float>::create("Mount.Fixed.Focus", 24.0f)},
                    "", false);
    }
};

class ComponentTree : public testing::Test {
protected:
    Component root(const FNCountedPtr<AppConfigDB>& secondary = {}) {
        return Component(db_, Property(type<Root>(), "R", "", "", false), secondary);
    }
    Component at(const std::string& path) {
        Component component = root();
        for (const std::string& part : Fn::splitText(path, '.')) component = component.subComponent(part);
        return component;
    }
    FNCountedPtr<AppConfigDB> db_{new AppVolatileConfigDB};
};

TEST_F(ComponentTree, ReadsValuesOverDefaults) {
    EXPECT_EQ(at("Lens.Focus").read(true), "50");
    EXPECT_EQ(at("Flag").read(true), "false");
    EXPECT_EQ(Value<Float>::get(at("Lens.Focus")), 50.0f);
    db_->set("R.Lens.Focus", "85");
    EXPECT_EQ(Value<Float>::get(at("Lens.Focus")), 85.0f);
    EXPECT_FALSE(at("Lens.Focus").isDefault());
    at("Lens.Focus").reset();
    EXPECT_FALSE(db_->exists("R.Lens.Focus"));
    Value<Float>::set(at("Lens.Focus"), 0.5f);
    EXPECT_EQ(db_->get("R.Lens.Focus"), "0.5");
}

TEST_F(ComponentTree, TheOutermostTypeDefaultWins) {
    EXPECT_EQ(at("Mount.Fixed.Focus").readDefault(), "24") << "the root's, not the alternative's 35";
    EXPECT_EQ(at("Lenses.wide.Maker").readDefault(), "$HOUSE/optics");
    EXPECT_EQ(at("Lenses.tele.Maker").readDefault(), "");
}

TEST_F(ComponentTree, StoredDefaultsAreFoundByNameAndAlias) {
    const struct {
        const char* key;
        bool found;
    } cases[] = {{"R.Lenses.x.Focus", true}, {"*.Lenses.x.Focus", true}, {"R.Lenses.*.Focus", true},
                 {"*.Lenses.*.Focus", true}, {"R.*.x.Focus", false},     {"R.Lenses.y.Focus", false}};
    for (const auto& c : cases) {
        db_ = FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB);
        db_->set(c.key + std::string(".default"), "7");
        EXPECT_EQ(at("Lenses.x.Focus").readDefault(), c.found ? "7" : "50") << c.key;
        EXPECT_TRUE(at("Lenses.x.Focus").isDefault());
    }
    at("Flag").writeDefault("true");
    EXPECT_EQ(db_->get("R.Flag.default"), "true");
}

TEST_F(ComponentTree, ASecondDatabaseGivesDefaultsBehindTheFirst) {
    const FNCountedPtr<AppConfigDB> second(new AppVolatileConfigDB);
    second->set("R.Flag", "true");
    second->set("R.Lens.Focus.default", "20");
    EXPECT_EQ(root(second).subComponent("Flag").read(true), "true");
    EXPECT_EQ(root(second).subComponent("Lens").subComponent("Focus").read(true), "20");
    db_->set("*.Flag.default", "false");
    EXPECT_EQ(root(second).subComponent("Flag").read(true), "false");
    EXPECT_EQ(thrownBy([&] { Component(FNCountedPtr<AppConfigDB>(), root().ownType()); }),
              "FNEBadFunCall: No primary configuration passed (mandatory).");
}

TEST_F(ComponentTree, VariablesStandForTheirValues) {
    db_->set("R.Substitutions", "BASE HOUSE");
    db_->set("R.Substitutions.BASE", "/opt");
    db_->set("R.Substitutions.HOUSE", "$BASE/x");
    db_->set("R.Lens.Maker", "$HOUSE/etc:$HOUSEX:$NONE");
    EXPECT_EQ(at("Lens.Maker").read(true), "/opt/x/etc:/opt/xX:$NONE");
    EXPECT_EQ(at("Lens.Maker").read(false), "$HOUSE/etc:$HOUSEX:$NONE");
    EXPECT_EQ(at("Lenses.wide.Maker").read(true), "/opt/x/optics");
}

TEST_F(ComponentTree, WrongTypesAndMembersAreNamed) {
    EXPECT_EQ(
        thrownBy([&] { Value<Int>::get(at("Lens.Focus")); }),
        "FNESysError: Type Error: Value[Int]::get does not allow the use of component R.Lens.Focus[Float] !");
    EXPECT_EQ(
        thrownBy([&] { typeCheck(at("Flag").ownType(), type<Int>(), "set"); }),
        "FNESysError: Type Error: DefaultValue[Int]::set does not allow the use of property Flag[Bool] !");
    EXPECT_EQ(thrownBy([&] { at("Lens.Zoom"); }),
              "FNEBadArg: subComponent(Zoom): property not found in component R.Lens[Lens]");
}

TEST_F(ComponentTree, AReadOnlyPropertyLocksAllBelowIt) {
    EXPECT_TRUE(at("Locked.Focus").readOnly());
    EXPECT_EQ(thrownBy([&] { at("Locked.Focus").write("1"); }),
              "FNEBadFunCall: Cannot change readonly component R.Locked.Focus");
    EXPECT_EQ(thrownBy([&] { at("Locked.Focus").reset(); }),
              "FNEBadFunCall: Cannot reset readonly component R.Locked.Focus");
}

TEST_F(ComponentTree, HooksStandInForStoredValues) {
    const RecordedDialog dialog;
    Component flag = at("Flag");
    flag.setReadHook([] { return std::string("true"); });
    db_->set("R.Flag", "false");
    EXPECT_EQ(root().subComponent("Flag").read(true), "false") << "another tree has its own hooks";
    EXPECT_EQ(flag.read(true), "true");
    EXPECT_FALSE(flag.isDefault());
    flag.setReadHook([]() -> std::string { FN_THROW(FNEIOError, "gone"); });
    EXPECT_EQ(flag.read(true), "false");
    flag.removeReadHook();

    std::string written;
    flag.setWriteHook([&](const std::string& value) {
        written += value + ";";
        if (value == "true") FN_THROW(FNEIOError, "full");
    });
    flag.write("true");
    flag.reset();
    flag.removeWriteHook();
    flag.write("x");
    EXPECT_EQ(written, "true;false;");
    EXPECT_EQ(dialog.messages(),
              (std::vector<std::string>{"warn: Error on read hook of component R.Flag: gone",
                                        "warn: Error on write hook of component R.Flag: full"}));
    EXPECT_EQ(db_->get("R.Flag"), "x");
}

TEST_F(ComponentTree, HooksMayWaitForThreadsThatSetHooks) {
    const Component tree = root();
    Component flag = tree.subComponent("Flag"), other = tree.subComponent("Lens");
    const auto inAnotherThread = [](const std::function<void()>& call) { std::thread(call).join(); };
    flag.setReadHook([&] {
        inAnotherThread([&] { other.removeReadHook(); });
        return std::string("true");
    });
    flag.setWriteHook([&](const std::string&) { inAnotherThread([&] { other.removeWriteHook(); }); });
    EXPECT_EQ(flag.read(true), "true");
    EXPECT_NO_THROW(flag.write("x"));
}

TEST_F(ComponentTree, ChildrenFollowTheKindOfNode) {
    const auto names = [](const Component& component) {
        std::string all;
        for (const Component& child : component.subComponents()) all += child.name() + " ";
        return all;
    };
    db_->set("R.Lenses", "b a");
    EXPECT_EQ(names(at("Lenses")), "R.Lenses.b R.Lenses.a ");
    EXPECT_EQ(names(at("Mount")), "R.Mount.Fixed ");
    EXPECT_EQ(names(at("Old")), "R.Old.None ");
    EXPECT_EQ(names(at("Lens")), "R.Lens.Focus R.Lens.Maker ");
    EXPECT_EQ(names(at("Flag")), "");
}

TEST_F(ComponentTree, CopiesWholeTrees) {
    db_->set("R.Lenses", "a");
    db_->set("R.Lenses.a.Focus", "12");
    const FNCountedPtr<AppConfigDB> otherDb(new AppVolatileConfigDB);
    Component other(otherDb, Property(type<Root>(), "S", "", "", false));
    other.subComponent("Lenses").copy(at("Lenses"), false);
    EXPECT_EQ(otherDb->get("S.Lenses"), "a");
    EXPECT_EQ(otherDb->get("S.Lenses.a.Focus"), "12");
    EXPECT_EQ(thrownBy([&] { other.subComponent("Lens").copy(at("Flag"), false); }),
              "FNEBadArg: Cannot copy Component of type Bool to Component of type Lens.");
}

TEST_F(ComponentTree, ScopesOfUniqueIdsAreSettings) {
    EXPECT_EQ(UniqueIdScope::make(at("Ids")).kind(), Fn::UniqueId::Scope::NetworkWide);
    db_->set("R.Ids.Type", "ProcessWide");
    db_->set("R.Ids.HostPrefix", "h");
    EXPECT_EQ(UniqueIdScope::make(at("Ids")).kind(), Fn::UniqueId::Scope::ProcessWide);
    EXPECT_EQ(UniqueIdScope::make(at("Ids")).hostPrefix(), "h");
}

} // namespace

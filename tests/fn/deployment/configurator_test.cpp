#include "fn/deployment/app_config_db.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/configurator_component.h"
#include "fn/deployment/constraints_manager.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

namespace {

using namespace Fn::Deployment;
using Names = std::list<std::string>;

struct Point {
    static std::string typeId() { return "Point"; }
    static Type define() {
        return Type(typeId(), "", properties(property<Int>::create("x", ""), property<Int>::create("y", "")),
                    "", false);
    }
};
struct Kinds {
    static std::string typeId() { return "Kinds"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<Point>::create("P", ""), property<None>::create("N", "")), "", false);
    }
};
struct Group {
    static std::string typeId() { return "Group"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<Int>::create("x", ""), property<Int>::create("y", ""),
                               property<String>::create("s", ""), property<Point>::create("p", ""),
                               property<Point>::create("q", ""), property<Container<Int>>::create("list", ""),
                               property<Container<Int>>::create("list2", ""),
                               property<Alternative<Kinds>>::create("kind", ""),
                               property<EqualConstraint>::create("C", "")),
                    "", false);
    }
};
struct Top {
    static std::string typeId() { return "Top"; }
    static Type define() {
        return Type(typeId(), "",
                    properties(property<Group>::create("B", ""), property<Int>::create("x", ""),
                               property<EqualConstraint>::create("C", "")),
                    "", false);
    }
};

class ConfiguratorTest : public testing::Test {
protected:
    ConfiguratorTest() {
        machine_.componentChangedEvent()->addObserver(
            [this](const std::string& name, const bool& exists) { changes_ += name + (exists ? "+" : "-"); });
    }
    void addTree(const char* name = "A") {
        machine_.addRootComponent(Component(db_, Property(type<Top>(), name, "", "", false)));
    }
    FNCountedPtr<AppConfigDB> db_{new AppVolatileConfigDB};
    ConfiguratorMachine machine_;
    std::string changes_;
};

TEST_F(ConfiguratorTest, RootsComeAndGoWithEvents) {
    std::string events;
    machine_.rootComponentAddedEvent()->addObserver([&](const std::string& name) { events += "+" + name; });
    machine_.rootComponentRemovedEvent()->addObserver(
        [&](const Component& root) { events += "-" + root.name(); });
    addTree("A");
    addTree("Z");
    addTree("A");
    EXPECT_EQ(machine_.subComponents(""), (Names{"A", "Z"}));
    const FNCountedPtr<AppConfigDB> other(new AppVolatileConfigDB);
    other->set("Z.x", "7");
    machine_.addRootComponent(Component(other, Property(type<Top>(), "Z", "", "", false)));
    EXPECT_EQ(machine_.value("Z.x", false), "7") << "the new root is in place of the old one";
    EXPECT_EQ(events, "+A+Z-A+A-Z+Z");
    events.clear();
    machine_.removeRootComponent("nobody");
    machine_.removeRootComponent("A");
    EXPECT_EQ(events, "-A");
    EXPECT_EQ(machine_.subComponents(""), Names{"Z"});
}

TEST_F(ConfiguratorTest, AValueThatIsTheDefaultIsNotStored) {
    addTree();
    machine_.setValue("A.x", "0");
    EXPECT_FALSE(db_->exists("A.x"));
    EXPECT_EQ(changes_, "");
    machine_.setValue("A.x", "1");
    machine_.setValue("A.x", "0");
    EXPECT_EQ(db_->get("A.x"), "0") << "once stored it stays stored";
    machine_.setDefaultValue("A.x", "0");
    machine_.setDefaultValue("A.x", "5");
    EXPECT_EQ(machine_.defaultValue("A.x"), "5");
    EXPECT_EQ(changes_, "A.x+A.x+A.x+");
}

TEST_F(ConfiguratorTest, UnknownNamesAreRefused) {
    addTree();
    EXPECT_EQ(thrownBy([&] { machine_.setValue("No.Such", "x"); }),
              "FNEBadArg: Could not generate Component with name 'No.Such': Does not found matching root "
              "component.");
    EXPECT_EQ(thrownBy([&] { machine_.value("A.B.zz", false); }),
              "FNEBadArg: subComponent(zz): property not found in component A.B[Group]");
    EXPECT_THROW(machine_.value("", false), FNEBadArg);
    EXPECT_EQ(changes_, "");
}

TEST_F(ConfiguratorTest, ExistenceHasTwoMeanings) {
    addTree();
    machine_.setValue("A.B.list.new", "1"); // not among the elements
    machine_.setValue("A.B.kind.P.x", "1");
    machine_.setValue("A.B.kind", "N");
    machine_.setValue("A.B.kind.P.x", "2"); // not the chosen one
    EXPECT_EQ(changes_, "A.B.list.new-A.B.kind.P.x+A.B.kind+A.B.kind.P.x-");
    EXPECT_TRUE(machine_.componentExists("A.B.list.any"));
    EXPECT_FALSE(machine_.componentExists("A.B.kind.P.x"));
    EXPECT_FALSE(machine_.componentExists("A.zz"));
    EXPECT_FALSE(machine_.componentExists("Z"));
    EXPECT_FALSE(machine_.componentExists(""));
}

TEST_F(ConfiguratorTest, CopiesAndResetsTrees) {
    addTree();
    machine_.setValue("A.B.p.x", "3");
    machine_.copy("A.B.p", "A.B.q");
    EXPECT_EQ(machine_.value("A.B.q.x", false), "3");
    changes_.clear();
    machine_.copy("A.B.p", "A.B.x");
    machine_.reset("A.B.y", false);
    EXPECT_EQ(changes_, "") << "other types and defaults: nothing happens";
    machine_.setValue("A.B.list", "e ");
    machine_.setValue("A.B.list.e", "4");
    changes_.clear();
    machine_.reset("A.B", true);
    EXPECT_EQ(changes_, "A.B+");
    EXPECT_TRUE(machine_.isDefault("A.B.p.x"));
    EXPECT_TRUE(machine_.isDefault("A.B.list"));
    EXPECT_FALSE(machine_.isDefault("A.B.list.e")) << "no child of the default value of its container";
    machine_.reset("A.B", true);
    EXPECT_EQ(changes_, "A.B+");
}

TEST_F(ConfiguratorTest, FindsByTypeNameAndValue) {
    addTree();
    machine_.setValue("A.B.p.y", "77");
    EXPECT_EQ(machine_.findComponents("Int", "*.x", "", false),
              (Names{"A.B.x", "A.B.p.x", "A.B.q.x", "A.B.kind.P.x", "A.x"}));
    EXPECT_EQ(machine_.findComponents("Int", "", "77", false), Names{"A.B.p.y"});
    EXPECT_EQ(machine_.findComponents("Int", "", "", true), Names{"A.B.p.y"});
    bool found = false;
    for (const Type& listed : machine_.listAllTypes()) found |= listed == type<Point>();
    EXPECT_TRUE(found);
}

TEST_F(ConfiguratorTest, HooksConfigureFromOutside) {
    addTree();
    EXPECT_FALSE(machine_.externalConfiguration("A.B.p"));
    machine_.addExternalConfigurationHook("Point", [](const Component& component) {
        component.subComponent("x").type();
        Component x = component.subComponent("x");
        x.write("9");
    });
    EXPECT_TRUE(machine_.isExternConfigurable("A.B.q"));
    EXPECT_TRUE(machine_.externalConfiguration("A.B.p"));
    EXPECT_EQ(machine_.value("A.B.p.x", false), "9");
    EXPECT_EQ(changes_, "A.B.p.x+") << "a write through the configurator is observed";
}

class ConstraintTest : public ConfiguratorTest {
protected:
    /// Declares the constraint A.B.C over the given members.
    void constrain(const std::string& members) {
        db_->set("A.B.C", members);
        addTree();
        manager_.addObserver([this](const std::string& text) { report_ += text; });
    }
    ConstraintsManager manager_{machine_};
    std::string report_;
};

TEST_F(ConstraintTest, TheFirstMemberIsTheSource) {
    constrain(".x .y");
    machine_.setValue("A.B.x", "4");
    EXPECT_EQ(machine_.value("A.B.y", false), "4");
    EXPECT_EQ(changes_, "A.B.x+A.B.y+") << "the constraint's own write is seen, and starts no further pass";
    EXPECT_EQ(report_, "");
    machine_.setValue("A.B.y", "5");
    EXPECT_EQ(machine_.value("A.B.y", false), "4");
    EXPECT_EQ(report_, "Constraint A.B.C:\n- A.B.y has to have value of A.B.x\n\n");
}

TEST_F(ConstraintTest, RelativeNamesStepBackToTheRoot) {
    constrain("..x A.B.y .x");
    machine_.setValue("A.x", "8");
    EXPECT_EQ(machine_.value("A.B.y", false), "8");
    EXPECT_EQ(machine_.value("A.B.x", false), "8");
    db_->set("A.C", "..x .x");
    EXPECT_EQ(
        thrownBy([&] { machine_.setValue("A.x", "9"); }),
        "FNEBadArg: EqualConstraint::names(): backsteps in constraint value exceeds available parent path. "
        "constraint: A.C, ill formed value:..x");
}

TEST_F(ConstraintTest, OtherKindsAreViolations) {
    constrain(".x .s .p");
    machine_.setValue("A.B.x", "1");
    EXPECT_EQ(report_, "Constraint A.B.C:\n- A.B.s has another type as source A.B.x\n"
                       "- A.B.p has another type as source A.B.x\n\n");
}

TEST_F(ConstraintTest, DeepEqualityFollowsTheTree) {
    db_->set("A.B.C.Deep", "true");
    constrain(".p .q");
    machine_.setValue("A.B.p.y", "6");
    EXPECT_EQ(machine_.value("A.B.q.y", false), "6");
    EXPECT_EQ(report_, "");
    // Containers: the target first gets the elements, then their values.
    db_->set("A.B.C", ".list .list2");
    db_->set("A.B.list.e", "3");
    machine_.setValue("A.B.list", "e ");
    EXPECT_EQ(machine_.value("A.B.list2", false), "e ");
    EXPECT_EQ(machine_.value("A.B.list2.e", false), "3");
}

TEST_F(ConstraintTest, MissingChildrenAreViolations) {
    db_->set("A.B.C.Deep", "true");
    constrain(".list .list2");
    db_->set("A.B.C.TargetOn", "DefaultValues"); // so a stored value stands in the way of the elements
    db_->set("A.B.list2", "");
    machine_.setValue("A.B.list", "e ");
    EXPECT_EQ(report_, "Constraint A.B.C:\n- A.B.list2.e does not exist\n\n");
}

TEST_F(ConstraintTest, DefaultsCanBeTheTarget) {
    db_->set("A.B.C.TargetOn", "DefaultValues");
    constrain(".x .y");
    machine_.setValue("A.B.x", "4");
    EXPECT_TRUE(machine_.isDefault("A.B.y"));
    EXPECT_EQ(machine_.value("A.B.y", false), "4");
}

TEST_F(ConstraintTest, NamesCanHoldWordsOfOtherNodes) {
    db_->set("A.B.s", "p q");
    db_->set("A.B.C.Substitutions", "WHO");
    db_->set("A.B.C.Substitutions.WHO", "A.B.s");
    constrain(".WHO.x .WHO.y");
    machine_.setValue("A.B.p.x", "1");
    machine_.setValue("A.B.q.x", "2");
    EXPECT_EQ(machine_.value("A.B.p.y", false), "1") << "one constraint for each word";
    EXPECT_EQ(machine_.value("A.B.q.y", false), "2");

    db_->set("A.B.C", "A.x A.B.${A.B.s}.x");
    machine_.setValue("A.x", "5");
    EXPECT_EQ(machine_.value("A.B.p.x", false) + machine_.value("A.B.q.x", false), "55")
        << "one constraint for all";
    db_->set("A.B.C", "A.B.${A.B.s");
    EXPECT_EQ(
        thrownBy([&] { machine_.setValue("A.x", "6"); }),
        "FNEBadArg: ConfiguratorMachine::expandVariable: have not found matching '}' in 'A.B.${A.B.s'.");
}

TEST_F(ConstraintTest, ValuesCanBeMapped) {
    const std::string entry = "A.B.C.ValueSubstitution.v.";
    db_->set("A.B.C.ValueSubstitution", "v");
    db_->set(entry + "SourceNameFilter", "B.s");
    db_->set(entry + "TargetNameFilter", "p.y");
    db_->set(entry + "ValueMap", "m");
    db_->set(entry + "ValueMap.m.SourceValue", "high");
    db_->set(entry + "ValueMap.m.TargetValue", "100");
    constrain(".s .p .q");
    machine_.setValue("A.B.s", "high");
    EXPECT_EQ(machine_.value("A.B.p.y", false), "100");
    EXPECT_EQ(machine_.value("A.B.q.y", false), "0") << "its name's tail is no head of the filter";
    machine_.setValue("A.B.s", "7");
    EXPECT_EQ(machine_.value("A.B.p.y", false), "7");
}

TEST_F(ConstraintTest, ChangesWithoutEndAreCutOff) {
    // An observer that runs before the manager's own answers each write of the constraint by a change of the
    // source, so that every pass starts another one inside.
    ConfiguratorMachine machine;
    int turns = 0;
    machine.componentChangedEvent()->addObserver([&](const std::string& name, const bool&) {
        if (name != "A.B.y") return;
        try {
            machine.setValue("A.B.x", std::to_string(++turns + 100));
        } catch (const FNEBadArg&) {
            throw ObserverFailure{std::current_exception()};
        }
    });
    const ConstraintsManager manager(machine);
    db_->set("A.B.C", ".x .y");
    machine.addRootComponent(Component(db_, Property(type<Top>(), "A", "", "", false)));
    EXPECT_EQ(thrownBy([&] { machine.setValue("A.B.x", "1"); }),
              "FNEBadArg: ConstraintsManager: recursion level exceeds the limit of 5 !\nConstraint solving "
              "aborted.");
    EXPECT_EQ(turns, 5) << "the sixth nested pass is the one too many";
}

TEST_F(ConstraintTest, RemovedRootsTakeTheirConstraintsAlong) {
    constrain(".x .y");
    machine_.removeRootComponent("A");
    EXPECT_NO_THROW(manager_.checkAllConstraints());
}

} // namespace

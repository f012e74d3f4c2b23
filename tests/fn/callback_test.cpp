#include "fn/callback/composition.h"
#include "fn/callback/observable.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <set>
#include <thread>

#include <unistd.h>

namespace {

struct Model {
    std::string calls;
    void changed(const int& i, const std::string& from, char mark) {
        calls += from + mark + std::to_string(i);
    }
    int sum(const int& i) { return i + static_cast<int>(calls.size()); }
};

TEST(Functor, CallsWithCallArgumentsFirstAndBoundOnesBehind) {
    Model model;
    const auto onObject = Fn::Functor1<int>::callee(model, &Model::changed, std::string("A"), ':');
    onObject(7);
    EXPECT_EQ(model.calls, "A:7");
    EXPECT_EQ((Fn::Functor1Ret<int, int>::callee(model, &Model::sum)(2)), 5);
    EXPECT_EQ((Fn::Functor1Ret<int, int>::function([](int a, int b) { return a - b; }, 3)(10)), 7);
    Fn::Functor1Ret<int, int> onCopy(
        new Fn::Functor1Ret<int, int>::CalleeValue<Model, decltype(&Model::sum)>(model, &Model::sum));
    model.calls.clear();
    EXPECT_EQ(onCopy(1), 4);
}

TEST(Functor, KeepsAnObjectAliveThatItHoldsByHandle) {
    FNCountedPtr<Model> model(new Model);
    Model* const object = model.get();
    const auto functor = Fn::Functor1<int>::callee(model, &Model::changed, std::string("B"), '.');
    model = FNCountedPtr<Model>();
    functor(1);
    EXPECT_EQ(object->calls, "B.1");
}

TEST(Functor, ADefaultMadeOneCanBeCalled) {
    Fn::Functor2<int, int>()(1, 2);
    EXPECT_EQ(Fn::Functor0Ret<std::string>()(), "");
    EXPECT_TRUE(Fn::Functor0Ret<bool>(new Fn::Functor0Ret<bool>::Nil(true))());
}

TEST(Composition, ErrorsGoToTheirHandlerAndNoFurther) {
    const RecordedDialog dialog;
    const Fn::Functor0 failing([] { FN_THROW(FNEBadArg, "reason"); });
    Fn::tryCatchFunctor(failing, Fn::errorMessageFunctor("job: "))();
    EXPECT_EQ(dialog.messages(), std::vector<std::string>{"error: job: reason"});
    EXPECT_THROW(Fn::tryCatchFunctor([] { throw 1; }, {})(), int)
        << "what is no std::exception passes through";
}

TEST(Composition, SyncCallWaitsForAJobRunElsewhere) {
    bool done = false;
    std::thread elsewhere;
    Fn::syncCallFunctor([&] { done = true; },
                        [&](const Fn::Functor0& job) { elsewhere = std::thread([job] { job(); }); })();
    EXPECT_TRUE(done);
    elsewhere.join();
    const Fn::Functor1Ret<int, std::string> asText([](const int& i) { return std::to_string(i); });
    const auto text = Fn::conversionFunctor0Ret<int, std::string>(asText, [] { return 3; });
    EXPECT_EQ(text(), "3");
}

TEST(Composition, AutoFunctorRunsWithItsLastCopy) {
    int runs = 0;
    {
        const Fn::AutoFunctor first([&] {
            ++runs;
            throw 1;
        });
        { const Fn::AutoFunctor second(first); }
        EXPECT_EQ(runs, 0);
    }
    EXPECT_EQ(runs, 1);
}

TEST(Observable, CallsObserversInTheOrderOfTheirIdsAndDropsThoseThatThrow) {
    FNObservableBody1<int> subject;
    subject.broadcast(0);
    std::string calls;
    subject.addObserver([&](const int&) { calls += "a"; });
    subject.addObserver([&](const int&) {
        calls += "b";
        FN_THROW(FNEBadArg, "failing");
    });
    const std::string third = subject.addObserver([&](const int& i) { calls += std::to_string(i); });
    subject.broadcast(1);
    subject.broadcast(2);
    EXPECT_EQ(calls, "ab1a2");
    subject.removeObserver(third);
    subject.removeObserver("nobody");
    subject.broadcast(3);
    EXPECT_EQ(calls, "ab1a2a");
}

TEST(Observable, AnythingButAStdExceptionLeavesTheBroadcast) {
    FNObservableBody1<int> subject;
    int calls = 0;
    subject.addObserver([&](const int&) { throw ++calls; });
    subject.addObserver([&](const int&) { ++calls; });
    EXPECT_THROW(subject.broadcast(1), int);
    EXPECT_THROW(subject.broadcast(1), int) << "it keeps its place";
    EXPECT_EQ(calls, 2);
}

TEST(Observable, ChangesDuringABroadcastTakeEffectWithTheNext) {
    FNObservableBody2<int, int> subject;
    int own = 0, added = 0;
    std::string id;
    id = subject.addObserver([&](const int&, const int&) {
        ++own;
        subject.removeObserver(id);
        subject.addObserver([&](const int&, const int&) { ++added; });
    });
    subject.broadcast(1, 1);
    EXPECT_EQ(own, 1);
    EXPECT_EQ(added, 0);
    subject.broadcast(1, 1);
    EXPECT_EQ(own, 1);
    EXPECT_EQ(added, 1);
}

TEST(Composite, NamesAreUniqueAndFailuresAreReported) {
    std::string reported;
    FNComposite<Fn::Functor0> composite(
        [&](const std::string& name, const std::exception& e) { reported = name + " " + e.what(); });
    composite.add("x", [] { FN_THROW(FNEGeneric, "oops"); });
    EXPECT_EQ(thrownBy([&] { composite.add("x", {}); }),
              "FNEBadArg: FNComposite: there already exists an object named x");
    composite.forEach([](const Fn::Functor0& member) { member(); });
    EXPECT_EQ(reported, "x oops");
    EXPECT_EQ(composite.size(), 0u);
}

TEST(UniqueId, ScopesDifferInTheirPrefix) {
    using Scope = Fn::UniqueId::Scope;
    const auto made = [](Scope::Kind kind, const char* host) {
        return Fn::UniqueId::Generator(Scope(kind, host)).generate();
    };
    EXPECT_EQ(made(Scope::ProcessWide, "h").find('-'), std::string::npos);
    const std::string host = made(Scope::HostWide, "h"), network = made(Scope::NetworkWide, "h");
    EXPECT_EQ(std::stol(host.substr(0, host.find('-')), nullptr, 36), getpid());
    EXPECT_EQ(network.rfind("h-" + host.substr(0, host.find('-') + 1), 0), 0u);
    EXPECT_GT(made(Scope::NetworkWide, "").find('-'), 0u) << "the host's own name";
}

TEST(UniqueId, NoTwoAreTheSameAcrossThreads) {
    constexpr int each = 5000;
    std::vector<std::string> ids[2];
    std::thread threads[2];
    for (int t = 0; t < 2; ++t)
        threads[t] = std::thread([&, t] {
            const Fn::UniqueId::Generator generator{Fn::UniqueId::Scope(Fn::UniqueId::Scope::ProcessWide)};
            for (int i = 0; i < each; ++i) ids[t].push_back(generator.generate());
        });
    for (auto& thread : threads) thread.join();
    std::set<std::string> all(ids[0].begin(), ids[0].end());
    all.insert(ids[1].begin(), ids[1].end());
    EXPECT_EQ(all.size(), 2u * each);
}

} // namespace

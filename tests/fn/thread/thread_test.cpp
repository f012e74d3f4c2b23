#include "fn/thread/async.h"
#include "fn/thread/condition_variable.h"
#include "fn/thread/resource.h"
#include "fn/thread/thread_impl.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <fstream>
#include <thread>

#include <poll.h>
#include <pthread.h>

namespace {

/// Spins until the condition holds; false after ten seconds.
template <class Condition> bool eventually(Condition condition) {
    for (int i = 0; i < 2000; ++i) {
        if (condition()) return true;
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return false;
}

/// Whether somebody asked the calling thread to stop.
bool cancelArrived() {
    pollfd pipe{FNThreadSelf::cancelDescriptor(), POLLIN, 0};
    return poll(&pipe, 1, 0) == 1;
}

struct Ending {
    int state;
    std::string message;
};

Ending endingOf(const Fn::Functor0& job) {
    const FNThread thread = FNSpawn(job, "job");
    thread.start();
    thread.join();
    return {thread.state().state, thread.state().message};
}

TEST(Thread, TellsHowItEnded) {
    const struct {
        Fn::Functor0 job;
        Ending ending;
    } cases[] = {{[] {}, {FNThreadState::ended, "Returned."}},
                 {[] { FNThreadSelf::exit(); }, {FNThreadState::ended, "Cancelled."}},
                 {[] { FN_THROW(FNEBadArg, "wrong"); }, {FNThreadState::failed, "wrong"}},
                 {[] { throw 7; }, {FNThreadState::failed, "Unknown exception."}}};
    for (const auto& c : cases) {
        const Ending ending = endingOf(c.job);
        EXPECT_EQ(ending.state, c.ending.state);
        EXPECT_EQ(ending.message, c.ending.message);
    }
}

TEST(Thread, RunsWhenStartReturnsAndIsStartedOnce) {
    const FNEvent go;
    const FNThread thread = FNSpawn([go] { go.wait(); }, "waiting");
    EXPECT_EQ(thread.state().state, FNThreadState::created);
    EXPECT_EQ(thrownBy([&] { thread.join(); }), "FNThread::InvalidState: joining a non-started thread");
    thread.start();
    EXPECT_EQ(thread.state().state, FNThreadState::running);
    EXPECT_EQ(thrownBy([&] { thread.start(); }), "FNThread::InvalidState: starting thread");
    go.signal();
    thread.join();
    EXPECT_NO_THROW(thread.join()) << "the second join of an ended thread reports nothing";
}

TEST(Thread, CanBeJoinedAfterAJoinThatWasRefused) {
    const std::string refused =
        "FNEBadArg: FNThread::join: A deadlock was detected or the value of target thread specifies the "
        "calling thread";
    for (const bool joinedMeanwhile : {false, true}) {
        const FNEvent go, tried;
        std::unique_ptr<FNThread> own;
        std::string message;
        const FNThread thread = FNSpawn(
            [&] {
                go.wait();
                message = thrownBy([&] { own->join(); });
                tried.signal();
                go.wait();
            },
            "own");
        own = std::make_unique<FNThread>(thread);
        thread.start();
        std::thread other;
        if (joinedMeanwhile) {
            other = std::thread([&] { EXPECT_EQ(thrownBy([&] { thread.join(); }), "nothing thrown"); });
            std::this_thread::sleep_for(std::chrono::milliseconds(20));
        }
        go.signal();
        tried.wait();
        EXPECT_EQ(message, refused);
        go.signal();
        if (joinedMeanwhile)
            other.join();
        else
            EXPECT_EQ(thrownBy([&] { thread.join(); }), "nothing thrown");
        EXPECT_EQ(thread.state().state, FNThreadState::ended) << "the join has waited for the end";
    }
}

TEST(Thread, ObserversSeeEachChange) {
    std::vector<int> states;
    const FNThread thread = FNSpawn([] {}, "seen");
    thread.addObserver([&](const FNThreadState& state) { states.push_back(state.state); });
    thread.start();
    thread.join();
    EXPECT_EQ(states, (std::vector<int>{FNThreadState::running, FNThreadState::ended}));
}

TEST(Thread, StopsAtEachKindOfCancellationPoint) {
    for (const Fn::Functor0& point :
         {Fn::Functor0([] { FNThreadSelf::serviceCancel(); }),
          Fn::Functor0([] { FNThreadSelf::sleep(60000); }), Fn::Functor0([event = FNEvent()] {
              std::this_thread::sleep_for(std::chrono::milliseconds(1));
              event.signal(); // an event that has a signal is no cancellation point
              event.wait();
              if (cancelArrived()) event.wait();
          })}) {
        const FNThread thread = FNSpawn(
            [point] {
                for (;;) point();
            },
            "stopping");
        thread.start();
        thread.requestCancel();
        thread.requestCancel();
        thread.join();
        EXPECT_EQ(thread.state().message, "Cancelled.");
    }
}

TEST(Thread, AnEventThatHasASignalIsNoCancellationPoint) {
    std::string passed;
    const FNThread thread = FNSpawn(
        [&] {
            while (!cancelArrived()) std::this_thread::sleep_for(std::chrono::milliseconds(1));
            const FNEvent event;
            event.signal();
            event.wait();
            passed += "signalled ";
            event.wait();
            passed += "unsignalled";
        },
        "signalled");
    thread.start();
    thread.requestCancel();
    thread.join();
    EXPECT_EQ(passed, "signalled ");
    EXPECT_EQ(thread.state().message, "Cancelled.");
}

TEST(Thread, CancellationWaitsWhileItIsDisabled) {
    const FNEvent inside, go;
    std::atomic<bool> passed = false;
    const FNThread thread = FNSpawn(
        [&] {
            {
                const FNThreadSelf::CancelDisabled disabled;
                inside.signal();
                go.wait();
                FNThreadSelf::sleep(1);
                FNThreadSelf::serviceCancel();
                passed = true;
            }
            FNThreadSelf::serviceCancel();
            passed = false;
        },
        "shy");
    thread.start();
    inside.wait();
    thread.requestCancel();
    go.signal();
    thread.join();
    EXPECT_TRUE(passed);
    EXPECT_EQ(thread.state().message, "Cancelled.");
}

TEST(Thread, TerminateStopsWhatNeverReachesACancellationPoint) {
#ifdef __SANITIZE_ADDRESS__
    GTEST_SKIP() << "the address sanitizer cannot follow the unwinding of a cancelled thread";
#endif
    const FNThread thread = FNSpawn(
        [] {
            for (;;) pthread_testcancel();
        },
        "stubborn");
    thread.start();
    thread.terminate();
    EXPECT_EQ(thread.state().state, FNThreadState::ended);
}

TEST(Thread, TerminateWaitsForTheEnd) {
#ifdef __SANITIZE_ADDRESS__
    GTEST_SKIP() << "the address sanitizer cannot follow the unwinding of a cancelled thread";
#endif
    std::atomic<bool> inside = false, gone = false;
    const FNThread thread = FNSpawn(
        [&] {
            const struct Slow {
                std::atomic<bool>& gone;
                ~Slow() {
                    std::this_thread::sleep_for(std::chrono::milliseconds(30));
                    gone = true;
                }
            } slow{gone};
            inside = true;
            for (;;) pthread_testcancel();
        },
        "slow to go");
    thread.start();
    ASSERT_TRUE(eventually([&] { return inside.load(); }));
    std::vector<int> states;
    thread.addObserver([&](const FNThreadState& state) { states.push_back(state.state); });
    thread.terminate();
    EXPECT_TRUE(gone);
    EXPECT_EQ(thread.state().message, "Cancelled.");
    EXPECT_EQ(states, std::vector<int>{FNThreadState::ended});
}

TEST(ThreadManager, NamesWhatIsStillReferenced) {
    const RecordedDialog dialog;
    const FNThread idle = FNSpawn([] {}, "idle one");
    FNThreadManager().reportLeft();
    EXPECT_EQ(
        std::ranges::count(dialog.messages(), "warn: FNThreadManager: thread idle one is still referenced"),
        1)
        << "others may still be about to end";
}

TEST(Thread, MayOutliveItsHandles) {
    const FNEvent go, done;
    {
        const FNThread thread = FNSpawn(
            [go, done] {
                go.wait();
                done.signal();
            },
            "alone");
        thread.start();
    }
    go.signal();
    done.wait();
}

TEST(Thread, ForeignThreadsKnowThemselves) {
    EXPECT_EQ(FNThreadSelf::state().name, "MainThread");
    std::thread([] {
        EXPECT_EQ(FNThreadSelf::state().state, FNThreadState::running);
        EXPECT_NE(FNThreadSelf::state().name, "MainThread");
        FNThreadSelf::sleep(1);
    }).join();
}

TEST(Thread, LeavesNoStackBehind) {
    const auto mappings = [] {
        std::ifstream maps("/proc/self/maps");
        return std::count(std::istreambuf_iterator<char>(maps), {}, '\n');
    };
    const auto before = mappings();
    for (int i = 0; i < 400; ++i) { // that nobody joins
        const FNThread thread = FNSpawn([] {});
        if (i % 2) thread.start();
    }
    // Some stacks are kept for later threads. Each has a mapping, and one more for its guard.
    EXPECT_TRUE(eventually([&] { return mappings() < before + 200; }));
}

TEST(Event, NoSignalIsLost) {
    const FNEvent event;
    for (int i = 0; i < 3; ++i) event.signal();
    for (int i = 0; i < 3; ++i) event.wait();
    const FNThread waiting = FNSpawn([event] { event.wait(); });
    waiting.start();
    event.signal();
    waiting.join();
    EXPECT_EQ(waiting.state().message, "Returned.");
}

TEST(Mutex, LocksThroughLockObjects) {
    const FNMutex recursive(FNMutex::recursive), plain(FNMutex::nonRecursive);
    FNMutexLock outer(recursive);
    { const FNMutexLock inner(recursive); }
    EXPECT_EQ(thrownBy([&] { recursive.lock(outer); }),
              "FNEBadFunCall: FNMutex::lock: the lock object already holds a mutex");
    outer.release();
    outer.release();

    FNMutexLock first(plain), second;
    EXPECT_EQ(
        thrownBy([&] { plain.lock(second); }),
        "FNESysError: Error in FNMutex::lock: pthread_mutex_lock(): A deadlock would occur if the thread "
        "blocked waiting for mutex.");
    std::thread([&] {
        FNMutexLock late;
        EXPECT_THROW(plain.lock(late, 20), FNETimeOut);
        EXPECT_EQ(late.mutexCore(), nullptr);
    }).join();
}

TEST(ConditionVariable, WaitsNeedALock) {
    const Fn::ConditionVariable condition;
    FNMutexLock none;
    EXPECT_EQ(thrownBy([&] { condition.wait(none); }),
              "FNEBadFunCall: ConditionVariable::wait: mutex is not locked.");
    Fn::CVMutex mutex;
    Fn::CVMutexLock lock(mutex);
    EXPECT_EQ(thrownBy([&] { lock.lock(); }), "FNEBadFunCall: CVMutexLock::lock(): already locket");
    lock.unlock();
    EXPECT_EQ(thrownBy([&] { lock.unlock(); }), "FNEBadFunCall: CVMutexLock::unlock(): already unlocked");

    bool ready = false;
    std::thread waiting([&] {
        Fn::CVMutexLock inside(mutex);
        while (!ready) condition.wait(inside);
    });
    lock.lock();
    ready = true;
    lock.unlock();
    condition.notifyAll();
    waiting.join();
}

/// A fair writer waits behind a reader; then whether a second reader gets in tells the kind of resource.
bool readerPassesWaitingWriter(const Fn::Resource& resource) {
    resource.wantToRead();
    std::atomic<bool> written = false, read = false;
    std::thread writer([&] {
        resource.wantToWrite();
        written = true;
        resource.haveWritten();
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    std::thread reader([&] {
        const Fn::ReadOnlyLock lock(resource);
        read = true;
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    const bool passed = read;
    EXPECT_FALSE(written);
    resource.haveRead();
    writer.join();
    reader.join();
    EXPECT_TRUE(written && read);
    return passed;
}

TEST(Resource, FairnessDecidesWhetherReadersPassAWriter) {
    EXPECT_FALSE(readerPassesWaitingWriter(Fn::FairResource()));
    EXPECT_TRUE(readerPassesWaitingWriter(Fn::ROPriorResource()));
}

TEST(Resource, AWriterCanTurnIntoAReader) {
    const Fn::FairResource fair;
    fair.wantToWrite();
    fair.haveWrittenStillWantToRead();
    std::thread([&] { const Fn::ReadOnlyLock lock(fair); }).join();
    fair.haveRead();
    { const Fn::ModifierLock lock(fair); }
    const Fn::ROPriorResource prior;
    EXPECT_EQ(thrownBy([&] { prior.haveWrittenStillWantToRead(); }),
              "FNEBadArg: Releasing ModifierLocks for reading not yet implemented with PriorResources");
}

TEST(Resource, ExcludesWritersUnderLoad) {
    const Fn::FairResource resource;
    int value = 0;
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([&, t] {
            for (int i = 0; i < 500; ++i) {
                if (t % 2) {
                    const Fn::ModifierLock lock(resource);
                    ++value;
                } else {
                    const Fn::ReadOnlyLock lock(resource);
                    EXPECT_LE(value, 1000);
                }
            }
        });
    for (auto& thread : threads) thread.join();
    EXPECT_EQ(value, 1000);
}

TEST(AsyncBuffer, AFullQueueDropsTheOldest) {
    for (const auto& [capacity, expected] :
         {std::pair{1ul, "03"}, std::pair{2ul, "023"}, std::pair{0ul, "0123"}}) {
        const FNEvent begun, go, done;
        std::string ran;
        Fn::AsyncBuffer buffer(capacity);
        buffer.push_back(
            [&] {
                begun.signal();
                go.wait();
                ran += "0";
            },
            {});
        begun.wait();
        for (const char* name : {"1", "2"}) buffer.push_back([&ran, name] { ran += name; }, {});
        buffer.push_back(
            [&] {
                ran += "3";
                done.signal();
            },
            {});
        go.signal();
        done.wait();
        EXPECT_EQ(ran, expected);
    }
}

TEST(AsyncBuffer, EndsWhenIdleAndStartsAgain) {
    Fn::AsyncBuffer buffer(0);
    std::atomic<int> busy = 0, idle = 0, ran = 0;
    buffer.addObserver([&](const bool& ended) { ++(ended ? idle : busy); });
    std::string failure;
    buffer.push_back([] { FN_THROW(FNEGeneric, "first"); },
                     [&](const std::exception& e) {
                         failure = e.what();
                         ++ran;
                     });
    ASSERT_TRUE(eventually([&] { return ran == 1; }));
    EXPECT_EQ(failure, "first");
    ASSERT_TRUE(eventually([&] { return idle == 1; })) << "20 passes of 100 ms";
    buffer.push_back([&] { ++ran; }, {});
    ASSERT_TRUE(eventually([&] { return ran == 2; }));
    EXPECT_EQ(busy, 2);
}

/// What jobs may do wrong, and what is reported of it.
const struct {
    Fn::Functor0 job;
    Fn::Functor1<std::exception> error;
    std::string reported;
} wrongJobs[] = {
    {[] { throw 7; }, {}, "a job threw what is no std::exception"},
    {[] { FN_THROW(FNEGeneric, "job"); }, [](const std::exception&) { FN_THROW(FNEGeneric, "error"); },
     "the error functor of a job failed: error"},
    {[] { FNThreadSelf::exit(); }, {}, ""},
};

TEST(AsyncBuffer, RunsTheJobsBehindOneThatGoesWrong) {
    for (const auto& wrong : wrongJobs) {
        const RecordedDialog dialog;
        std::atomic<int> ran = 0;
        {
            Fn::AsyncBuffer buffer(0);
            const FNEvent go;
            buffer.push_back([go] { go.wait(); }, {});
            buffer.push_back(wrong.job, wrong.error);
            buffer.push_back([&] { ++ran; }, {}); // waits behind it already
            go.signal();
            EXPECT_TRUE(eventually([&] { return ran == 1; })) << wrong.reported;
            buffer.push_back([&] { ++ran; }, {});
            EXPECT_TRUE(eventually([&] { return ran == 2; })) << wrong.reported;
        }
        std::vector<std::string> expected;
        if (!wrong.reported.empty()) expected.push_back("error: AsyncBuffer: " + wrong.reported);
        EXPECT_EQ(dialog.messages(), expected);
    }
}

TEST(AsyncBuffer, StartsAgainAfterAnObserverHasEndedItsThread) {
    Fn::AsyncBuffer buffer(0);
    std::atomic<int> ran = 0, told = 0;
    const std::string id = buffer.addObserver([&](const bool&) {
        ++told;
        throw 7;
    });
    buffer.push_back([&] { ++ran; }, {});
    ASSERT_TRUE(eventually([&] { return told == 1; }));
    buffer.removeObserver(id);
    ASSERT_TRUE(eventually([&] {
        buffer.push_back([&] { ++ran; }, {});
        return ran > 1;
    }));
}

TEST(AsyncRepeater, RepeatsAJobThatGoesWrong) {
    for (const auto& wrong : wrongJobs) {
        const RecordedDialog dialog;
        std::atomic<int> runs = 0;
        Fn::AsyncRepeater repeater(
            [&] {
                ++runs;
                wrong.job();
            },
            60000, wrong.error);
        for (int i = 1; i <= 3; ++i) {
            repeater.trigger();
            ASSERT_TRUE(eventually([&] { return runs == i; })) << wrong.reported;
        }
    }
}

TEST(AsyncRepeater, RepeatsUntilStopped) {
    std::atomic<int> runs = 0, errors = 0;
    Fn::AsyncRepeater repeater(
        [&] {
            if (++runs == 2) FN_THROW(FNEGeneric, "second");
        },
        1, [&](const std::exception&) { ++errors; });
    EXPECT_EQ(runs, 0);
    repeater.trigger();
    ASSERT_TRUE(eventually([&] { return runs == 1; }));
    repeater.start();
    repeater.start();
    ASSERT_TRUE(eventually([&] { return runs >= 5; }));
    repeater.stop();
    repeater.stop();
    EXPECT_EQ(errors, 1);
    const int stopped = runs;
    repeater.setDelay(60000);
    repeater.start();
    ASSERT_TRUE(eventually([&] { return runs > stopped; }));
}

TEST(AsyncRepeater, WaitsBetweenItsRuns) {
    std::atomic<int> runs = 0;
    Fn::AsyncRepeater repeater([&] { ++runs; }, 60000, {});
    repeater.start();
    ASSERT_TRUE(eventually([&] { return runs == 1; }));
    std::this_thread::sleep_for(std::chrono::milliseconds(30));
    EXPECT_EQ(runs, 1);
    repeater.setDelay(-5); // none
    repeater.stop();
    repeater.start();
    EXPECT_TRUE(eventually([&] { return runs > 5; }));
}

TEST(AsyncFunctor, RunsEachJobAtOnce) {
    std::atomic<int> inside = 0, errors = 0;
    Fn::AsyncFunctor run;
    for (int i = 0; i < 3; ++i)
        run(
            [&] {
                ++inside;
                eventually([&] { return inside == 3; }); // none waits for another
                FN_THROW(FNEGeneric, "end");
            },
            [&](const std::exception&) { ++errors; }, "job");
    EXPECT_TRUE(eventually([&] { return errors == 3; }));
}

TEST(AsyncFunctor, JoinsItsJobsAtTheEnd) {
    std::atomic<int> finished = 0, errors = 0;
    {
        Fn::AsyncFunctor run;
        for (int i = 0; i < 10; ++i)
            run(
                [&, i] {
                    if (i % 2) FN_THROW(FNEGeneric, "odd");
                    FNThreadSelf::sleep(5);
                    ++finished;
                },
                [&](const std::exception&) { ++errors; }, "job");
    }
    EXPECT_LE(finished, 5) << "a cancelled job does not finish";
    const int atTheEnd = finished;
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    EXPECT_EQ(finished, atTheEnd) << "none runs on";
}

TEST(Watchdog, CancelsByIdAndForgetsTheEnded) {
    FNThreadWatchdog watchdog;
    const FNThread thread = FNSpawn([] { FNThreadSelf::sleep(60000); }, "watched");
    watchdog.add(thread);
    thread.start();
    watchdog.requestCancel(thread.state().id + 1000);
    EXPECT_EQ(thread.state().state, FNThreadState::running);
    watchdog.requestCancel(thread.state().id);
    thread.join();
    EXPECT_EQ(thread.state().message, "Cancelled.");
}

} // namespace

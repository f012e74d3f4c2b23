#pragma once

#include "fn/callback/functor.h"
#include "fn/callback/observable.h"
#include "fn/thread/event.h"
#include "fn/thread/mutex.h"
#include "fn/thread/thread_watchdog.h"

#include <atomic>
#include <exception>
#include <list>
#include <string>

/// Runners of jobs in threads of their own. A std::exception of a job goes to the error functor that came
/// with it, on the runner's thread; anything else that a job throws is reported by FNDialog, or is in the
/// state of a thread of its own. FNThreadSelf::exit() ends the job that calls it.

namespace Fn {

/// Runs jobs one after another in a thread that lives while there are jobs and a little longer (20 passes of
/// 100 ms). Its observers are told false when the thread starts to work, and true when it ends. The
/// destructor cancels the thread; jobs that have not begun are lost.
class AsyncBuffer : public FNObservableBody1<bool> {
public:
    /// @param capacity longest queue; a job that comes to a full one pushes out the oldest. 0 for no limit.
    explicit AsyncBuffer(unsigned long capacity) : capacity_(capacity) {}

    void push_back(const Functor0& job, const Functor1<std::exception>& error);

private:
    struct Job {
        Functor0 run;
        Functor1<std::exception> error;
    };

    void run();
    void work();
    bool takeFirst(std::list<Job>& taken);

    std::list<Job> jobs_;
    FNMutex mutex_{FNMutex::recursive};
    const unsigned long capacity_;
    bool running_ = false;
    FNThreadWatchdog watchdog_; // last: its destructor ends the thread that uses the rest
};

/// Runs one job again and again. Triggers are counted: jobs queue up if they take longer than the delay.
class AsyncRepeater {
public:
    /// @param delay milliseconds from one trigger to the next.
    AsyncRepeater(const Functor0& job, int delay, const Functor1<std::exception>& error);
    ~AsyncRepeater();
    AsyncRepeater(const AsyncRepeater&) = delete;
    AsyncRepeater& operator=(const AsyncRepeater&) = delete;

    /// Triggers once now and after each delay; nothing if it does so already.
    void start();
    void stop();
    /// Takes effect at the next sleep.
    void setDelay(int delay) { delay_ = delay; }
    /// One run beside the regular ones.
    void trigger() { event_.signal(); }

private:
    void repeat();
    void work();
    FNThread newRepeater();

    const Functor0 job_;
    const Functor1<std::exception> error_;
    FNEvent event_;
    std::atomic<int> delay_;
    FNThread worker_;
    FNThread repeater_;
};

/// Runs each job once in a new thread. The destructor cancels and joins those that still run.
class AsyncFunctor : public FNThreadWatchdog {
public:
    void operator()(const Functor0& job, const Functor1<std::exception>& error, const std::string& name);
};

} // namespace Fn

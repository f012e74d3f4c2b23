#include "fn/thread/async.h"

#include "fn/callback/composition.h"
#include "fn/message/dialog.h"
#include "fn/thread/thread_impl.h"

namespace Fn {
namespace {

constexpr int idlePassesToLive = 20;
constexpr unsigned long idlePause = 100; // ms

/// Runs a job whose exceptions go to a handler. What goes no such way is reported: it must not end the
/// thread, which has other jobs to run.
/// @param runner named in the report
void runJob(const Functor0& job, const Functor1<std::exception>& error, const char* runner) {
    try {
        tryCatchFunctor(job, error)();
    } catch (const FNThreadImpl::ExitException&) {
        FNThreadSelf::serviceCancel(); // the thread is to end, or only the job has called exit()
    } catch (const std::exception& e) {
        FNDialog::error(std::string(runner) + ": the error functor of a job failed: " + e.what());
    } catch (...) {
        if (!std::current_exception()) throw; // terminate() unwinds the stack, and must not be stopped
        FNDialog::error(std::string(runner) + ": a job threw what is no std::exception");
    }
}

} // namespace

void AsyncBuffer::push_back(const Functor0& job, const Functor1<std::exception>& error) {
    const FNMutexLock lock(mutex_);
    if (capacity_ != 0 && jobs_.size() >= capacity_) jobs_.pop_front();
    jobs_.push_back({job, error});
    if (running_) return;
    const FNThread thread = FNSpawnNamedMember("AsyncBuffer", *this, &AsyncBuffer::run);
    watchdog_.add(thread);
    thread.start();
    running_ = true;
}

/// Moves the first job, if there is one, to `taken`.
bool AsyncBuffer::takeFirst(std::list<Job>& taken) {
    taken.clear();
    const FNMutexLock lock(mutex_);
    if (jobs_.empty()) return false;
    taken.splice(taken.begin(), jobs_, jobs_.begin());
    return true;
}

void AsyncBuffer::run() {
    try {
        work();
    } catch (...) { // however the thread ends, the next job gets a new one
        const FNMutexLock lock(mutex_);
        running_ = false;
        throw;
    }
}

void AsyncBuffer::work() {
    broadcast(false);
    std::list<Job> taken;
    for (int idlePasses = idlePassesToLive;;) {
        if (takeFirst(taken)) {
            runJob(taken.front().run, taken.front().error, "AsyncBuffer");
            idlePasses = idlePassesToLive;
            continue;
        }
        if (--idlePasses > 0) {
            FNThreadSelf::sleep(idlePause);
            continue;
        }
        const FNMutexLock lock(mutex_);
        if (!jobs_.empty()) { // came since the look above
            idlePasses = idlePassesToLive;
            continue;
        }
        broadcast(true);
        running_ = false;
        return;
    }
}

AsyncRepeater::AsyncRepeater(const Functor0& job, int delay, const Functor1<std::exception>& error)
    : job_(job), error_(error), delay_(delay),
      worker_(FNSpawnNamedMember("AsyncRepeater::worker", *this, &AsyncRepeater::work)),
      repeater_(newRepeater()) {
    worker_.start();
}

AsyncRepeater::~AsyncRepeater() {
    stop();
    worker_.requestCancel();
    event_.signal(); // it may be asleep on the event
    worker_.join();
}

FNThread AsyncRepeater::newRepeater() {
    return FNSpawnNamedMember("AsyncRepeater::repeater", *this, &AsyncRepeater::repeat);
}

void AsyncRepeater::start() {
    if (repeater_.state().state == FNThreadState::created) repeater_.start();
}

void AsyncRepeater::stop() {
    if (repeater_.state().state == FNThreadState::created) return;
    repeater_.requestCancel();
    repeater_.join();
    repeater_ = newRepeater();
}

void AsyncRepeater::repeat() {
    for (;;) {
        event_.signal();
        FNThreadSelf::sleep(static_cast<unsigned long>(delay_ > 0 ? delay_.load() : 0));
        FNThreadSelf::serviceCancel();
    }
}

void AsyncRepeater::work() {
    for (;;) {
        event_.wait();
        FNThreadSelf::serviceCancel();
        runJob(job_, error_, "AsyncRepeater");
        FNThreadSelf::serviceCancel();
    }
}

void AsyncFunctor::operator()(const Functor0& job, const Functor1<std::exception>& error,
                              const std::string& name) {
    const FNThread thread = FNSpawn(tryCatchFunctor(job, error), name);
    add(thread);
    thread.start();
}

} // namespace Fn

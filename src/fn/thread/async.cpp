#include "fn/thread/async.h"

#include "fn/callback/composition.h"

namespace Fn {
namespace {

constexpr int idlePassesToLive = 20;
constexpr unsigned long idlePause = 100; // ms

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
    broadcast(false);
    std::list<Job> taken;
    for (int idlePasses = idlePassesToLive;;) {
        if (takeFirst(taken)) {
            tryCatchFunctor(taken.front().run, taken.front().error)();
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
    const Functor0 guarded = tryCatchFunctor(job_, error_);
    for (;;) {
        event_.wait();
        FNThreadSelf::serviceCancel();
        guarded();
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

#include "fn/thread/thread_watchdog.h"

#include "fn/message/dialog.h"

FNThreadWatchdog::~FNThreadWatchdog() {
    const std::list<FNThread> left = threads();
    for (const auto operation : {&FNThread::requestCancel, &FNThread::join})
        for (const FNThread& thread : left) {
            if (thread.state().state == FNThreadState::created) continue;
            try {
                (thread.*operation)();
            } catch (const std::exception& e) {
                FNDialog::error(std::string("FNThreadWatchdog: ") + e.what());
            }
        }
}

void FNThreadWatchdog::add(const FNThread& thread) {
    const FNMutexLock lock(mutex_);
    threads_.push_back(thread);
    thread.addObserver(Fn::Functor1<FNThreadState>::callee(*this, &FNThreadWatchdog::threadStateChanged));
}

void FNThreadWatchdog::requestCancel(int id) {
    for (const FNThread& thread : threads())
        if (thread.state().id == id) thread.requestCancel();
}

void FNThreadWatchdog::threadStateChanged(const FNThreadState& state) {
    if (state.state != FNThreadState::failed && state.state != FNThreadState::ended) return;
    const FNMutexLock lock(mutex_);
    threads_.remove_if([&](const FNThread& thread) { return thread.state().id == state.id; });
}

std::list<FNThread> FNThreadWatchdog::threads() const {
    const FNMutexLock lock(mutex_);
    return threads_;
}

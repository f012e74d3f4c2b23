#pragma once

#include "fn/thread/mutex.h"
#include "fn/thread/thread.h"

#include <list>

/// Looks after threads: forgets one that has ended, and cancels and joins what is left at its own end.
class FNThreadWatchdog {
public:
    FNThreadWatchdog() = default;
    ~FNThreadWatchdog();
    FNThreadWatchdog(const FNThreadWatchdog&) = delete;
    FNThreadWatchdog& operator=(const FNThreadWatchdog&) = delete;

    void add(const FNThread& thread);
    /// Asks the thread with this id to stop; does nothing if it is not here.
    void requestCancel(int id);

private:
    void threadStateChanged(const FNThreadState& state);
    std::list<FNThread> threads() const;

    FNMutex mutex_{FNMutex::recursive};
    std::list<FNThread> threads_;
};

#pragma once

#include "fn/cptr.h"

/// A stopwatch. It runs from its construction on, by the time of the system unless it is given another.
///
///     const FNRealTime time;
///     work();
///     std::cout << time.seconds();
class FNRealTime {
public:
    /// What tells the time, and lets it pass. May be used by any number of threads.
    class Clock {
    public:
        virtual ~Clock() = default;
        /// Since a moment that stays the same; never less than before.
        virtual double seconds() const = 0;
        /// A cancellation point of the calling thread.
        virtual void sleep(unsigned int milliseconds) const = 0;

        static FNCountedPtr<Clock> system();
    };

    explicit FNRealTime(const FNCountedPtr<Clock>& clock = Clock::system())
        : clock_(clock), start_(clock->seconds()) {}

    void restart() { start_ = clock_->seconds(); }
    double seconds() const { return clock_->seconds() - start_; }
    /// Whole ones.
    long milliseconds() const { return static_cast<long>(seconds() * 1000); }

private:
    FNCountedPtr<Clock> clock_;
    double start_;
};

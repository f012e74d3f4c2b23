#pragma once

#include "fn/real_time.h"

namespace Kx {

/// The time that one pass over streams has been given, without the time in which it is held, and the pace of
/// its steps. It runs from its construction on.
class TimeFlowController {
public:
    /// @param totalTime what the pass may take, milliseconds
    /// @param minPeriod least time from the end of one wait to that of the next, milliseconds
    TimeFlowController(int totalTime, int minPeriod,
                       const FNCountedPtr<FNRealTime::Clock>& clock = FNRealTime::Clock::system())
        : totalTime_(totalTime), minPeriod_(minPeriod), clock_(clock), running_(clock), currentHold_(clock) {}

    /// Whether more than the total time is over.
    bool elapsed() const;
    /// Until release(), time does not count. Does nothing while it is held already.
    void hold();
    void release();
    /// Sleeps what is left of the period.
    void waitMinPeriod();

    /// Holds the time of a block.
    class Hold {
    public:
        explicit Hold(TimeFlowController& time) : time_(time) { time_.hold(); }
        ~Hold() { time_.release(); }
        Hold(const Hold&) = delete;
        Hold& operator=(const Hold&) = delete;

    private:
        TimeFlowController& time_;
    };

private:
    int totalTime_;
    int minPeriod_;
    FNCountedPtr<FNRealTime::Clock> clock_;
    float lastPeriodStart_ = 0; // seconds
    float heldTime_ = 0;        // seconds, without the current hold
    FNRealTime running_;
    FNRealTime currentHold_;
    bool holding_ = false;
};

} // namespace Kx

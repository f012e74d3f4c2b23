#include "fn/real_time.h"

#include "fn/thread/thread.h"

#include <chrono>

namespace {

class SystemClock final : public FNRealTime::Clock {
public:
    double seconds() const override {
        const auto sinceStart = std::chrono::steady_clock::now().time_since_epoch();
        return std::chrono::duration<double>(sinceStart).count();
    }
    void sleep(unsigned int milliseconds) const override { FNThreadSelf::sleep(milliseconds); }
};

} // namespace

FNCountedPtr<FNRealTime::Clock> FNRealTime::Clock::system() {
    static const auto& clock = *new FNCountedPtr<Clock>(new SystemClock);
    return clock;
}

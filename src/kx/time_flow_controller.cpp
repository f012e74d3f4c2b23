#include "kx/time_flow_controller.h"

namespace Kx {

namespace {

/// Whole ones.
long milliseconds(double seconds) {
    return static_cast<long>(seconds * 1000);
}

} // namespace

bool TimeFlowController::elapsed() const {
    const double held = heldTime_ + (holding_ ? currentHold_.seconds() : 0.0);
    return milliseconds(running_.seconds() - held) > totalTime_;
}

void TimeFlowController::hold() {
    if (holding_) return;
    currentHold_.restart();
    holding_ = true;
}

void TimeFlowController::release() {
    if (!holding_) return;
    heldTime_ += static_cast<float>(currentHold_.seconds());
    holding_ = false;
}

void TimeFlowController::waitMinPeriod() {
    const long rest = minPeriod_ - milliseconds(running_.seconds() - lastPeriodStart_);
    if (rest > 0) clock_->sleep(static_cast<unsigned int>(rest));
    lastPeriodStart_ = static_cast<float>(running_.seconds());
}

} // namespace Kx

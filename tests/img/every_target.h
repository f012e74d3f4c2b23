#pragma once

#include <hwy/highway.h>

#include <gtest/gtest.h>

/// Runs `test` once with each instruction set that the dispatcher can choose on this machine.
template <class Test> void onEveryTarget(Test test) {
    for (const std::int64_t target : hwy::SupportedAndGeneratedTargets()) {
        SCOPED_TRACE(hwy::TargetName(target));
        hwy::SetSupportedTargetsForTest(target);
        hwy::GetChosenTarget().Update(target);
        test();
        hwy::SetSupportedTargetsForTest(0);
        hwy::GetChosenTarget().Update(hwy::SupportedTargets());
    }
}

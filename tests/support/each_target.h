#pragma once

#include <hwy/targets.h>

#include <gtest/gtest.h>

/// Calls `check` once for each instruction set that this processor has and the dispatcher can choose, with
/// the dispatcher held to it.
template <class Check> void forEachTarget(Check check) {
    const auto targets = hwy::SupportedAndGeneratedTargets();
    ASSERT_FALSE(targets.empty());
    for (const auto target : targets) {
        SCOPED_TRACE(hwy::TargetName(target));
        hwy::SetSupportedTargetsForTest(target);
        hwy::GetChosenTarget().Update(hwy::SupportedTargets());
        check();
    }
    hwy::SetSupportedTargetsForTest(0);
    hwy::GetChosenTarget().Update(hwy::SupportedTargets());
}

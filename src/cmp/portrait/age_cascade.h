#pragma once

#include <limits>
#include <string>
#include <vector>

/// How age is told: a first estimate chooses, by the least boundary above it, the estimator of the second
/// stage, and that one's estimate the estimator of the third.

namespace Cmp::Portrait {

struct AgeEstimator {
    float boundary; ///< years
    std::string key;
    std::string file; ///< default of the key
    std::string doc;
};

/// Of one stage, by rising boundary.
using AgeStage = std::vector<AgeEstimator>;

/// The member of the analyser's configuration that has the keys.
inline constexpr const char* ageFilesKey = "AgeDiscFiles";

const AgeEstimator& primaryAgeEstimator();
/// The stages after the first.
const std::vector<AgeStage>& laterAgeStages();

/// @param score(estimator) in years
template <class Score> float ageOfCascade(Score score) {
    float age = score(primaryAgeEstimator());
    for (const AgeStage& stage : laterAgeStages())
        for (const AgeEstimator& estimator : stage)
            if (estimator.boundary > age) {
                age = score(estimator);
                break;
            }
    return age;
}

} // namespace Cmp::Portrait

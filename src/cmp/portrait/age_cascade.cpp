#include "cmp/portrait/age_cascade.h"

namespace Cmp::Portrait {

namespace {

AgeStage makeStage(const std::string& key, const std::string& fileStem, int step, int last) {
    AgeStage stage;
    for (int age = step; age <= last; age += step) {
        const std::string years = std::to_string(age);
        stage.push_back({static_cast<float>(age), key + years, fileStem + years + ".dat",
                         key + " disc file for age below " + years + "."});
    }
    stage.push_back({std::numeric_limits<float>::max(), key + "Above", fileStem + "above.dat",
                     key + " disc file for age above " + std::to_string(last) + "."});
    return stage;
}

} // namespace

const AgeEstimator& primaryAgeEstimator() {
    static const AgeEstimator& estimator =
        *new AgeEstimator{0, "Primary", "age-primary.dat", "Primary disc file."};
    return estimator;
}

const std::vector<AgeStage>& laterAgeStages() {
    static const std::vector<AgeStage>& stages = *new std::vector<AgeStage>{
        makeStage("Secondary", "age-secondary-1-", 10, 80), makeStage("Tertiary", "age-secondary-2-", 5, 85)};
    return stages;
}

} // namespace Cmp::Portrait

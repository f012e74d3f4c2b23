#pragma once

#include "cmp/b7/sample_evaluator.h"
#include "cmp/mapping_files.h"
#include "fn/deployment/composite_values.h"

namespace Cmp::B7 {

/// Mapping files for scores as they are, and for those that a search has normalized.
struct ScoreNormalizationDisabled {
    static std::string typeId() { return "Cmp::B7::ScoreNormalizationDisabled"; }
    static Fn::Deployment::Type define();
};
struct ScoreNormalizationEnabled {
    static std::string typeId() { return "Cmp::B7::ScoreNormalizationEnabled"; }
    static Fn::Deployment::Type define();
};
struct ScoreNormalization {
    static std::string typeId() { return "Cmp::B7::ScoreNormalization"; }
    static Fn::Deployment::Type define();
};

/// Which samples a builder keeps.
struct SampleSelector {
    SampleSelector() = default;
    /// @throws FNEBadArg for a value out of its range
    explicit SampleSelector(const Fn::Deployment::Component& component);

    static std::string typeId() { return "Cmp::B7::SampleSelector"; }
    static Fn::Deployment::Type define();

    SampleEvaluator evaluator;
    bool strictLandmarks = true;  ///< only samples whose eyes were both found
    float qualityFraction = 0.9f; ///< of the best sample's quality that the others must reach
    unsigned int maxSamples = 32;
};

/// What the B7 generation is told by its configuration, beside the settings of its finders.
struct Settings {
    /// @throws FNEBadArg for a value out of its range
    explicit Settings(const Fn::Deployment::Component& component);
    static std::list<Fn::Deployment::Property> properties();

    std::string transformationFile; ///< path
    unsigned int maxNumberOfClusters;
    bool normalizeScores;
    Implementation::MappingFiles mappings;
    std::string firVersion;
    bool twoItemsAtOnce;
    SampleSelector selector;
};

} // namespace Cmp::B7

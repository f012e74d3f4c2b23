#pragma once

#include "cmp/mapping_files.h"
#include "fn/deployment/composite_values.h"

namespace Cmp::Implementation {

/// Pre-processors by their names in a configuration.
struct PreprocessorNames {
    static std::list<std::string> enumeration() {
        return {"GPyr", "GPyrENRLH", "B4Preprocessor", "GPyrNoPreproc", "GPyrRankNormNoPreproc"};
    }
};
using PreprocessorEnum = Fn::Deployment::Enum<PreprocessorNames>;

/// Encodings by their names in a configuration. Only the first one is built.
struct FirEncodingNames {
    static std::list<std::string> enumeration() {
        return {"FloatEncoding", "ByteEncoding", "A13BitReduction", "B3BitReduction", "B4BitReduction"};
    }
};
using FirEncodingEnum = Fn::Deployment::Enum<FirEncodingNames>;

struct IsoTropisationSettings {
    static std::string typeId() { return "Cmp::PCLD::IsoTropisationSettings"; }
    static Fn::Deployment::Type define();
};

/// What a member of the PCLD family is told by its configuration.
struct Settings {
    /// Values that differ between the members.
    struct Defaults {
        std::string preprocessor, transformation;
        MappingFiles::Paths mappings;
        std::string encoding, firVersion, strategyName;
    };

    Settings() = default;
    explicit Settings(const Fn::Deployment::Component& component);
    static std::list<Fn::Deployment::Property> properties(const Defaults& defaults);

    std::string preprocessor;
    std::string transformationFile;               ///< path, as the next two
    MappingFiles mappings{MappingFiles::Paths()}; ///< of the module "PCLD"
    std::string isotropisationFile;               ///< empty for none
    int maxNumberOfClusters = 5;
    std::string encoding;
    std::string firVersion;
    std::string strategyName;
};

/// L5: for images of 3D data seen along one axis.
struct L5Settings : Settings {
    L5Settings() = default;
    /// @throws FNEBadArg for another direction than 'x' and 'z'
    explicit L5Settings(const Fn::Deployment::Component& component);

    static std::string typeId() { return "L5ComparisonAlgorithm"; }
    static Fn::Deployment::Type define();

    char direction = 'x';
};

} // namespace Cmp::Implementation

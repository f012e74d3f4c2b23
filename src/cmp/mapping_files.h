#pragma once

#include "cmp/score_mapping.h"
#include "fn/deployment/component.h"
#include "fn/thread/mutex.h"

namespace Cmp::Implementation {

/// A mapping file is the package of one table. @throws FNEBadArg "<module>: File `<path>' could not be opened
/// for reading."; for anything else that is wrong, the exception of the table or package with the path added
Fn::InvertibleFunction<float, float> readMappingFile(const std::string& path, const std::string& module);
/// @throws FNEIOError if the file cannot be written
void writeMappingFile(const Fn::InvertibleFunction<float, float>& table, const std::string& path);

/// The mapping files of one algorithm, and what is made of them.
///
/// @param module begins the text of a failure to open a file
class MappingFiles {
public:
    /// Paths; an empty one stands for no file.
    struct Paths {
        std::string similarity, far, frr;
    };
    explicit MappingFiles(const Paths& paths, const std::string& module = "CmpAlgorithm")
        : paths_(paths), module_(module) {}
    /// Reads the settings that properties() declares. @param dataDir folder of the files
    MappingFiles(const std::string& dataDir, const Fn::Deployment::Component& component,
                 const std::string& module = "CmpAlgorithm");

    /// `SimMappingFile`, `FARMappingFile`, `FRRMappingFile`.
    /// @param defaults names of the files
    /// @param kind how their descriptions name the algorithm
    static std::list<Fn::Deployment::Property> properties(const Paths& defaults,
                                                          const std::string& kind = "GCmpAlgorithm");

    /// An IdentityScoreMapping if there is no file. Made at the first call and kept, as the next one is.
    FNCountedPtr<ScoreMapping> scoreMapping() const;
    /// @throws FNEBadArg if one of the two files is not set
    FNCountedPtr<RatesMapping> ratesMapping() const;

    const Paths& paths() const noexcept { return paths_; }

private:
    Paths paths_;
    std::string module_;
    FNMutex mutex_{FNMutex::recursive}; ///< guards the next two
    mutable FNCountedPtr<ScoreMapping> scoreMapping_;
    mutable FNCountedPtr<RatesMapping> ratesMapping_;
};

/// `folder`/`name`, or nothing for an empty name.
std::string pathInFolder(const std::string& folder, const std::string& name);

} // namespace Cmp::Implementation

#include "cmp/mapping_files.h"

#include "fn/deployment/leaf_values.h"

#include <fstream>

namespace Cmp::Implementation {

using namespace Fn::Deployment;

namespace {

using Table = Fn::InvertibleFunction<float, float>;

constexpr const char* similarityKey = "SimMappingFile";
constexpr const char* farKey = "FARMappingFile";
constexpr const char* frrKey = "FRRMappingFile";

} // namespace

std::string pathInFolder(const std::string& folder, const std::string& name) {
    return name.empty() ? std::string() : folder + "/" + name;
}

Table readMappingFile(const std::string& path, const std::string& module) {
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEBadArg, module + ": File `" + path + "' could not be opened for reading.");
    const std::string where = " (`" + path + "')";
    try {
        return Table(Fn::Package(stream));
    } catch (const FNEBadArg& e) {
        FN_THROW(FNEBadArg, e.what() + where);
    } catch (const FNEIOError& e) {
        FN_THROW(FNEIOError, e.what() + where);
    }
}

void writeMappingFile(const Table& table, const std::string& path) {
    std::ofstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "Cannot write the mapping file `" + path + "'");
    Fn::serialize(table).write(stream);
    stream.close();
    if (!stream) FN_THROW(FNEIOError, "Cannot write the mapping file `" + path + "'");
}

MappingFiles::MappingFiles(const std::string& dataDir, const Component& component, const std::string& module)
    : module_(module) {
    const auto path = [&](const char* key) {
        return pathInFolder(dataDir, Value<String>::get(component.subComponent(key)));
    };
    paths_ = {path(similarityKey), path(farKey), path(frrKey)};
}

std::list<Property> MappingFiles::properties(const Paths& defaults, const std::string& kind) {
    const std::string name = "Name of " + kind;
    return Fn::Deployment::properties(
        propertyWithDefault<String>::create(similarityKey, defaults.similarity, name + " score mapping file"),
        propertyWithDefault<String>::create(farKey, defaults.far, name + " far mapping file"),
        propertyWithDefault<String>::create(frrKey, defaults.frr, name + " frr mapping file"));
}

FNCountedPtr<ScoreMapping> MappingFiles::scoreMapping() const {
    const FNMutexLock lock(mutex_);
    if (!scoreMapping_) {
        ScoreMapping* const made = paths_.similarity.empty()
                                       ? static_cast<ScoreMapping*>(new IdentityScoreMapping)
                                       : new SMap(readMappingFile(paths_.similarity, module_));
        scoreMapping_ = FNCountedPtr<ScoreMapping>(made);
    }
    return scoreMapping_;
}

FNCountedPtr<RatesMapping> MappingFiles::ratesMapping() const {
    const FNMutexLock lock(mutex_);
    if (paths_.far.empty() || paths_.frr.empty())
        FN_THROW(FNEBadArg, "Requesting Rates Mapping w/o mapping files");
    if (!ratesMapping_)
        ratesMapping_ = FNCountedPtr<RatesMapping>(
            new RMap(readMappingFile(paths_.far, module_), readMappingFile(paths_.frr, module_)));
    return ratesMapping_;
}

} // namespace Cmp::Implementation

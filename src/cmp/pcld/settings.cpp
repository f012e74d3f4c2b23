#include "cmp/pcld/settings.h"

namespace Cmp::Implementation {

using namespace Fn::Deployment;

namespace {

constexpr const char* module = "PCLD";

std::string text(const Component& component, const char* key) {
    return Value<String>::get(component.subComponent(key));
}

std::string isotropisationFile(const Component& component, const std::string& dataDir) {
    const Component option = component.subComponent("IsoTropisation");
    if (Value<Option<IsoTropisationSettings>>::get(option) != "Enabled") return {};
    return pathInFolder(dataDir, text(option.subComponent("Enabled"), "IsoTropDbFile"));
}

} // namespace

Type IsoTropisationSettings::define() {
    return Type(
        typeId(), "PCLD comparison module isotropisation configurable settings",
        Fn::Deployment::properties(propertyWithDefault<String>::create(
            "IsoTropDbFile", "isotdb.dat", "Name of the isotropisation db file.( default: isotdb.dat)")),
        "", false);
}

std::list<Property> Settings::properties(const Defaults& defaults) {
    std::list<Property> all = Fn::Deployment::properties(
        propertyWithDefault<String>::create("DataDir", "$INSTALLDIR/etc/cmp",
                                            "Path of the directory which contains the mapping files."),
        propertyWithDefault<PreprocessorEnum>::create("Preprocessor", defaults.preprocessor,
                                                      "Type of image preproccesor to be used."),
        propertyWithDefault<String>::create("TransfFile", defaults.transformation,
                                            "Name of GPCLD transformator file"));
    all.splice(all.end(), MappingFiles::properties(defaults.mappings, "GPCLD"));
    all.splice(
        all.end(),
        Fn::Deployment::properties(
            property<Option<IsoTropisationSettings>>::create("IsoTropisation",
                                                             "Whether to use isotropisation."),
            propertyWithDefault<Int>::create(
                "MaxNumOfClusters", 5,
                "Maximum number of feature vectors used to constitute a reference set"),
            propertyWithDefault<FirEncodingEnum>::create("FIREncoding", defaults.encoding,
                                                         "Encoding in order to reduce memory usage."),
            propertyWithDefault<String>::create("FIRVersion", defaults.firVersion, "Version label of FIRs."),
            propertyWithDefault<String>::create("CmpStrategyName", defaults.strategyName,
                                                "Name of the comparision strategy.")));
    return all;
}

Settings::Settings(const Component& component) {
    const std::string dataDir = text(component, "DataDir");
    preprocessor = Value<PreprocessorEnum>::get(component.subComponent("Preprocessor"));
    transformationFile = pathInFolder(dataDir, text(component, "TransfFile"));
    mappings = MappingFiles(dataDir, component, module);
    isotropisationFile = Implementation::isotropisationFile(component, dataDir);
    maxNumberOfClusters = Value<Int>::get(component.subComponent("MaxNumOfClusters"));
    encoding = Value<FirEncodingEnum>::get(component.subComponent("FIREncoding"));
    firVersion = text(component, "FIRVersion");
    strategyName = text(component, "CmpStrategyName");
}

L5Settings::L5Settings(const Component& component) : Settings(component) {
    const std::string dir = text(component, "Dir");
    if (dir != "x" && dir != "z") FN_THROW(FNEBadArg, "L5Settings: invalid direction");
    direction = dir.front();
}

Type L5Settings::define() {
    std::list<Property> all = Settings::properties({"GPyrRankNormNoPreproc",
                                                    "trans-l5x.dat",
                                                    {"smap-b5l5.dat", "farmap-b5l5.dat", "frrmap-b5l5.dat"},
                                                    "FloatEncoding",
                                                    "FIR 7.9",
                                                    "L5"});
    all.push_back(
        propertyWithDefault<String>::create("Dir", "x", "Direction, value has to be either 'x' or 'z'"));
    return Type(typeId(), "Configurable settings for L5 comparison module", all, "", false);
}

} // namespace Cmp::Implementation

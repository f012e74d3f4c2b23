#include "orbek/implementation/orbek_properties.h"

#include "cmp/b7/cmp_algorithm.h"
#include "cmp/portrait/analyzer.h"
#include "eye/cara/face_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/tracker/reference_face_tracker.h"
#include "fg/capture_types.h"
#include "fn/deployment/composite_values.h"
#include "kx/feature_test.h"
#include "kx/full_frontal_creator.h"
#include "kx/full_frontal_test.h"
#include "kx/set_enroller.h"
#include "kx/set_identifier.h"
#include "kx/set_recognizer.h"
#include "kx/stream_enroller.h"
#include "kx/stream_identifier.h"
#include "kx/stream_recognizer.h"
#include "kx/token_face.h"

namespace Orbek {

using namespace Fn::Deployment;

namespace {

/// A member whose subsystem is not built yet: a record without members under its final name.
Property pending(const std::string& name, const std::string& typeId, const std::string& doc) {
    return Property(Type(typeId, doc, "", false), name, "", doc, false);
}

struct ComparisonModule {
    static std::string typeId() { return "ComparisonModule"; }
    static Type define() {
        return Type(
            typeId(), "Comparison Modules and settings",
            properties(property<Alternative<ComparisonAlgorithms>>::create(
                           "AlgorithmVersion", "Select the algorithm to be used by the matching engine"),
                       propertyWithDefault<Int>::create(
                           "NumberOfThreads", 1,
                           "Number of parallel threads to be launched for FIR-population comparison "
                           "(Identification): 0 or 1 means no additional threads (default: 1). For using N "
                           "CPU's, set this value to N.")),
            "", false);
    }
};

/// Camera control is not built yet: a record without members.
struct CamControl {
    static std::string typeId() { return "Kx::CamControl"; }
    static Type define() { return Type(typeId(), "", "", false); }
};

std::list<Property> members() {
    return properties(
        property<Eye::Cara::T8::FaceFinder>::create("FaceFinder", "Face Finder"),
        property<Eye::Ojo::T8::EyesFinder>::create("EyesFinder", "Eyes Finder to use."),
        property<ComparisonModule>::create("ComparisonAlgorithm", "Type of Comparison Algorithm"),
        property<Kx::SetEnroller>::create("SetEnroller", "Set Enroller"),
        property<Kx::StreamEnroller>::create("StreamEnroller", "Stream Enroller"),
        property<Kx::StreamRecognizer>::create("StreamVerifier", "Stream Verifier"),
        property<Kx::StreamIdentifier>::create("StreamIdentifier", "Stream Identifier"),
        property<Kx::SetRecognizer>::create("SetVerifier", "Set Verifier"),
        property<Kx::SetIdentifier>::create("SetIdentifier", "Set Identifier"),
        property<Eye::ReferenceFaceTracker>::create("FaceTracker", "Face Tracker Engine"),
        property<Cmp::Portrait::Analyzer>::create("PortraitAnalyzer", "Portrait Analyzer"),
        property<Kx::ISO_19794_5::FullFrontal::Test>::create("ISOFullFrontalTest",
                                                             "ISO 19794-5 Full Frontal images assessment"),
        property<Kx::Feature::Test>::create("FeatureTest", "Portrait feature assessment"),
        property<Kx::FullFrontal::Creator>::create("CropFullFrontal",
                                                   "ISO 19794-5 Full Frontal images cropping"),
        property<Kx::TokenFace::CropTokenImage>::create("CropTokenImage",
                                                        "ISO 19794-5 Token images cropping"),
        property<FG::DllFrameGrabberFactoryCacheDef>::create(
            "FgDllCache", "Definition of DLL load paths for capture devices"),
        property<Container<FG::FrameGrabberFactoryDef>>::create("CaptureDevices",
                                                                "Configuration of capture devices"),
        property<Container<CamControl>>::create(
            "CameraControllers", "The controller settings for automatic adjustment ofcamera parameters"),
        property<Container<String>>::create(
            "Substitutions",
            "Variable substitutions. All variables in this container can be referenced in other "
            "configurable items' values. e.g. reference INSTALLDIR as $INSTALLDIR"));
}

/// One ready-made capture device, and the two standard variables.
std::list<Default> imposedDefaults() {
    const std::string files = "CaptureDevices.Files";
    const std::string location = files + ".ImageFiles.FileLocation";
    using Devices = Container<FG::FrameGrabberFactoryDef>;
    return {
        Default(type<Devices>(), "CaptureDevices", "Files"),
        defaultValue<FG::FrameGrabberFactoryDef>::create(files, "ImageFiles"),
        defaultValue<Alternative<FG::MultiFileLocations>>::create(location, "Files"),
        Default(type<Container<String>>(), location + ".Files", "bob alice"),
        defaultValue<String>::create(location + ".Files.bob", "$INSTALLDIR/examples/images/bob1.jpg"),
        defaultValue<String>::create(location + ".Files.alice", "$INSTALLDIR/examples/images/alice1.jpg"),
        Default(type<Container<String>>(), "Substitutions", "INSTALLDIR FGLIBDIR"),
        defaultValue<String>::create("Substitutions.FGLIBDIR", "lib/x86_64/"),
    };
}

} // namespace

Type ComparisonAlgorithms::define() {
    return Type(typeId(), "Available comparison algorithms",
                properties(property<Cmp::B7::CmpAlgorithm>::create("B7", "B7 Comparison Algorithm"),
                           pending("B6", "Cmp::B6::CmpAlgorithm", "B6 Comparison Algorithm"),
                           pending("A14", "Cmp::A14::CmpAlgorithm", "A14 Comparison Algorithm"),
                           pending("B6L5", "Cmp::Implementation::B6L5", "B6L5 Comparison Algorithm")),
                "", false);
}

Type ORBEKProperties::define() {
    return Type(typeId(), "Tessarin SDK Resources", members(), imposedDefaults(), "", false);
}

} // namespace Orbek

#include "fg/capture_types.h"

namespace FG {

using namespace Fn::Deployment;

namespace {

struct SortingKinds {
    static std::list<std::string> enumeration() { return {"No", "AscendingByName", "DescendingByName"}; }
};

struct GrabberKind {
    const char* name;
    const char* doc;
};

constexpr GrabberKind kindsBeforeImageFiles[] = {
    {"DirectShowDevice", "Direct Show windows capture device"},
    {"DirectShowURL", "Direct Show video stream"},
    {"WMF", "Windows Media Foundation video stream"},
    {"Basler", "Basler cameras"},
    {"GStreamer", "GStreamer video streams"},
    {"VideoForLinux2", "Video for Linux (2) capture devices"},
    {"VideoForLinux", "Video for Linux capture devices"},
    {"Http", "Network cameras using HTTP as transmission protcol"},
    {"Prosilica", "Prosilica cameras"},
    {"PtGrey", "PointGrey cameras"},
    {"UEye", "IDS Ueye cameras"},
    {"Lumenera", "Lumenera cameras"},
    {"DSLR", "DSLRCamera via PTP"},
};

} // namespace

Type MultiFileLocations::define() {
    return Type(typeId(), "Multiple image file locations",
                properties(property<String>::create("Directory", "Directory with image names"),
                           property<Container<String>>::create("Files", "Container of image files")),
                "", false);
}

Type MultiFileDef::define() {
    using OptionalFloat = AlternativeN<None, Float>;
    using OptionalUInt = AlternativeN<None, UInt>;
    return Type(
        typeId(), "Settings for multiple image file grabber, supported image formats are Jpeg, Png, Bmp, Pgm",
        properties(
            property<Alternative<MultiFileLocations>>::create("FileLocation",
                                                              "Where the image files comes from"),
            propertyWithDefault<Bool>::create(
                "ImageCaching", true,
                "If it is set to true, than during the initialization all image files "
                "are prefetched and stored in a data cache."),
            property<Enum<SortingKinds>>::create(
                "Sorting", "Indicates whether and how to perform a sorting of the input files"),
            propertyWithDefault<Bool>::create("ContinuousPlayback", true,
                                              "Indicates whether to loop continuously through the image "
                                              "sequence. If it is set to false and all "
                                              "available images are already consumed the subsequent calls to "
                                              "the grabber would deliver the last "
                                              "image of the sequence."),
            propertyWithDefault<Float>::create(
                "CaptureFrameRate", 25.0f,
                "Simulated Capture Frame Rate of the image sequence measured in frames per second [fps]. The "
                "provided "
                "image frames a tagged with a capture time which corresponds to  this frame rate."),
            property<OptionalFloat>::create(
                "DeliveryFrameRate",
                "Frame rate in [fps] of the image delivery. DeliveryFrameRate can be used to speed up or "
                "throttle the "
                "actual rate of the image delivery. If it is set, than all images would be delivered at the "
                "configured "
                "frame rate. If it is left unset, than the images would be delivered as fast as possible."),
            property<OptionalUInt>::create("ExposureTime",
                                           "The image exposure time in microseconds. If it is set, than all "
                                           "delivered images would be tagged "
                                           "with this exposure time. If it is left unset, than all delivered "
                                           "images would not have exposure "
                                           "time.")),
        std::list<Default>{defaultValue<Float>::create("DeliveryFrameRate.Float", 25.0f),
                           defaultValue<UInt>::create("ExposureTime.UInt", 8000u)},
        "", false);
}

Type SupportedFrameGrabberDefs::define() {
    std::list<Property> kinds;
    // The grabbers themselves are not built yet: records without members.
    for (const GrabberKind& kind : kindsBeforeImageFiles)
        kinds.emplace_back(Type(std::string("FG::") + kind.name, kind.doc, "", false), kind.name, "",
                           kind.doc, false);
    kinds.push_back(property<MultiFileDef>::create("ImageFiles", "capture device emulation using files"));
    return Type(typeId(), "Supported Frame Grabbers", kinds, "", false);
}

} // namespace FG

#include "fg/capture_types.h"

namespace FG {

using namespace Fn::Deployment;

Type MultiFileLocations::define() {
    return Type(typeId(), "Multiple image file locations",
                properties(property<String>::create("Directory", "Directory with image names"),
                           property<Container<String>>::create("Files", "Container of image files")),
                "", false);
}

Type MultiFileDef::define() {
    return Type(
        typeId(), "Settings for multiple image file grabber, supported image formats are Jpeg, Png, Bmp, Pgm",
        properties(
            property<Alternative<MultiFileLocations>>::create("FileLocation",
                                                              "Where the image files comes from"),
            propertyWithDefault<Bool>::create(
                "ImageCaching", true,
                "If it is set to true, than during the initialization all image files "
                "are prefetched and stored in a data cache."),
            property<Sorting>::create("Sorting",
                                      "Indicates whether and how to perform a sorting of the input files"),
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
    for (const FrameGrabberKind& kind : frameGrabberKinds) {
        const std::string name(kind.name), doc(kind.doc);
        if (name == "ImageFiles")
            kinds.push_back(property<MultiFileDef>::create(name, doc));
        else // a driver beside this library: a record without members
            kinds.emplace_back(Type("FG::" + name, doc, "", false), name, "", doc, false);
    }
    return Type(typeId(), "Supported Frame Grabbers", kinds, "", false);
}

Type DllFrameGrabberFactoryCacheDef::define() {
    std::string kinds;
    for (std::size_t i = 0; i < std::size(frameGrabberKinds); ++i)
        if (hasLibrary(static_cast<FrameGrabberEnum>(i)))
            kinds += (kinds.empty() ? "" : " ") + std::string(frameGrabberKinds[i].name);
    return Type(typeId(), "Pathes to the shared libraries of the Supported Frame Grabbers",
                properties(property<DllPaths>::create("DllPaths", "The Paths of the dlls")),
                std::list<Default>{Default(type<DllPaths>(), "DllPaths", kinds)}, "", false);
}

} // namespace FG

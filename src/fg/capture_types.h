#pragma once

#include "fn/deployment/composite_values.h"

#include <string_view>

/// The settings of capture devices, as far as a configuration can hold them.

namespace FG {

/// Where the multi-file grabber gets its images: a directory, or a list of files.
struct MultiFileLocations {
    static std::string typeId() { return "FG::MultiFileLocations"; }
    static Fn::Deployment::Type define();
};

/// Settings of the multi-file grabber.
struct MultiFileDef {
    struct SortingKinds {
        static std::list<std::string> enumeration() { return {"No", "AscendingByName", "DescendingByName"}; }
    };
    using Sorting = Fn::Deployment::Enum<SortingKinds>;
    using OptionalFloat = Fn::Deployment::AlternativeN<Fn::Deployment::None, Fn::Deployment::Float>;
    using OptionalUInt = Fn::Deployment::AlternativeN<Fn::Deployment::None, Fn::Deployment::UInt>;

    static std::string typeId() { return "FG::MultiFile"; }
    static Fn::Deployment::Type define();
};

/// A kind of capture device.
struct FrameGrabberKind {
    std::string_view name;
    std::string_view doc;
};

/// Places in the table of kinds.
enum class FrameGrabberEnum {
    DirectShowDevice,
    DirectShowURL,
    WMF,
    Basler,
    GStreamer,
    VideoForLinux2,
    VideoForLinux,
    Http,
    Prosilica,
    PtGrey,
    UEye,
    Lumenera,
    DSLR,
    ImageFiles
};

inline constexpr FrameGrabberKind frameGrabberKinds[] = {
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
    {"ImageFiles", "capture device emulation using files"},
};

/// Whether a kind's driver lives in a shared library of its own.
constexpr bool hasLibrary(FrameGrabberEnum kind) {
    return kind >= FrameGrabberEnum::Basler && kind <= FrameGrabberEnum::DSLR;
}

/// All kinds.
struct FrameGrabberFullSet {
    static std::string typeId() { return "FG::FrameGrabberFullSet"; }
};

/// The kinds of capture devices, one property for each.
struct SupportedFrameGrabberDefs {
    static std::string typeId() {
        return "FG::SupportedFrameGrabberDefs<" + FrameGrabberFullSet::typeId() + ">";
    }
    static Fn::Deployment::Type define();
};

/// One capture device: a kind and its settings.
using FrameGrabberFactoryDef = Fn::Deployment::Alternative<SupportedFrameGrabberDefs>;

/// Where the shared libraries of grabbers are, by kind. All kinds that may have one are listed, with no path.
struct DllFrameGrabberFactoryCacheDef {
    using DllPaths = Fn::Deployment::Container<Fn::Deployment::String>;

    static std::string typeId() { return "FG::DllFrameGrabberFactoryCacheDef"; }
    static Fn::Deployment::Type define();
};

} // namespace FG

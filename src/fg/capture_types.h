#pragma once

#include "fn/deployment/composite_values.h"

/// The settings of capture devices, as far as a configuration can hold them.

namespace FG {

/// Where the multi-file grabber gets its images: a directory, or a list of files.
struct MultiFileLocations {
    static std::string typeId() { return "FG::MultiFileLocations"; }
    static Fn::Deployment::Type define();
};

/// Settings of the multi-file grabber.
struct MultiFileDef {
    static std::string typeId() { return "FG::MultiFile"; }
    static Fn::Deployment::Type define();
};

/// The kinds of capture devices, one property for each.
struct SupportedFrameGrabberDefs {
    static std::string typeId() { return "FG::SupportedFrameGrabberDefs<FG::FrameGrabberFullSet>"; }
    static Fn::Deployment::Type define();
};

/// One capture device: a kind and its settings.
using FrameGrabberFactoryDef = Fn::Deployment::Alternative<SupportedFrameGrabberDefs>;

} // namespace FG

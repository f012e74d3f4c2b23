#pragma once

#include "eye/face_finder.h"
#include "fn/deployment/component.h"

namespace Fn {
class Package;
}

namespace Eye::Cara::T8 {

/// The face finder: scans a series of scales with a window of 17 by 17 pixels, at which the eyes are 7 pixels
/// apart, through a chain of ever more expensive discriminators, joins what passes across scales, and decides
/// by a last one that looks at 23 by 23 pixels of the full image. Faces whose eyes are less than 7 image
/// pixels apart are not found.
///
/// find() is reentrant; findInStream() keeps the state of one stream.
class FaceFinder final : public ::FaceFinder::Body {
public:
    /// Reads the model files under `TemplatePath`. @throws FNEIOError that names the file and what is wrong
    /// with it
    explicit FaceFinder(const Fn::Deployment::Component& component);
    /// @throws FNEBadArg if the package holds no face finder
    explicit FaceFinder(const Fn::Package& package);
    ~FaceFinder() override;
    FaceFinder(const FaceFinder&) = delete;
    FaceFinder& operator=(const FaceFinder&) = delete;
    Fn::Package serialize() const;

    bool find(const FNImageReference& image, std::list<::FaceFinder::Location>& locations,
              double minRelEyeDist, double maxRelEyeDist, const FNBox& searchBox) const override;
    bool findInStream(const FNImageReference& image, std::list<::FaceFinder::Location>& locations,
                      double minRelEyeDist, double maxRelEyeDist, int frameNumber,
                      const FNBox& searchBox) override;
    std::string processingId() const override { return "T8FF"; }

    static std::string typeId() { return "Eye::Cara::T8::FaceFinder"; }
    static Fn::Deployment::Type define();

private:
    class Impl;
    FNCountedPtr<Impl> impl_;
};

} // namespace Eye::Cara::T8

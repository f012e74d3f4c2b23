#pragma once

#include "eye/eyes_finder.h"
#include "fn/deployment/component.h"

namespace Eye::Ojo::T8 {

/// The eyes finder: looks at a square around each eye at three scales, at which the eyes are 16 pixels apart,
/// with one discriminator for both eyes, the second square being mirrored. Each square has a side of 1.6 eye
/// distances; an eye is found if its place lies within about a third of the eye distance of the expected one.
///
/// find() is reentrant.
class EyesFinder final : public ::EyesFinder::Body {
public:
    /// Reads the model file under `TemplatePath`. @throws FNEIOError that names the file and what is wrong
    /// with it; FNEBadArg for settings that are neither "Strict" nor "Tolerant"
    explicit EyesFinder(const Fn::Deployment::Component& component);
    ~EyesFinder() override;

    void find(const FaceFinder::Location& face, const FNImageReference& image, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const override;
    void find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
              const FNImageReference& image, bool& foundFirst, FacialFeatureLocation& first,
              bool& foundSecond, FacialFeatureLocation& second) const override;
    std::string processingId() const override { return "Ojo T8"; }

    static std::string typeId() { return "Eye::Ojo::T8::EyesFinder"; }
    static Fn::Deployment::Type define();

private:
    class Impl;
    FNCountedPtr<Impl> impl_;
};

} // namespace Eye::Ojo::T8

#pragma once

#include "eye/mouth_finder.h"
#include "fn/deployment/component.h"

namespace Eye::Boca {

/// Finds the middle of the mouth in a patch that is brought to 16 pixels between the eyes, with windows of 19
/// by 15 pixels.
///
/// find() is reentrant.
class MouthFinder final : public ::MouthFinder::Body {
public:
    /// Reads the model file under `TemplatePath`. @throws FNEIOError that names the file and what is wrong
    /// with it
    explicit MouthFinder(const Fn::Deployment::Component& component);
    ~MouthFinder() override;

    bool find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
              const FNImageReference& image, FacialFeatureLocation& result) const override;
    std::string processingId() const override { return "Boca T8"; }

    static std::string typeId() { return "Eye::Boca::MouthFinder"; }
    static Fn::Deployment::Type define();

private:
    class Impl;
    FNCountedPtr<Impl> impl_;
};

} // namespace Eye::Boca

#pragma once

#include "eye/bridge_finder.h"
#include "fn/deployment/component.h"

namespace Eye::Raiz {

/// Finds the bridge of the nose in a patch that is brought to 16 pixels between the eyes, with windows of 19
/// by 19 pixels.
///
/// find() is reentrant.
class BridgeFinder final : public ::BridgeFinder::Body {
public:
    /// Reads the model file under `TemplatePath`. @throws FNEIOError that names the file and what is wrong
    /// with it
    explicit BridgeFinder(const Fn::Deployment::Component& component);
    ~BridgeFinder() override;

    bool find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2,
              const FNImageReference& image, FacialFeatureLocation& result) const override;
    std::string processingId() const override { return "Raiz T8"; }

    static std::string typeId() { return "Eye::Raiz::BridgeFinder"; }
    static Fn::Deployment::Type define();

private:
    class Impl;
    FNCountedPtr<Impl> impl_;
};

} // namespace Eye::Raiz

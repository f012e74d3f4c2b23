#pragma once

#include "cmp/portrait/analyzer.h"
#include "cmp/portrait/portrait_features.h"
#include "cmp/portrait/sphar_transformator.h"
#include "eye/discriminator/svm_fp_discriminator.h"

#include <map>

namespace Cmp::Portrait {

/// The trained part of the analyser: features, and the discriminators that turn them into scores. Files are
/// named by their keys of the configuration.
///
/// All lazy members are guarded by one mutex, which is free again when they are used.
class Analyzer::Implementation {
public:
    explicit Implementation(const Fn::Deployment::Component& component)
        : component_(component), features_(mutex_) {}

    const PortraitFeatures& features() const { return features_; }

    /// The score that the discriminator of a key gives. @throws FNEIOError, FNEGeneric if its file cannot be
    /// read or is for other features
    float score(const std::string& key, const FNVector<float>& features) const;
    float age(const FNVector<float>& features) const;
    FNVector<float> lightingCoefficients(const FNImage<float>& window) const;
    /// All files. @throws FNEIOError, FNEGeneric
    void readAll() const;

private:
    const Eye::SVMFPDiscriminator& discriminator(const std::string& key) const;
    const SpharTransformator& sphar() const;
    std::string pathOf(const std::string& key) const;
    /// Calls read(stream) for the file of a key.
    template <class Read> auto readFile(const std::string& key, Read read) const;

    Fn::Deployment::Component component_;
    FNMutex mutex_{FNMutex::recursive};
    PortraitFeatures features_;
    /// By key; elements stay where they are.
    mutable std::map<std::string, MadeOnDemand<Eye::SVMFPDiscriminator>> discriminators_;
    MadeOnDemand<SpharTransformator> sphar_;
};

} // namespace Cmp::Portrait

#pragma once

#include "eye/discriminator/cascaded_svm_discriminator.h"
#include "eye/neighbour_clustering.h"
#include "eye/ojo/feature_scan.h"

/// What the finders of eyes, mouth and nose bridge have in common.

namespace Eye::Ojo::T8 {

/// Settings of a finder: where its files lie, and under `discriminator` what they are.
Fn::Deployment::Type finderType(const std::string& id, const std::string& doc,
                                const std::string& templatePath,
                                const Fn::Deployment::Property& discriminator);
/// Settings of a cascaded discriminator with defaults.
Fn::Deployment::Type discriminatorType(const std::string& id, const std::string& doc,
                                       const Implementation::CascadeSettings& defaults);

/// Finds the most confident cluster of windows of an area that a discriminator accepts. Immutable.
template <class Scan> class FeatureSearch {
public:
    using Layout = Implementation::SparseGaborSodColumnAlignedLayout<Scan::columns, Scan::rows, 6>;
    using Discriminator = Implementation::CascadedSvmDiscriminator<Implementation::FpKernelDeg2, Layout>;

    /// @throws FNEIOError that names the model file and what is wrong with it
    FeatureSearch(const std::string& templatePath, const Fn::Deployment::Component& discriminator)
        : templatePath_(templatePath), discriminator_(discriminator, templatePath) {}

    /// @param found written only if a window is accepted
    bool find(const FNImage<unsigned short>& image, const SearchArea& area,
              FacialFeatureLocation& found) const {
        constexpr std::size_t mostWindows = 10;
        using Clustering = NeighbourClustering<FacialFeatureLocation, FacialFeatureLocation>;
        Clustering clusters(trainedEyeSize, mostWindows);
        forEachWindow<Scan>(image, area,
                            [&](const Fn::SignValueVector<int>& window, FNPos centre, float size) {
                                float score;
                                if (discriminator_(window, score)) clusters.add({centre, size, score});
                            });
        Clustering::Results results;
        if (!clusters.computeClusterRepresentations(results)) return false;
        found = *results.begin();
        return true;
    }

private:
    std::string templatePath_;
    Discriminator discriminator_;
};

} // namespace Eye::Ojo::T8

#include "eye/cara/face_finder.h"

#include "eye/cara/combined_cascade.h"
#include "eye/cara/face_pyramid.h"
#include "eye/cara/first_test.h"
#include "eye/cara/frame_scale_sequencer.h"
#include "eye/cara/overlap_removal.h"
#include "eye/cara/sod_image.h"
#include "eye/cara/window_geometry.h"
#include "eye/gabor/window_convolver.h"
#include "eye/neighbour_clustering.h"
#include "fn/deployment/composite_values.h"
#include "fn/image_reference.h"
#include "fn/serialize.h"
#include "img/scaling_table.h"

#include <bit>
#include <cmath>

namespace Eye::Cara::T8 {

using namespace Fn::Deployment;
using Implementation::CascadeSettings;
using Implementation::FrameScaleSequencer;
using Implementation::FrameSequencer;
using Implementation::SodImage;
using Location = ::FaceFinder::Location;
using Locations = std::list<Location>;
using Clustering = NeighbourClustering<FaceFinderClusteringItem, Location>;
using WindowConvolver =
    Impl::FastSpatialGaborConvolver<unsigned short, int, Impl::SpatialGaborConvolverSettings_T8>;
using FinalConvolver =
    Impl::FastSpatialGaborConvolver<unsigned short, int, Impl::SpatialGaborConvolverSettings_T8_FinalDecider>;

namespace {

constexpr std::uint32_t finalPatchPixels = Impl::SpatialGaborConvolverSettings_T8_FinalDecider::mask;

/// A window that passed the first stages, with bit i set for rotation i.
struct PosWithOrientations {
    std::uint32_t x, y;
    std::uint32_t rotations;
};

struct RotationDefaults {
    const char* name;
    const char* angle;
    const char* disc1B;
    const char* thresholds1B[3];
    const char* disc1C;
    const char* thresholds1C[3];
    const char* disc2A;
    const char* threshold2A;
};

// Working points that the trained discriminators are scaled to, see models/CARD.md.
constexpr RotationDefaults rotationDefaults[] = {
    {"l",
     "-0.23",
     "is1717dl.dat",
     {"-2.1", "-0.47", "0.18"},
     "is1717fl.dat",
     {"-0.82", "-0.56", "0.38"},
     "gs1717fl.dat",
     "-0.18"},
    {"c",
     "0",
     "is1717dc.dat",
     {"-2.0", "-0.5", "0.22"},
     "is1717fc.dat",
     {"-0.78", "-0.55", "0.36"},
     "gs1717fc.dat",
     "-0.23"},
    {"r",
     "0.23",
     "is1717dr.dat",
     {"-2.15", "-0.55", "0.12"},
     "is1717fr.dat",
     {"-0.72", "-0.56", "0.32"},
     "gs1717fr.dat",
     "-0.21"},
};

std::list<Default> imposedDefaults() {
    std::list<Default> defaults;
    const auto text = [&](const std::string& path, const char* value) {
        defaults.push_back(defaultValue<String>::create(path, value));
    };
    const auto number = [&](const std::string& path, const char* value) {
        defaults.emplace_back(type<Float>(), path, value);
    };
    const auto steps = [&](const std::string& path, const char* value) {
        defaults.emplace_back(type<Container<Float>>(), path, value);
    };
    text("Disc1A.File", "is1717da.dat");
    steps("Disc1A.Cascade", "1 2");
    number("Disc1A.Cascade.1", "-1.9");
    number("Disc1A.Cascade.2", "-0.6");
    text("Disc3A.File", "gs2323fc.dat");
    steps("Disc3A.Cascade", "200");
    number("Disc3A.Cascade.200", "-0.4");
    for (const RotationDefaults& rotation : rotationDefaults) {
        const std::string path = std::string("CombinedCascades.") + rotation.name + ".";
        number(path + "RotationAngle", rotation.angle);
        text(path + "Disc1B.File", rotation.disc1B);
        text(path + "Disc1C.File", rotation.disc1C);
        text(path + "Disc2A.File", rotation.disc2A);
        for (int i = 0; i < 3; ++i) {
            constexpr const char* steps1B[] = {"1", "2", "6"};
            constexpr const char* steps1C[] = {"15", "40", "300"};
            number(path + "Disc1B.Cascade." + steps1B[i], rotation.thresholds1B[i]);
            number(path + "Disc1C.Cascade." + steps1C[i], rotation.thresholds1C[i]);
        }
        number(path + "Disc2A.Cascade.200", rotation.threshold2A);
    }
    return defaults;
}

constexpr const char* subsamplingKey = "StreamingSubsamplingWidth";

/// @param setting named in the failure. @throws FNEBadArg
std::uint32_t checkedSubsampling(std::uint32_t width, const std::string& setting) {
    constexpr std::uint32_t most = 64; // a place is looked at every 4096th frame then
    if (width > most)
        FN_THROW(FNEBadArg, setting + ": " + std::to_string(width) + " is no width for subsampling, 0 to " +
                                std::to_string(most));
    return width;
}

} // namespace

Type FaceFinder::define() {
    return Type(
        typeId(), "T8 Face finder",
        properties(
            propertyWithDefault<String>::create("TemplatePath", std::string("$INSTALLDIR/etc/cara"),
                                                "Path to the template files"),
            Property(type<Float>(), "BasicScaleFactor", "1.161895", "Kept for older configurations", false),
            property<CascadeSettings>::create("Disc1A", "First discriminator, for all rotations"),
            Property(type<Container<CombinedCascade>>(), "CombinedCascades", "l c r",
                     "Discriminators for each rotation", false),
            property<CascadeSettings>::create("Disc3A", "Final discriminator"),
            property<String>::create("DumpFile", "Kept for older configurations"),
            propertyWithDefault<UInt>::create(
                subsamplingKey, 7u,
                "Of how many positions in a row and in a column one is looked at "
                "in each frame of a stream, below 2 for all; at most 64")),
        imposedDefaults(), "", false);
}

class FaceFinder::Impl {
public:
    explicit Impl(const Component& component);
    explicit Impl(Fn::PackageReader reader);
    Fn::Package serialize() const;

    bool find(const FNImageReference& image, Locations& locations, double minRelEyeDist, double maxRelEyeDist,
              const FNBox& searchBox, FrameSequencer& sequencer, std::uint32_t subsampling) const;

    FrameSequencer stream;
    std::uint32_t streamingSubsamplingWidth() const { return streamingSubsamplingWidth_; }

private:
    void scanLevel(const Img::ScaledImage<unsigned short>& level, const FNBox& searchBox, float eyeDistance,
                   FrameScaleSequencer& sequencer, Clustering& clusters) const;
    std::vector<PosWithOrientations> firstStages(const SodImage& sods,
                                                 const FrameScaleSequencer& sequencer) const;
    void gaborStage(const Img::ScaledImage<unsigned short>& bordered, const PosWithOrientations& position,
                    float eyeDistance, FrameScaleSequencer& sequencer, Clustering& clusters) const;
    Clustering::Results finalTest(const FNImage<unsigned short>& image,
                                  const Clustering::Results& candidates) const;

    // In the order of the serialized form.
    float basicScaleFactor_;
    std::string templatePath_;
    Fn::SerializableVector<CombinedCascade> cascades_;
    SodDotDiscriminator disc1A_;
    GaborDiscriminator disc3A_;
    std::uint32_t streamingSubsamplingWidth_;
    WindowConvolver windowConvolver_;
    FinalConvolver finalConvolver_;
};

namespace {

Fn::SerializableVector<CombinedCascade> cascadesOf(const Component& container,
                                                   const std::string& templatePath) {
    constexpr std::size_t mostRotations = 32; // bits of PosWithOrientations
    Fn::SerializableVector<CombinedCascade> cascades;
    for (const Component& rotation : container.subComponents()) cascades.emplace_back(rotation, templatePath);
    if (cascades.size() > mostRotations) FN_THROW(FNEBadArg, "Too many rotations in " + container.name());
    return cascades;
}

} // namespace

FaceFinder::Impl::Impl(const Component& component)
    : basicScaleFactor_(Value<Float>::get(component.subComponent("BasicScaleFactor"))),
      templatePath_(Value<String>::get(component.subComponent("TemplatePath"))),
      cascades_(cascadesOf(component.subComponent("CombinedCascades"), templatePath_)),
      disc1A_(component.subComponent("Disc1A"), templatePath_),
      disc3A_(component.subComponent("Disc3A"), templatePath_),
      streamingSubsamplingWidth_(checkedSubsampling(Value<UInt>::get(component.subComponent(subsamplingKey)),
                                                    component.name() + "." + subsamplingKey)) {}

FaceFinder::Impl::Impl(Fn::PackageReader reader)
    : basicScaleFactor_(reader.next<float>()), templatePath_(reader.next<std::string>()),
      cascades_(reader.next<Fn::SerializableVector<CombinedCascade>>()),
      disc1A_(reader.next<SodDotDiscriminator>()), disc3A_(reader.next<GaborDiscriminator>()),
      streamingSubsamplingWidth_(checkedSubsampling(reader.next<unsigned int>(), subsamplingKey)) {
    reader.expectEnd();
}

Fn::Package FaceFinder::Impl::serialize() const {
    return Fn::Package(std::list<Fn::Package>{Fn::Package(basicScaleFactor_),
                                              Fn::serialize<std::string>(templatePath_),
                                              static_cast<Fn::Package>(cascades_), disc1A_.serialize(),
                                              disc3A_.serialize(), Fn::Package(streamingSubsamplingWidth_)});
}

bool FaceFinder::Impl::find(const FNImageReference& image, Locations& locations, double minRelEyeDist,
                            double maxRelEyeDist, const FNBox& searchBox, FrameSequencer& sequencer,
                            std::uint32_t subsampling) const {
    locations.clear();
    const double minEye = std::max(image.w() * minRelEyeDist, 1.0);
    const double maxEye = std::max(image.w() * maxRelEyeDist, 2.0);
    if (minEye > maxEye) return false;
    const std::list<float> scales =
        Img::createScalingTable(trainedEyeDistance, scaleStepRoot, minEye, maxEye, 0.0, true);
    if (scales.empty()) return false;

    const FNImage<unsigned short> mono = image.toMono16();
    const Pyramid pyramid(mono, scales.front(), scales.size());
    auto& sequencers = sequencer.scales();
    if (sequencers.size() != pyramid.size()) {
        sequencers.clear();
        for (const auto& level : pyramid)
            sequencers.emplace_back(subsampling, trainedEyeDistance * averageEffectiveFactor(level));
    }

    Clustering clusters(trainedEyeDistance);
    auto levelSequencer = sequencers.begin();
    for (const auto& level : pyramid)
        scanLevel(level, searchBox, trainedEyeDistance * averageEffectiveFactor(level), *levelSequencer++,
                  clusters);

    Clustering::Results candidates;
    clusters.computeClusterRepresentations(candidates);
    for (const Location& face : removeOverlaps(finalTest(mono, candidates))) {
        sequencer.markFace(face.pos, face.width);
        const float k = eyeLineToCentre * face.width;
        Location result = face;
        result.pos += {k * std::sin(face.rotationAngle), -k * std::cos(face.rotationAngle)};
        locations.push_back(result);
    }
    sequencer.finalizeFrame();
    return !locations.empty();
}

void FaceFinder::Impl::scanLevel(const Img::ScaledImage<unsigned short>& level, const FNBox& searchBox,
                                 float eyeDistance, FrameScaleSequencer& sequencer,
                                 Clustering& clusters) const {
    const Img::ScaledImage<unsigned short> bordered = addBorder(level, searchBox);
    const SodImage sods(bordered.image);
    sequencer.prepare(bordered.mapping, sods.gridWidth(), sods.gridHeight());
    for (const PosWithOrientations& position : firstStages(sods, sequencer))
        gaborStage(bordered, position, eyeDistance, sequencer, clusters);
}

std::vector<PosWithOrientations> FaceFinder::Impl::firstStages(const SodImage& sods,
                                                               const FrameScaleSequencer& sequencer) const {
    std::vector<PosWithOrientations> passed;
    Fn::SignValueVector<int> window(SodImage::windowBits);
    unsigned char* const bytes = window.exclusiveBytes();
    // A still image is looked at everywhere; a frame of a stream at few places.
    const std::vector<unsigned char> accepted =
        sequencer.active() ? std::vector<unsigned char>() : acceptedWindows(disc1A_, sods);
    sequencer.forEachPosition([&](std::uint32_t x, std::uint32_t y) {
        float score;
        if (!accepted.empty() && !accepted[std::size_t{y} * sods.gridWidth() + x]) return;
        sods.getWindow(x, y, bytes);
        if (accepted.empty() && !disc1A_(window, score)) return;
        std::uint32_t rotations = 0;
        for (std::size_t i = 0; i < cascades_.size(); ++i)
            if (cascades_[i].disc1B(window, score) && cascades_[i].disc1C(window, score))
                rotations |= 1u << i;
        if (rotations != 0) passed.push_back({x, y, rotations});
    });
    return passed;
}

void FaceFinder::Impl::gaborStage(const Img::ScaledImage<unsigned short>& bordered,
                                  const PosWithOrientations& position, float eyeDistance,
                                  FrameScaleSequencer& sequencer, Clustering& clusters) const {
    const auto [x, y, rotations] = position;
    const Fn::SignValueVector<int> sods = windowConvolver_.getGaborSODs(
        bordered.image, {static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)});
    FaceFinderClusteringItem item{
        bordered.mapping({static_cast<float>(x) + windowCentre, static_cast<float>(y) + windowCentre}),
        eyeDistance,
        {}};
    bool anyPassed = false;
    for (std::uint32_t left = rotations; left != 0; left &= left - 1) {
        const CombinedCascade& cascade = cascades_[static_cast<std::size_t>(std::countr_zero(left))];
        float score;
        if (!cascade.disc2A(sods, score)) continue;
        anyPassed = true;
        if (sequencer.isDense(x, y)) item.votes.emplace_back(cascade.rotationAngle, score);
    }
    if (!item.votes.empty()) clusters.add(item);
    sequencer.setStatus(x, y, anyPassed ? FrameScaleSequencer::candidate : FrameScaleSequencer::nothing);
}

/// The candidates that pass on a patch cut upright from the full image, with the confidence that they get
/// there.
Clustering::Results FaceFinder::Impl::finalTest(const FNImage<unsigned short>& image,
                                                const Clustering::Results& candidates) const {
    Clustering::Results accepted;
    FNImage<unsigned short> patch(finalPatchPixels, finalPatchPixels);
    for (Location candidate : candidates) {
        const float side = finalPatchSide * candidate.width;
        const float c = side * std::cos(candidate.rotationAngle),
                    s = side * std::sin(candidate.rotationAngle);
        const FNPos u{c, s}, v{-s, c};
        Img::Affine::transform(image, patch, candidate.pos - u / 2.0f - v / 2.0f, u, v, true, 0);
        if (disc3A_(finalConvolver_.getGaborSODs(patch, {0, 0}), candidate.confidence))
            accepted.insert(candidate);
    }
    return accepted;
}

FaceFinder::FaceFinder(const Component& component) : impl_(new Impl(component)) {}
FaceFinder::FaceFinder(const Fn::Package& package) : impl_(new Impl(Fn::PackageReader(package))) {}
FaceFinder::~FaceFinder() = default;

Fn::Package FaceFinder::serialize() const {
    return impl_->serialize();
}

bool FaceFinder::find(const FNImageReference& image, Locations& locations, double minRelEyeDist,
                      double maxRelEyeDist, const FNBox& searchBox) const {
    FrameSequencer still;
    return impl_->find(image, locations, minRelEyeDist, maxRelEyeDist, searchBox, still, 0);
}

bool FaceFinder::findInStream(const FNImageReference& image, Locations& locations, double minRelEyeDist,
                              double maxRelEyeDist, int, const FNBox& searchBox) {
    return impl_->find(image, locations, minRelEyeDist, maxRelEyeDist, searchBox, impl_->stream,
                       impl_->streamingSubsamplingWidth());
}

} // namespace Eye::Cara::T8

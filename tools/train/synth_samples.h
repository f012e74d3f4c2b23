#pragma once

#include "labelled/labels.h"
#include "synth/portrait_model.h"
#include "train/sign_matrix.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

/// Labelled photos in the frame of the portrait model.

namespace Train {

/// A face with 68 labelled points.
struct PointedFace {
    std::filesystem::path image;
    std::string person; ///< or photo, where the person is unknown
    std::string gender; ///< "m", "f" or empty
    Synth::Points landmarks;
};

/// What a face of a set must be like to be of use.
struct FaceChoice {
    const char* folder;
    float leastEyeDistance;
};

/// Rows of a label file whose first face of each picture is so, in their order.
std::vector<PointedFace> pointedFaces(const std::filesystem::path& labels, float leastEyeDistance,
                                      std::optional<Labelled::Split> split);
/// Near-frontal faces of one split, set after set.
std::vector<PointedFace> pointedFaces(const std::filesystem::path& data, Labelled::Split split,
                                      const std::vector<FaceChoice>& choices);

/// The photos whose skin the model learns: large faces only.
const std::vector<FaceChoice>& synthPhotos();
/// Eye distance in the model's frame, pixels.
constexpr float synthEyeDistance = 64;

/// The mean shape: landmarks in pixels of a frame just large enough, symmetric, eyes level.
Synth::Points meanShape(const std::vector<PointedFace>& faces, float eyeDistance);

/// Shape and texture of one face.
struct SynthSample {
    std::vector<float> values; ///< shape, then texture, as in PortraitModel
    Synth::Controls controls;  ///< as measured, in no unit
};

/// Brings photos into the frame, which must outlive it.
class PhotoWarper {
public:
    explicit PhotoWarper(const Synth::TextureFrame& frame);

    /// The face as it is, and in a mirror.
    std::pair<SynthSample, SynthSample> samples(const PointedFace& face) const;
    /// The brightness from brows to chin, only brought upright and to a size of 30 by 35 pixels.
    std::vector<float> patch(const PointedFace& face) const;

private:
    struct Planes;
    Planes aligned(const PointedFace& face) const;
    SynthSample sample(const Planes& planes) const;

    const Synth::TextureFrame& frame_;
    std::vector<std::uint32_t> lumaIndex_, chromaIndex_; ///< of a pixel in the texture
    std::vector<FNPos> lumaLocal_, chromaLocal_;         ///< place of each pixel on the head
};

/// Replaces, on forehead and temples, what does not have the colour of the skin (hair, hats) by what the skin
/// of the other faces suggests.
class HairRemoval {
public:
    explicit HairRemoval(const Synth::TextureFrame& frame);

    void learn(const std::vector<SynthSample>& samples);
    void apply(SynthSample& sample) const;

private:
    struct Reference;
    Reference reference(const SynthSample& sample) const;

    struct Pixel {
        std::size_t luma, cb, cr; ///< in the vector of a sample
        float weight;             ///< how far it may be replaced
        FNPos local;
        FNGridPos at;
    };
    std::vector<Pixel> region_, cheeks_[2];
    std::vector<float> mean_[3]; ///< usual ratio to the cheeks' brightness, and difference of colour
    std::uint32_t w_, h_;
};

} // namespace Train

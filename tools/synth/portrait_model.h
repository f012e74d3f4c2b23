#pragma once

#include "fn/image.h"
#include "fn/package.h"
#include "synth/face_mesh.h"

#include <array>
#include <cstdint>
#include <filesystem>
#include <span>
#include <vector>

/// A statistical model of faces: their shape and, apart from it, their texture, both linear in a few numbers
/// (T. F. Cootes, G. J. Edwards, C. J. Taylor, "Active Appearance Models", 1998).

namespace Synth {

/// What changes from picture to picture of one person. In standard deviations over the training faces, 0 is
/// the usual.
enum Control : std::size_t {
    yaw,   ///< positive when the nose points to the image's right
    pitch, ///< positive when the head is lowered
    smile, ///< corners of the mouth apart and up
    mouthOpen,
    eyesOpen,
    lightSide, ///< positive when the image's left half is brighter
    lightAbove,
    tintBlue, ///< of the cheeks (Cb): photos differ in it by their light more than people do
    tintRed,  ///< likewise (Cr)
    controlCount
};
using Controls = std::array<float, controlCount>;

/// The face in the mean shape: which pixels of a small raster it covers. Colour is kept at half the
/// resolution of brightness.
///
/// A texture is one vector: Y of the pixels of `luma`, then Cb, then Cr of the pixels of `chroma` (ITU-R
/// BT.601, full range, 0..255), all in rows from the top.
class TextureFrame {
public:
    TextureFrame() = default;
    /// @param landmarks mean shape, pixels of the raster
    explicit TextureFrame(const Points& landmarks);

    const Points& mesh() const { return mesh_; } ///< landmarks and forehead
    const std::vector<Triangle>& triangles() const { return triangles_; }
    std::uint32_t w() const { return w_; }
    std::uint32_t h() const { return h_; }
    std::size_t textureSize() const { return luma_.size() + 2 * chroma_.size(); }
    const std::vector<FNGridPos>& luma() const { return luma_; }     ///< pixels
    const std::vector<FNGridPos>& chroma() const { return chroma_; } ///< pixels of the raster of half size

private:
    Points mesh_;
    std::vector<Triangle> triangles_;
    std::uint32_t w_ = 0, h_ = 0;
    std::vector<FNGridPos> luma_, chroma_;
};

/// Rasters of brightness and colour of one face in the mean shape; pixels around it are continued.
struct Texture {
    FNImage<float> y, cb, cr;
};

/// A way in which faces differ: values of 8 bits times a scale.
struct Direction {
    struct Part {
        float scale = 0;
        std::vector<signed char> values;

        Part() = default;
        explicit Part(std::span<const float> from);
        explicit Part(const Fn::Package& package);
        explicit operator Fn::Package() const;
        void addTo(std::span<float> sum, float factor) const;
    };
    Part shape; ///< x and y of the landmarks, pixels of the frame
    Part texture;

    Direction() = default;
    /// @param values shape, then texture
    explicit Direction(std::span<const float> values);
    explicit Direction(const Fn::Package& package);
    explicit operator Fn::Package() const;
};

class PortraitModel {
public:
    /// @param frame landmarks of the frame
    /// @param mean shape (x, y), then texture
    /// @param identity ways in which people differ, each one standard deviation long
    /// @param feminine half the mean difference of women and men, in the ways of `identity`
    PortraitModel(const Points& frame, std::span<const float> mean, std::vector<Direction> controls,
                  std::vector<Direction> identity, std::vector<float> feminine);
    /// @throws FNEIOError, FNEBadFormat naming the file
    explicit PortraitModel(const std::filesystem::path& file);
    /// @throws FNEBadArg for a package that is no such model
    explicit PortraitModel(const Fn::Package& package);
    explicit operator Fn::Package() const;

    const TextureFrame& frame() const { return frame_; }
    std::size_t identitySize() const { return identity_.size(); }
    const std::vector<float>& feminine() const { return feminine_; }

    struct Face {
        Points landmarks; ///< pixels of the frame
        Texture texture;
    };
    /// @param identity standard deviations; ones beyond identitySize() are ignored, missing ones count as 0
    Face face(const Controls& controls, std::span<const float> identity) const;

private:
    /// @throws FNEBadArg if the parts do not go together
    void check() const;

    TextureFrame frame_;
    std::vector<float> mean_;
    std::vector<Direction> controls_, identity_;
    std::vector<float> feminine_;
};

/// Where the shape part of a vector ends and its texture begins.
constexpr std::size_t shapeSize = 2 * landmarkCount;

} // namespace Synth

#include "fn/image_blit.h"
#include "fn/imagefile/image_file.h"
#include "fn/shapefile/texture_file.h"
#include "shapeimg/scanfile/scan_file.h"
#include "shapeimg/scanfile/vrml_scene.h"

#include <algorithm>

namespace ShapeImage {

namespace {

/// The pictures of a scene, one below the other.
class TextureStack {
public:
    TextureStack(const std::string& scanName, const Fn::ImageLimits& limits)
        : scanName_(scanName), limits_(limits) {}

    /// Adds a picture if it is not there yet. @return how far below the top it lies
    std::uint32_t place(const std::string& picture) {
        auto found = Fn::fileReferredTo(scanName_, picture);
        if (!found.isSet()) found = Fn::textureBeside(scanName_);
        if (!found.isSet()) FN_THROW(FNEBadArg, "No texture file available");
        const auto known = std::find(names_.begin(), names_.end(), *found);
        const auto number = static_cast<std::size_t>(known - names_.begin());
        if (known == names_.end()) {
            const FNImageReference image = Fn::readImage(*found, {}, limits_);
            if (!images_.empty() && (image.w() != width() || image.h() != height()))
                FN_THROW(FNEBadArg, "texture images sizes different");
            limits_.check(image.w(), std::uint64_t{image.h()} * (images_.size() + 1), sizeof(Fn::Bgra32),
                          "ShapeImage::readVRMLFile");
            names_.push_back(*found);
            images_.push_back(image);
        }
        return static_cast<std::uint32_t>(number) * height();
    }

    std::uint32_t width() const { return images_.front().w(); }
    std::uint32_t height() const { return images_.front().h(); }

    /// A single picture stays as it is.
    FNImageReference combined() const {
        if (images_.size() == 1) return images_.front();
        FNImage<Fn::Bgra32> result(width(), height() * static_cast<std::uint32_t>(images_.size()));
        FNGridPos corner;
        for (const FNImageReference& image : images_) {
            Fn::blitIntoImage(image, result, corner);
            corner.y += static_cast<std::int32_t>(height());
        }
        return FNImageReferenceFactory::create(result);
    }

private:
    std::string scanName_;
    Fn::ImageLimits limits_;
    std::vector<std::string> names_;
    std::vector<FNImageReference> images_;
};

} // namespace

TexturedPointSet readVRMLFile(std::istream& stream, bool removeOutliers, const std::string& name,
                              const Fn::ImageLimits& limits) {
    using Set = TexturedPointSet;
    if (!stream) FN_THROW(FNEIOError, "readVRMLFile: can not read " + name);
    const std::list<VrmlShape> shapes = readVrmlScene(stream);
    if (shapes.empty()) return Set();

    TextureStack textures(name, limits);
    std::vector<FN3Vector<double>> vertices;
    std::vector<Set::CoordinateTextureMapper::Coordinate> coordinates;
    for (const VrmlShape& shape : shapes) {
        const std::uint32_t top = textures.place(shape.picture);
        appendCoordinates(shape.mesh, textures.width(), textures.height(), top,
                          static_cast<std::int32_t>(vertices.size()), coordinates);
        vertices.insert(vertices.end(), shape.mesh.vertices.begin(), shape.mesh.vertices.end());
    }
    const FNImageReference texture = textures.combined();
    return Set(PointSet(vertices, PointSet::defaultNeighbourhoodSize, removeOutliers), texture,
               FNCountedPtr<Set::Texture2VertexMapper>(
                   new Set::CoordinateTextureMapper(coordinates, texture.w(), texture.h())));
}

} // namespace ShapeImage

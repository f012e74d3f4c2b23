#include "shapeimg/textured_point_set.h"

namespace ShapeImage {

namespace {

PointSet pointsOf(const Fn::VertexImage& image, bool removeOutliers) {
    const auto vertices = image.vertices().span();
    FNRMem<bool> mask = image.validity().mem();
    return PointSet({vertices.begin(), vertices.end()}, mask, PointSet::defaultNeighbourhoodSize,
                    removeOutliers);
}

std::vector<FN3Vector<double>>
positionsOf(const std::vector<TexturedPointSet::CoordinateTextureMapper::Coordinate>& coordinates) {
    std::vector<FN3Vector<double>> positions;
    positions.reserve(coordinates.size());
    for (const auto& c : coordinates) positions.push_back({c.pos.x, c.pos.y, 0});
    return positions;
}

} // namespace

std::int32_t TexturedPointSet::GridAlignedTextureMapper::mapTexture2Vertex(FNGridPos pos) const {
    if (pos.x < 0 || pos.y < 0) return noVertex;
    const auto x = static_cast<std::uint64_t>(pos.x), y = static_cast<std::uint64_t>(pos.y);
    return x < width_ && y < height_ ? static_cast<std::int32_t>(x + y * width_) : noVertex;
}

TexturedPointSet::CoordinateTextureMapper::CoordinateTextureMapper(const std::vector<Coordinate>& coordinates,
                                                                   std::uint32_t width, std::uint32_t height)
    : coordinates_(positionsOf(coordinates), 1), box_{0, 0, static_cast<std::int32_t>(width),
                                                      static_cast<std::int32_t>(height)} {
    for (const Coordinate& c : coordinates) vertices_.push_back(c.vertex);
    const double pixels = static_cast<double>(width) * height;
    if (!coordinates.empty()) reach_ = 2 * std::sqrt(pixels / static_cast<double>(coordinates.size()));
}

std::int32_t TexturedPointSet::CoordinateTextureMapper::mapTexture2Vertex(FNGridPos pos) const {
    if (!box_.contains(pos)) return noVertex;
    const auto found = coordinates_.findClosest({pos.x + 0.5, pos.y + 0.5, 0}, reach_);
    return found.empty() ? noVertex : vertices_[static_cast<std::size_t>(found[0].index)];
}

TexturedPointSet::TexturedPointSet() : mapper_(new GridAlignedTextureMapper(0, 0)) {}

TexturedPointSet::TexturedPointSet(const Fn::VertexImage& image, const FNImageReference& texture,
                                   bool removeOutliers)
    : texture_(texture), mapper_(new GridAlignedTextureMapper(image.w(), image.h())) {
    if (texture.w() != image.w() || texture.h() != image.h())
        FN_THROW(FNEBadArg, "Size of vertex and texture image do not match");
    points_ = pointsOf(image, removeOutliers);
}

TexturedPointSet::TexturedPointSet(const Fn::Package&) {
    FN_THROW(FNEBadArg, "TexturedPointSet deserialization not implemented");
}

Fn::Package TexturedPointSet::serialize() const {
    FN_THROW(FNEBadArg, "TexturedPointSet serialization not implemented");
}

Fn::Optional<FN3Vector<double>> TexturedPointSet::mapTexture2Vertex(FNGridPos pos) const {
    const std::int32_t index = mapper_->mapTexture2Vertex(pos);
    if (index == Texture2VertexMapper::noVertex || !points_.valid(index)) return {};
    return points_.point(index);
}

} // namespace ShapeImage

#include "fn/vertex_image.h"

#include "fn/image_package.h"

namespace Fn {

namespace {

template <class A, class B> bool sameSize(const FNImage<A>& a, const FNImage<B>& b) {
    return a.w() == b.w() && a.h() == b.h();
}

template <class T> FNImage<T> filled(std::uint32_t width, std::uint32_t height, const T& value) {
    FNImage<T> image(width, height);
    image.fill(value);
    return image;
}

template <class T> FNImage<T> transposedGrid(const FNImage<T>& image) {
    FNImage<T> result(image.h(), image.w());
    T* out = result.getExclusive();
    for (std::uint32_t x = 0; x < image.w(); ++x)
        for (std::uint32_t y = 0; y < image.h(); ++y) *out++ = image(x, y);
    return result;
}

template <class Change> void changeAll(FNImage<VertexImage::Vertex>& image, Change change) {
    VertexImage::Vertex* const all = image.getExclusive();
    std::transform(all, all + image.size(), all, change);
}

} // namespace

VertexImage::VertexImage(std::uint32_t width, std::uint32_t height)
    : vertices_(filled(width, height, Vertex())), validity_(filled(width, height, false)) {}

VertexImage::VertexImage(const FNImage<Vertex>& vertices, const FNImage<bool>& validity,
                         const FNImageAttributes& attributes)
    : vertices_(vertices), validity_(validity), attributes_(attributes) {
    if (!sameSize(vertices, validity))
        FN_THROW(FNEBadArg, "VertexImage: vertices and validity differ in size");
}

FNImage<VertexImage::Vertex> VertexImage::noNormals() {
    return filled(1, 1, Vertex());
}

void VertexImage::setVertex(FNGridPos pos, const Vertex& vertex) {
    vertices_.set(pos, vertex);
    validity_.set(pos, true);
}

void VertexImage::translate(const Vertex& by) {
    changeAll(vertices_, [&](const Vertex& v) { return v + by; });
}

void VertexImage::rotate(const FN3Matrix<double>& rotation) {
    changeAll(vertices_, [&](const Vertex& v) { return rotation * v; });
    changeAll(normals_, [&](const Vertex& v) { return rotation * v; });
}

void VertexImage::scale(double factor) {
    changeAll(vertices_, [&](const Vertex& v) { return v * factor; });
}

VertexImage VertexImage::transposed() const {
    VertexImage result(transposedGrid(vertices_), transposedGrid(validity_), attributes_);
    result.normals_ = transposedGrid(normals_);
    return result;
}

bool VertexImage::hasNormals() const noexcept {
    // A single zero stands for none also where the grid has but one position.
    return sameSize(normals_, vertices_) && (normals_.size() != 1 || *normals_.data() != Vertex());
}

void VertexImage::setNormals(const FNImage<Vertex>& normals) {
    if (!sameSize(normals, vertices_))
        FN_THROW(FNEBadArg, "VertexImage: normals and vertices differ in size");
    normals_ = normals;
}

VertexImage::Vertex VertexImage::avgNormal() const {
    if (!hasNormals()) FN_THROW(FNEBadFunCall, "VertexImage: no normals are set");
    Vertex sum;
    std::uint64_t n = 0;
    for (std::uint64_t i = 0; i < normals_.size(); ++i)
        if (validity_.data()[i]) {
            sum += normals_.data()[i];
            ++n;
        }
    return n == 0 ? sum : sum / static_cast<double>(n);
}

FNImage<double> VertexImage::rangeImage() const {
    FNImage<double> range(w(), h());
    const auto all = vertices_.span();
    std::transform(all.begin(), all.end(), range.getExclusive(), [](const Vertex& v) { return v.z; });
    return range;
}

Package VertexImage::serialize() const {
    return Package(std::list<Package>{Fn::serialize(vertices_), Fn::serialize(normals_),
                                      Fn::serialize(validity_), Fn::serialize(attributes_)});
}

VertexImage VertexImage::deserialize(const Package& package) {
    PackageReader reader(package);
    const auto vertices = reader.next<FNImage<Vertex>>();
    const auto normals = reader.next<FNImage<Vertex>>();
    const auto validity = reader.next<FNImage<bool>>();
    VertexImage image(vertices, validity, reader.next<FNImageAttributes>());
    reader.expectEnd();
    if (normals.size() != 1 || sameSize(normals, vertices)) image.setNormals(normals);
    return image;
}

} // namespace Fn

#pragma once

#include "orbek/eyes_finder.h"
#include "orbek/image.h"
#include "orbek/point_set.h"
#include "orbek/shape_image.h"

#include <exception>
#include <string>
#include <utility>

namespace Orbek {

/// One picture of a person, with what the application knows beside it: where the eyes are, or a 3D scan.
///
///     Orbek::Sample sample(Orbek::ImageIO::load("bob.jpg"));
///     sample.eyes.set({{120, 140}, {180, 141}, 0, 0});
///
/// Copies share the items until one of them is set.
class [[gnu::visibility("default")]] Sample {
public:
    using Vector3D = Vertex;

    /// An item was read that is not set.
    class [[gnu::visibility("default")]] ItemNotSet : public std::exception {
    public:
        explicit ItemNotSet(const std::string& name);
        ItemNotSet(const ItemNotSet&);
        ~ItemNotSet() override;
        const char* what() const noexcept override;

    private:
        CountedPtr<std::string> text_;
    };

    /// Something that may be known of the person.
    template <class T> class Item {
    public:
        explicit Item(const char* name) : name_(name) {}

        bool isSet() const { return static_cast<bool>(value_); }
        /// Stores a copy.
        void set(const T& value) { value_ = CountedPtr<T>(new T(value)); }
        /// @throws ItemNotSet
        const T& value() const {
            if (!isSet()) throw ItemNotSet(name_);
            return *value_;
        }
        const std::string& name() const { return name_; }

    private:
        CountedPtr<T> value_;
        std::string name_;
    };

    explicit Sample(const Image& image);
    Sample(const Image& image, const ShapeImage& shape);
    Sample(const Image& image, const PointSet& points);
    explicit Sample(const std::pair<Image, Eyes::Location>& imageWithEyes);
    Sample(const Sample&);
    Sample& operator=(const Sample&);
    ~Sample();

    Image image;
    Item<Eyes::Location> eyes{"Eyes"};
    Item<ShapeImage> vertexImage{"Vertex Image"};
    Item<PointSet> pointSet{"Point Set"};
    Item<Vector3D> firstEye3D{"Eye03D"}; ///< in the scan, millimetres; counts with the second only
    Item<Vector3D> secondEye3D{"Eye13D"};
};

/// Reads a scan with its texture, of any format that the library knows: the texture becomes the image.
/// @throws std::exception naming what is wrong
[[gnu::visibility("default")]] Sample loadShapeSample(const std::string& fileName);

} // namespace Orbek

#pragma once

#include "orbek/configuration.h"
#include "orbek/geometry.h"
#include "orbek/image.h"

#include <list>

namespace Orbek::Face {

/// A face in an image.
struct Location {
    Position pos;            ///< midpoint between the eyes, image pixels
    float width = 0;         ///< distance of the eyes, image pixels
    float confidence = 0;    ///< larger is better; the scale is the finder's own
    float rotationAngle = 0; ///< in the image plane, radians, positive from x toward y
};

/// Finds faces that look about toward the camera and are turned by up to about 20 degrees in the image plane.
///
///     const Orbek::Configuration configuration("orbek.conf");
///     const Orbek::Face::Finder finder(configuration);
///     const Orbek::Image image = Orbek::ImageIO::load("group.jpg");
///     for (const auto& face : finder.find(image, 0.05f, 0.4f, 0, 0, image->width(), image->height())) ...
///
/// Faces whose eyes are less than 7 pixels apart are not found. Copies share everything; any number of
/// threads may use one finder.
class [[gnu::visibility("default")]] Finder {
public:
    /// Reads the model files, if this is the first finder of the configuration.
    /// @throws std::exception that names the file and what is wrong with it
    explicit Finder(const Configuration& configuration);
    Finder(const Finder&);
    Finder& operator=(const Finder&);
    ~Finder();

    /// @param minRelEyeDist,maxRelEyeDist eye distances to look for, in widths of the image
    /// @param x0,y0,x1,y1 two opposite corners of where to look, image pixels
    /// @return the faces by descending confidence, none if there is no face
    std::list<Location> find(const Image& image, float minRelEyeDist, float maxRelEyeDist, int x0, int y0,
                             int x1, int y1) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Face

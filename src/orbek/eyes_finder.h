#pragma once

#include "orbek/configuration.h"
#include "orbek/face_finder.h"
#include "orbek/geometry.h"
#include "orbek/image.h"

#include <list>

namespace Orbek::Eyes {

/// The two eyes of a face.
struct Location {
    Position first;            ///< the left eye as the observer of an upright picture sees it, image pixels
    Position second;           ///< the right one
    float firstConfidence = 0; ///< larger is better; the scale is the finder's own
    float secondConfidence = 0;
};

/// Finds the eyes of a face. Copies share everything; any number of threads may use one finder.
class [[gnu::visibility("default")]] Finder {
public:
    /// Reads the model files, if this is the first finder of the configuration.
    /// @throws std::exception that names the file and what is wrong with it
    explicit Finder(const Configuration& configuration);
    Finder(const Finder&);
    Finder& operator=(const Finder&);
    ~Finder();

    /// @return one element if both eyes were found, none otherwise
    std::list<Location> find(const Image& image, const Face::Location& face) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Eyes

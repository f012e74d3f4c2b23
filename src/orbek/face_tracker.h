#pragma once

#include "orbek/configuration.h"
#include "orbek/face_finder.h"

#include <list>
#include <string>
#include <utility>

namespace Orbek::Face {

/// Follows faces through the frames of one video: a face keeps its id as long as it is found in every frame
/// and does not move faster than the configuration allows (ORBEK.FaceTracker.MaxAllowedFaceSpeed).
///
///     Orbek::Face::Tracker tracker(configuration);
///     while (const auto frame = camera.next())
///         for (const auto& [id, face] : tracker.processImage(frame.image, frame.milliseconds)) ...
///
/// A frame of another size than the one before drops all ids. Copies share the state; one thread drives one
/// tracker.
class [[gnu::visibility("default")]] Tracker {
public:
    /// An id and where its face is.
    using TrackedFace = std::pair<std::string, Location>;

    /// Reads the model files.
    /// @throws std::exception that names the file, or tells the value that a setting cannot have;
    /// Configuration::faults() and checkValue() name the setting
    explicit Tracker(const Configuration& configuration);
    Tracker(const Tracker&);
    Tracker& operator=(const Tracker&);
    ~Tracker();

    /// The next frame of a video with the configured frame rate (ORBEK.FaceTracker.FrameRate).
    std::list<TrackedFace> processFrame(const Image& image);
    /// The next frame.
    /// @param timeMs when it was taken, milliseconds by the caller's clock
    std::list<TrackedFace> processImage(const Image& image, const unsigned int& timeMs);

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Face

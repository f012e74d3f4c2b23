#pragma once

#include "orbek/configuration.h"
#include "orbek/face_finder.h"
#include "orbek/image.h"
#include "orbek/video_format.h"

#include <list>
#include <string>

namespace Orbek {

/// What a CaptureDevice refers to. The library's own come from createCaptureDevice(); an application with a
/// camera of its own derives one, and needs no more for it than capture():
///
///     class Webcam : public Orbek::CaptureDeviceBody {
///         Orbek::Image capture() override { return Orbek::Image(new Frame(camera_.latest())); }
///         ...
///     };
///
/// One thread at a time uses a device.
class [[gnu::visibility("default")]] CaptureDeviceBody {
public:
    CaptureDeviceBody();
    CaptureDeviceBody(const CaptureDeviceBody&) = delete;
    CaptureDeviceBody& operator=(const CaptureDeviceBody&) = delete;
    virtual ~CaptureDeviceBody();

    /// The image of the moment; waits for it.
    virtual Image capture() = 0;
    /// Releases the shutter: a single picture, of a higher quality than capture() has if the device can tell
    /// the two apart. Here that of capture().
    virtual Image release();

    /// Present settings of the camera in its own units, 0 where it has none, as here.
    virtual unsigned int gain();
    virtual unsigned int exposure();
    /// Lets the device adjust itself to the brightness of faces. Here it does nothing.
    /// @param image that the device delivered
    /// @param faces that were found in it; none if there are no faces
    virtual void control(const Image& image, const std::list<Face::Location>& faces);

    /// Show the device's own dialogs, and tell how that ended; 0 where there is none, as here.
    virtual int configure();
    virtual int videoFormatDialog();
    /// The format that is set, for setVideoFormat() of the same device at another time. Here an empty one.
    virtual VideoFormat getVideoFormat();
    /// Here it does nothing.
    virtual void setVideoFormat(const VideoFormat& format);
};

/// Handle on a named source of images. Copies share it.
using CaptureDevice = CountedPtr<CaptureDeviceBody>;

/// Makes the device that the configuration describes under its name below ORBEK.CaptureDevices.
///
///     const Orbek::CaptureDevice camera = Orbek::createCaptureDevice(configuration, "Files");
///     for (;;) show(camera->capture());
///
/// A device that cannot be started, because of its settings or because nothing here drives its kind, has no
/// source: all of its operations but control() throw.
/// @throws std::exception for a kind that is none, and for a plug-in that cannot be used
[[gnu::visibility("default")]] CaptureDevice createCaptureDevice(const Configuration& configuration,
                                                                 const std::string& name);

} // namespace Orbek

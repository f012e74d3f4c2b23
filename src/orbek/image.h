#pragma once

#include "orbek/counted_ptr.h"

#include <string>

namespace Orbek {

/// One colour pixel, in the order of memory.
struct Rgb {
    unsigned char blue = 0;
    unsigned char green = 0;
    unsigned char red = 0;
    unsigned char alpha = 255;

    friend bool operator==(const Rgb&, const Rgb&) = default;
};

/// What an Image refers to. The library's own come from the functions of image_io.h; an application that has
/// pixels already derives one of its own, and the library reads them where they lie:
///
///     class Frame : public Orbek::ImageBody { ... };
///     const Orbek::Image image(new Frame(camera.latest()));
///
/// Both representations lie in memory row by row from top to bottom, without padding, and stay valid and
/// unchanged as long as the body. They may be asked for by several threads at the same time.
class [[gnu::visibility("default")]] ImageBody {
public:
    ImageBody();
    ImageBody(const ImageBody&) = delete;
    ImageBody& operator=(const ImageBody&) = delete;
    virtual ~ImageBody();

    /// Whether the picture has colours; this decides which representation the library asks for first.
    virtual bool isColor() const = 0;
    virtual unsigned int width() const = 0;
    virtual unsigned int height() const = 0;
    /// width() * height() gray values, 0 for black to 255 for white.
    virtual const unsigned char* grayScaleRepresentation() const = 0;
    /// width() * height() colour pixels.
    virtual const Rgb* colorRepresentation() const = 0;
    /// Where the image comes from, for people.
    virtual std::string name() const = 0;
};

/// Handle on an image. Copies share it; nothing changes an image once it is made.
using Image = CountedPtr<ImageBody>;

} // namespace Orbek

#pragma once

#include "cmp/face/face.h"
#include "fn/imagefile/image_limits.h"

#include <iosfwd>
#include <list>

/// Facial records of ISO/IEC 19794-5:2005 behind a short CBEFF header: pictures of faces as they are stored
/// in identity documents. Numbers are stored most significant byte first.
///
///     CBEFF header, 4 bytes: format owner (2), format type (2)
///     facial record header, 16 bytes: "FAC" NUL, "010" NUL, length of all that follows with this header (4),
///         number of images (2), reserved (2; the standard's own table ends before it)
///     for each image:
///         facial information, 20 bytes: length of the image's block (4), number of feature points (2), what
///             is told of the person (14)
///         feature points, 8 bytes each: type, code, x (2), y (2), reserved (2)
///         image information, 12 bytes: type of the face image, of its data, width (2), height (2), ...
///         the image file, as many bytes as the length leaves
namespace Kx::CBEFF {

namespace TokenFace {

/// Writes the images, as they are, as JPEG files of the best quality, of token images: readers will take it
/// that the eyes lie where they do in those. Says nothing else of the persons.
/// @throws FNEIOError if the stream does not take all; FNEBadArg for an image that JPEG cannot hold, or more
/// images or bytes than the record's counts can tell
void write(std::ostream& stream, std::list<Cmp::Face> const& faces);

} // namespace TokenFace

/// Reads a record of any type of face images. Each face has a location, but no eyes of an eye finder: the
/// location follows from the format for token images, and from the points of the eye centres otherwise.
/// @param limits for each image. All images of a record together may have as many pixels as one, and 32 more
/// for each byte of their files
/// @throws FNEOutOfRange for a record that ends early; FNEBadArg for a type of images that is not known; and
/// std::invalid_argument if the eyes coincide, as they do where a record has no points of them; what
/// Fn::readImage() throws.
std::list<Cmp::Face> read(std::istream& stream, const Fn::ImageLimits& limits = {});

} // namespace Kx::CBEFF

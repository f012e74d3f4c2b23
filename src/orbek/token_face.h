#pragma once

#include "orbek/eyes_finder.h"

#include <iosfwd>
#include <list>
#include <utility>

/// Facial records of ISO/IEC 19794-5:2005, with a CBEFF header: the form in which identity documents keep
/// pictures of faces.
namespace Orbek::ISO_19794_5::TokenFace {

/// Writes token images, as JPEG files of the best quality. A record tells nothing of the eyes: readers
/// suppose them where they lie in a token image, and so a picture is to be cut to one before it is written.
/// @throws std::exception if the stream does not take all, or for an image that JPEG cannot hold
[[gnu::visibility("default")]] void write(std::ostream& stream,
                                          const std::list<std::pair<Image, Eyes::Location>>& faces);

/// Reads a record of any type of face images. The images have empty names, and the eyes are those of the
/// record or of the format for token images, with the confidence 0.
/// @throws std::exception that tells what is wrong with the record; also for one that does not tell where the
/// eyes are
[[gnu::visibility("default")]] std::list<std::pair<Image, Eyes::Location>> read(std::istream& stream);

} // namespace Orbek::ISO_19794_5::TokenFace

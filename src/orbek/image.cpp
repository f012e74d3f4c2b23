#include "orbek/image.h"

namespace Orbek {

ImageBody::ImageBody() = default;
ImageBody::~ImageBody() = default;

} // namespace Orbek

#pragma once

#include "fn/image_reference.h"

namespace Fn {

/// Copies `source`, converted to `T`, into `target` with its upper left corner at `offset`. For `unsigned
/// char`, `unsigned short` and Bgra32. @throws FNEBadArg if the source does not lie wholly inside of the
/// target.
template <class T>
void blitIntoImage(const FNImageReference& source, FNImage<T>& target, const FNGridPos& offset);

} // namespace Fn

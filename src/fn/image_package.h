#pragma once

#include "fn/image.h"
#include "fn/serialize.h"

/// The raw packed form of an image: a package of two cores, the width and the height (4 bytes each), and the
/// pixels in memory order, each sample most significant byte first.

namespace Fn {

/// For the five pixel types of FNImageReference.
template <class T> struct Serializer<FNImage<T>> {
    static Package pack(const FNImage<T>& image);
    /// @throws FNEBadArg if the package does not hold an image of `T`.
    static FNImage<T> unpack(const Package& package);
};

} // namespace Fn

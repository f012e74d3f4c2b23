#pragma once

#include "fn/image.h"
#include "fn/image_attributes.h"
#include "fn/serialize.h"
#include "fn/vector3.h"

/// The raw packed form of an image: a package of two cores, the width and the height (4 bytes each), and the
/// pixels in memory order, each sample in its stored form (see byte_order.h; 0 or 1 for `bool`).

namespace Fn {

/// For the five pixel types of FNImageReference, and for the `bool` and FN3Vector<double> of vertex images.
template <class T> struct Serializer<FNImage<T>> {
    static Package pack(const FNImage<T>& image);
    /// @throws FNEBadArg if the package does not hold an image of `T`.
    static FNImage<T> unpack(const Package& package);
};

/// A list of keys and values alternating, in key order.
template <> struct Serializer<FNImageAttributes> {
    static Package pack(const FNImageAttributes& attributes);
    /// @throws FNEBadArg if the package does not hold such a list.
    static FNImageAttributes unpack(const Package& package);
};

} // namespace Fn

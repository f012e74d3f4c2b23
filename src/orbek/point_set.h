#pragma once

#include "orbek/counted_ptr.h"

namespace Orbek {

/// What a PointSet refers to; the library's own comes from loadShapeSample().
class [[gnu::visibility("default")]] PointSetBody {
public:
    PointSetBody();
    PointSetBody(const PointSetBody&) = delete;
    PointSetBody& operator=(const PointSetBody&) = delete;
    virtual ~PointSetBody();
};

/// Handle on a scan as a cloud of points with its texture. An application can only pass it on.
using PointSet = CountedPtr<PointSetBody>;

} // namespace Orbek

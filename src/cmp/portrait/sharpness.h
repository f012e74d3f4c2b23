#pragma once

#include "cmp/gabor_bank.h"

namespace Cmp::Portrait {

/// Measures how sharp a portrait is: how differently its fine structure answers to directions, in the median
/// over the face. A blurred picture has none. Immutable once constructed.
class SharpnessMeter {
public:
    SharpnessMeter();

    /// The share of ordinary portraits that are less sharp, from 0.01 to 1.
    /// @param window of 80 by 80 pixels. @throws FNEBadArg for another size
    float operator()(const FNImage<float>& window) const;

    /// That share by what operator() measures.
    static float shareBelow(float median);

private:
    Implementation::GaborBank bank_;
};

} // namespace Cmp::Portrait

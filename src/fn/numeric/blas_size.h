#pragma once

#include <cstddef>

namespace Fn::Numeric {

/// A size in the 32 bits of BLAS and LAPACK; every call of them passes through here, which also settles on
/// which threads they run. @throws FNEBadArg if the size does not fit.
int blasSize(std::size_t n);

} // namespace Fn::Numeric

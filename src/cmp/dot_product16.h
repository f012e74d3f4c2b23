#pragma once

namespace Cmp {

/// Exact scalar products of 16-bit vectors.
/// @param n number of elements, a multiple of 8
/// @param maxSteps so many products of elements can be summed in 32 bits, whichever they are
long dotProd16(const short* x, const short* y, unsigned int n, unsigned int maxSteps);
/// x0 * y, x1 * y
void dotProd16x2(const short* x0, const short* x1, const short* y, unsigned int n, unsigned int maxSteps,
                 long* out);
/// x0 * y0, x0 * y1, x1 * y0, x1 * y1
void dotProd162x2(const short* x0, const short* x1, const short* y0, const short* y1, unsigned int n,
                  unsigned int maxSteps, long* out);

} // namespace Cmp

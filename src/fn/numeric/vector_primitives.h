#pragma once

#include <cstddef>
#include <cstdint>

/// Primitives on arrays of numbers, the innermost loops of vectors and projections.
///
/// Each one has a plain form, in the namespace Plain, that says what it computes, and one for the vector
/// units that is chosen at run time. Both give the same bits on every instruction set: sums run in a fixed
/// number of partial sums (element i belongs to number i modulo that), which are added in a fixed order, and
/// no product is fused with a sum. Output arrays may be one of the inputs.

namespace Fn::Numeric {

/// Partial sums of a sum over floats (each of them a float), and of one over doubles.
inline constexpr std::size_t floatPartialSums = 32;
inline constexpr std::size_t doublePartialSums = 16;

/// out[i] = a[i] + b[i], for float and double.
void add(const float* a, const float* b, float* out, std::size_t n);
void add(const double* a, const double* b, double* out, std::size_t n);
/// out[i] = a[i] - b[i].
void subtract(const float* a, const float* b, float* out, std::size_t n);
void subtract(const double* a, const double* b, double* out, std::size_t n);
/// out[i] = a[i] * b[i].
void multiply(const float* a, const float* b, float* out, std::size_t n);
void multiply(const double* a, const double* b, double* out, std::size_t n);
/// out[i] = a[i] * factor.
void scale(const float* a, float factor, float* out, std::size_t n);
void scale(const double* a, double factor, double* out, std::size_t n);
/// out[i] = sqrt(a[i]).
void squareRoot(const float* a, float* out, std::size_t n);
void squareRoot(const double* a, double* out, std::size_t n);

/// Scalar products; floats are multiplied and summed as floats.
float dot(const float* a, const float* b, std::size_t n);
double dot(const double* a, const double* b, std::size_t n);
/// Exact.
std::int64_t dot(const std::int16_t* a, const std::int16_t* b, std::size_t n);
/// Exact; the product of a column of 8-bit weights with a 16-bit feature vector.
std::int64_t dot(const std::int8_t* a, const std::int16_t* b, std::size_t n);

/// Sums, in double in either case.
double sum(const float* a, std::size_t n);
double sum(const double* a, std::size_t n);

namespace Plain {

void add(const float* a, const float* b, float* out, std::size_t n);
void add(const double* a, const double* b, double* out, std::size_t n);
void subtract(const float* a, const float* b, float* out, std::size_t n);
void subtract(const double* a, const double* b, double* out, std::size_t n);
void multiply(const float* a, const float* b, float* out, std::size_t n);
void multiply(const double* a, const double* b, double* out, std::size_t n);
void scale(const float* a, float factor, float* out, std::size_t n);
void scale(const double* a, double factor, double* out, std::size_t n);
void squareRoot(const float* a, float* out, std::size_t n);
void squareRoot(const double* a, double* out, std::size_t n);
float dot(const float* a, const float* b, std::size_t n);
double dot(const double* a, const double* b, std::size_t n);
std::int64_t dot(const std::int16_t* a, const std::int16_t* b, std::size_t n);
std::int64_t dot(const std::int8_t* a, const std::int16_t* b, std::size_t n);
double sum(const float* a, std::size_t n);
double sum(const double* a, std::size_t n);

} // namespace Plain

} // namespace Fn::Numeric

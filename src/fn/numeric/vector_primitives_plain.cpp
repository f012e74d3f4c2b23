#include "fn/numeric/vector_primitives.h"

#include "fn/numeric/partial_sums.h"

#include <cmath>

namespace Fn::Numeric::Plain {
namespace {

template <class Sum, std::size_t partialSums, class Term> Sum sumOf(std::size_t n, Term term) {
    Sum partial[partialSums] = {};
    for (std::size_t i = 0; i < n; ++i) partial[i % partialSums] += term(i);
    return foldPartialSums(partial);
}

template <class A, class B> std::int64_t exactDot(const A* a, const B* b, std::size_t n) {
    std::int64_t result = 0;
    for (std::size_t i = 0; i < n; ++i) result += std::int32_t{a[i]} * std::int32_t{b[i]};
    return result;
}

} // namespace

void add(const float* a, const float* b, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] + b[i];
}
void add(const double* a, const double* b, double* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] + b[i];
}
void subtract(const float* a, const float* b, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] - b[i];
}
void subtract(const double* a, const double* b, double* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] - b[i];
}
void multiply(const float* a, const float* b, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] * b[i];
}
void multiply(const double* a, const double* b, double* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] * b[i];
}
void scale(const float* a, float factor, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] * factor;
}
void scale(const double* a, double factor, double* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = a[i] * factor;
}
void squareRoot(const float* a, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = std::sqrt(a[i]);
}
void squareRoot(const double* a, double* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = std::sqrt(a[i]);
}

float dot(const float* a, const float* b, std::size_t n) {
    return sumOf<float, floatPartialSums>(n, [=](std::size_t i) { return a[i] * b[i]; });
}
double dot(const double* a, const double* b, std::size_t n) {
    return sumOf<double, doublePartialSums>(n, [=](std::size_t i) { return a[i] * b[i]; });
}
std::int64_t dot(const std::int16_t* a, const std::int16_t* b, std::size_t n) {
    return exactDot(a, b, n);
}
std::int64_t dot(const std::int8_t* a, const std::int16_t* b, std::size_t n) {
    return exactDot(a, b, n);
}

double sum(const float* a, std::size_t n) {
    return sumOf<double, doublePartialSums>(n, [=](std::size_t i) { return static_cast<double>(a[i]); });
}
double sum(const double* a, std::size_t n) {
    return sumOf<double, doublePartialSums>(n, [=](std::size_t i) { return a[i]; });
}

} // namespace Fn::Numeric::Plain

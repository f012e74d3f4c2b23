#pragma once

#include "fn/exception.h"

#include <cstddef>
#include <string>

/// The texts in which failures of matrices name dimensions.

namespace Fn::MatrixText {

inline std::string dimensions(std::size_t rows, std::size_t cols) {
    return "[" + std::to_string(rows) + " x " + std::to_string(cols) + "]";
}

template <class M> std::string dimensions(const M& matrix) {
    return dimensions(matrix.rows(), matrix.cols());
}

inline std::string indexes(std::size_t i1, std::size_t j1, std::size_t i2, std::size_t j2) {
    return "([" + std::to_string(i1) + ", " + std::to_string(j1) + "], [" + std::to_string(i2) + ", " +
           std::to_string(j2) + "])";
}

/// What a LAPACK routine reports: nothing for 0; for a negative number the text `argument` + the number of
/// the argument
/// + `argumentTail`; for a positive one `failure`, in which "%d" stands for the number.
inline void check(int info, const std::string& argument, const std::string& argumentTail,
                  const std::string& failure) {
    if (info == 0) return;
    if (info < 0) FN_THROW(FNEBadArg, argument + std::to_string(-info) + argumentTail);
    std::string text = failure;
    if (const auto place = text.find("%d"); place != std::string::npos)
        text.replace(place, 2, std::to_string(info));
    FN_THROW(FNEBadArg, text);
}

} // namespace Fn::MatrixText

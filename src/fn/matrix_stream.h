#pragma once

#include "fn/matrix.h"

#include <iosfwd>
#include <string>
#include <vector>

/// Reading of matrices from streams; the constructors of the classes call these.

namespace Fn {

/// Either form that the constructor of Matrix reads. @throws FNEBadArg
template <class T> Matrix<T> readMatrix(std::istream& stream);

/// `count` numbers as text. @throws FNEBadArg with `text` if there are less.
template <class T>
std::vector<T> readText(std::istream& stream, std::uint64_t count, const std::string& text);

} // namespace Fn

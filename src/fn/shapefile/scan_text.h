#pragma once

#include <istream>
#include <string>

namespace Fn {

/// Words, numbers and lines of a text, for the readers of scan files. Words are separated by blanks, tabs and
/// line ends; they and lines have a greatest length, so that memory follows what makes sense and not what a
/// file holds.
class ScanText {
public:
    static constexpr std::size_t longestWord = 255;
    static constexpr std::size_t longestLine = 4095;

    explicit ScanText(std::istream& stream) : buffer_(*stream.rdbuf()) {}

    /// The next word; false at the end of the text. @throws FNEBadArg if it is too long.
    bool word(std::string& word);
    /// The rest of the present line, without its end; false at the end of the text.
    /// @throws FNEBadArg if it is too long.
    bool line(std::string& line);
    /// The next word as a finite number. @throws FNEBadArg with the text `failure` if it is none.
    double number(const char* failure);
    /// The next word as a number from 0 to 2^32 - 1. @throws FNEBadArg with the text `failure`.
    std::uint32_t unsignedNumber(const char* failure);

private:
    std::streambuf& buffer_;
};

/// The whole text as a finite number, with an optional sign; false if it is none.
bool parseNumber(const std::string& text, double& number);
bool parseNumber(const std::string& text, std::int64_t& number);

} // namespace Fn

#include "fn/shapefile/scan_text.h"

#include "fn/exception.h"

#include <charconv>
#include <cmath>
#include <limits>

namespace Fn {

namespace {

constexpr int noByte = std::char_traits<char>::eof();

bool isBlank(int c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

template <class T> bool parse(const std::string& text, T& number) {
    const char *begin = text.data(), *const end = begin + text.size();
    // A plus is not known to from_chars.
    if (begin != end && *begin == '+' && (begin + 1 == end || begin[1] != '-')) ++begin;
    const auto [behind, error] = std::from_chars(begin, end, number);
    return error == std::errc() && behind == end;
}

} // namespace

bool parseNumber(const std::string& text, double& number) {
    return parse(text, number) && std::isfinite(number);
}

bool parseNumber(const std::string& text, std::int64_t& number) {
    return parse(text, number);
}

bool ScanText::word(std::string& word) {
    word.clear();
    int c = buffer_.sgetc();
    while (isBlank(c)) c = buffer_.snextc();
    for (; c != noByte && !isBlank(c); c = buffer_.snextc()) {
        if (word.size() == longestWord) FN_THROW(FNEBadArg, "Scan file: word too long");
        word += static_cast<char>(c);
    }
    return !word.empty();
}

bool ScanText::line(std::string& line) {
    line.clear();
    int c = buffer_.sbumpc();
    if (c == noByte) return false;
    for (; c != noByte && c != '\n'; c = buffer_.sbumpc()) {
        if (line.size() == longestLine) FN_THROW(FNEBadArg, "Scan file: line too long");
        line += static_cast<char>(c);
    }
    if (!line.empty() && line.back() == '\r') line.pop_back();
    return true;
}

double ScanText::number(const char* failure) {
    std::string text;
    double result = 0;
    if (!word(text) || !parseNumber(text, result)) FN_THROW(FNEBadArg, failure);
    return result;
}

std::uint32_t ScanText::unsignedNumber(const char* failure) {
    std::string text;
    std::int64_t result = 0;
    if (!word(text) || !parseNumber(text, result) || result < 0 ||
        result > std::numeric_limits<std::uint32_t>::max())
        FN_THROW(FNEBadArg, failure);
    return static_cast<std::uint32_t>(result);
}

} // namespace Fn

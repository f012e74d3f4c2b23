#include "fn/text_forms.h"

#include <charconv>

namespace Fn {

const std::string controlChars = [] {
    std::string codes;
    for (char c = 1; c < 32; ++c) codes += c;
    return codes;
}();

std::string MapCharsToHex(const std::string& text, char escape, const std::string& mapped) {
    constexpr const char* digits = "0123456789abcdef";
    std::string result;
    for (const char c : text) {
        if (c != escape && mapped.find(c) == std::string::npos) {
            result += c;
            continue;
        }
        const auto code = static_cast<unsigned char>(c);
        result += {escape, digits[code / 16], digits[code % 16]};
    }
    return result;
}

std::string UnmapCharsFromHex(const std::string& text, char escape) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        result += text[i];
        if (text[i] != escape || i + 2 >= text.size()) continue;
        unsigned code = 0;
        const char* const end = text.data() + i + 3;
        const auto [stop, error] = std::from_chars(text.data() + i + 1, end, code, 16);
        if (error == std::errc() && stop == end) result.back() = static_cast<char>(code);
        i += 2;
    }
    return result;
}

void replaceAll(std::string& text, const std::string& what, const std::string& by) {
    for (std::size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + by.size()))
        text.replace(at, what.size(), by);
}

std::list<std::string> splitText(const std::string& text, char separator) {
    std::list<std::string> parts;
    for (std::size_t begin = 0; begin < text.size();) {
        const std::size_t end = std::min(text.find(separator, begin), text.size());
        if (end > begin) parts.push_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return parts;
}

bool matchString(const std::string& text, const std::string& pattern) {
    const std::list<std::string> parts = splitText(pattern, '*');
    std::size_t position = 0;
    for (auto part = parts.begin(); part != parts.end(); ++part) {
        if (position >= text.size()) return false;
        const bool atEnd = pattern.front() == '*' && pattern.back() != '*' && std::next(part) == parts.end();
        if (atEnd) {
            if (text.size() - position < part->size()) return false;
            position = text.size() - part->size();
        }
        const bool atStart = pattern.front() != '*' && part == parts.begin();
        position = text.find(*part, position);
        if (position == std::string::npos || (atStart && position != 0)) return false;
    }
    return true;
}

} // namespace Fn

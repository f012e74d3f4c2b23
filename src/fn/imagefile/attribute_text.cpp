#include "fn/imagefile/attribute_text.h"

#include <charconv>

namespace Fn {

namespace {

std::string encodeNewLines(const std::string& text) {
    std::string result;
    for (const char c : text) c == '\n' ? result += "\\x0A" : result += c;
    return result;
}

std::string decodeNewLines(const std::string& text) {
    constexpr std::size_t codeSize = 4;
    std::string result;
    for (std::size_t i = 0; i < text.size();) {
        if (text.compare(i, 2, "\\x") != 0) {
            result += text[i++];
            continue;
        }
        const std::string code = text.substr(i, codeSize);
        unsigned int value = 0;
        const char* const end = code.data() + code.size();
        const auto [behind, error] = std::from_chars(code.data() + 2, end, value, 16);
        if (code.size() != codeSize || error != std::errc() || behind != end)
            FN_THROW(FNEIOError, "::decodeNewLines(): bad character code: " + code);
        result += static_cast<char>(value);
        i += codeSize;
    }
    return result;
}

std::string unescape(const std::string& text, char special) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 1 < text.size() && text[i + 1] == special) continue;
        result += text[i];
    }
    return result;
}

/// Position of the first `delimiter` from `start` that has no backslash before it.
std::size_t findPlain(const std::string& text, char delimiter, std::size_t start) {
    std::size_t at = text.find(delimiter, start);
    while (at != std::string::npos && at > start && text[at - 1] == '\\') at = text.find(delimiter, at + 1);
    return at;
}

} // namespace

std::string escape(const std::string& text, char special) {
    std::string result;
    for (const char c : text) {
        if (c == special) result += '\\';
        result += c;
    }
    return result;
}

std::string buildAttributeString(const FNImageAttributes& attributes) {
    std::string result;
    for (const auto& [key, value] : attributes)
        if (!key.empty() && !value.empty())
            result += escape(encodeNewLines(key), '=') + "=\"" + escape(encodeNewLines(value), '"') + '"';
    return result;
}

FNImageAttributes parseAttributes(const std::string& text) {
    const auto require = [](bool good, const char* failure) {
        if (!good) FN_THROW(FNEIOError, std::string("parseAttributes: ") + failure);
    };
    constexpr auto none = std::string::npos;
    FNImageAttributes attributes;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t equals = findPlain(text, '=', at);
        require(equals != none, "no key delimiter");
        require(equals > at, "Key with length zero");
        const std::size_t open = text.find_first_not_of(" \t", equals + 1);
        require(open != none && text[open] == '"', "no val delimiter after key");
        const std::size_t close = findPlain(text, '"', open + 1);
        require(close != none, "no val delimiter");
        require(close > open + 1, "val with length zero");
        attributes[decodeNewLines(unescape(text.substr(at, equals - at), '='))] =
            decodeNewLines(unescape(text.substr(open + 1, close - open - 1), '"'));
        at = close + 1;
    }
    return attributes;
}

} // namespace Fn

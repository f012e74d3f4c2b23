#include "fn/deployment/app_config_db.h"

#include "fn/exception.h"

#include <cstdio>
#include <cstring>
#include <istream>

namespace {

constexpr const char* blanks = " \t";
constexpr const char* whiteSpace = " \t\n\v\f\r";

bool isLineEnd(int c) {
    return c == '\n' || c == '\r';
}

/// At least two digits, uppercase.
std::string hexCode(char c) {
    char text[8];
    std::snprintf(text, sizeof text, "%02X", static_cast<unsigned>(static_cast<unsigned char>(c)));
    return text;
}

/// Reads a line without its end. @return false if there is none any more.
bool readLine(std::istream& text, std::string& line) {
    constexpr int end = std::char_traits<char>::eof();
    line.clear();
    int c = text.get();
    if (c == end) return false;
    for (; c != end && !isLineEnd(c); c = text.get()) line += static_cast<char>(c);
    if (c != end && isLineEnd(text.peek())) text.get();
    return true;
}

} // namespace

bool AppConfigDB::validKeyChar(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
           (c != '\0' && std::strchr("_.*-<>,:", c));
}

void AppConfigDB::checkKey(const char* key) const {
    for (const char* c = key; *c; ++c)
        if (!validKeyChar(*c))
            FN_THROW(FNEBadArg, "AppConfigDB[" + name() + ",char:" + *c + ",hex:" + hexCode(*c) +
                                    "]: invalid char in key '" + key + "'");
}

std::string AppConfigDB::makeCompatibleKey(const std::string& text) {
    std::string key;
    for (const char* c = text.c_str(); *c; ++c)
        if (validKeyChar(*c)) key += *c;
    return key;
}

void AppConfigDB::parseLine(int lineNumber, const std::string& text,
                            const Fn::Functor2<std::string, std::string>& sink) const {
    const std::size_t begin = text.find_first_not_of(blanks);
    if (begin == std::string::npos || text[begin] == '#') return;
    const std::string place = "AppConfigDB[" + name() + ",line:" + std::to_string(lineNumber);

    std::size_t keyEnd = begin;
    while (keyEnd < text.size() && validKeyChar(text[keyEnd])) ++keyEnd;
    if (keyEnd == begin) FN_THROW(FNEIOError, place + "]: syntax error, found key with length zero.");

    const std::size_t equals = std::min(text.find_first_not_of(blanks, keyEnd), text.size());
    const std::string column = place + ",column:" + std::to_string(equals - begin);
    if (equals == text.size()) FN_THROW(FNEIOError, column + "] syntax error, missing '='.");
    if (text[equals] != '=')
        FN_THROW(FNEIOError, column + ",char:" + text[equals] + ",hex:" + hexCode(text[equals]) +
                                 "]: syntax error, invalid char in key.");

    const std::size_t valueBegin = text.find_first_not_of(whiteSpace, equals + 1);
    std::string value;
    if (valueBegin != std::string::npos)
        value = text.substr(valueBegin, text.find_last_not_of(whiteSpace) - valueBegin + 1);
    sink(text.substr(begin, keyEnd - begin), value);
}

std::vector<AppConfigDB::Line> AppConfigDB::parseLines(std::istream& text) const {
    std::vector<Line> lines;
    int number = 1;
    const Fn::Functor2<std::string, std::string> sink([&](const std::string& key, const std::string& value) {
        lines.push_back({number, key, value});
    });
    for (std::string line; readLine(text, line); ++number) parseLine(number, line, sink);
    if (text.bad()) FN_THROW(FNEIOError, "Error reading text file");
    return lines;
}

AppConfigDB::Pairs AppConfigDB::firstPairs(const std::vector<Line>& lines) {
    Pairs pairs;
    for (const Line& line : lines) pairs.emplace(line.key, line.value);
    return pairs;
}

const std::string& AppConfigDB::find(const Pairs& pairs, const std::string& key) {
    const auto pair = pairs.find(key);
    if (pair == pairs.end()) FN_THROW(FNEBadArg, "Configuration key '" + key + "' doesn't exist");
    return pair->second;
}

AppVolatileConfigDB::AppVolatileConfigDB(std::istream& text) {
    setLines(parseLines(text));
    pairs_ = firstPairs(lines());
}

bool AppVolatileConfigDB::exists(const std::string& key) const {
    checkKey(key.c_str());
    return pairs_.contains(key);
}

std::string AppVolatileConfigDB::get(const std::string& key) const {
    checkKey(key.c_str());
    return find(pairs_, key);
}

void AppVolatileConfigDB::set(const std::string& key, const std::string& value) {
    checkKey(key.c_str());
    pairs_[key] = value;
}

void AppVolatileConfigDB::remove(const std::string& key) {
    checkKey(key.c_str());
    pairs_.erase(key);
}

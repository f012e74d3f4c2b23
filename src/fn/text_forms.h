#pragma once

#include <list>
#include <string>

/// Forms of text in configuration files and in their tools.

namespace Fn {

/// The characters with the codes 1 to 31.
extern const std::string controlChars;

/// `text` with `escape` itself and each character of `mapped` written as `escape` and two lowercase hex
/// digits.
std::string MapCharsToHex(const std::string& text, char escape, const std::string& mapped);

/// Undoes MapCharsToHex. An `escape` with something else behind it stands, alone, for all three characters;
/// at the very end of the text, where no two characters follow, it and what follows stay as they are.
std::string UnmapCharsFromHex(const std::string& text, char escape);

/// Replaces every occurrence of `what`, which is not empty; what was put in is not searched again.
void replaceAll(std::string& text, const std::string& what, const std::string& by);

/// The parts between the separators; empty ones are dropped.
std::list<std::string> splitText(const std::string& text, char separator);

/// Whether `text` matches a pattern with "*": "ab" is a prefix, "*ab" a suffix, "*ab*" any place; "" and "*"
/// match everything. The parts of a longer pattern are looked for in order, and may overlap.
bool matchString(const std::string& text, const std::string& pattern);

} // namespace Fn

#pragma once

#include "fn/deployment/type.h"

#include <cstdint>
#include <string>

/// The plain value kinds. Each tells its Type, and converts between a value and its text.

namespace Fn::Deployment {

/// Stands for a feature that is switched off; has no value.
struct None {
    static std::string typeId() { return "None"; }
    static Type define();
};

/// "true" or "false".
struct Bool {
    using ValueType = bool;
    static constexpr const char* True = "true";
    static constexpr const char* False = "false";

    static std::string typeId() { return "Bool"; }
    static Type define();
    /// @throws FNEGeneric
    static bool stringToValue(const std::string& text);
    static std::string valueToString(bool value) { return value ? True : False; }
};

struct String {
    using ValueType = std::string;

    static std::string typeId() { return "String"; }
    static Type define();
    static std::string stringToValue(const std::string& text) { return text; }
    static std::string valueToString(const std::string& value) { return value; }
};

/// A string that is stored encrypted. Its two conversions come with the ciphers.
struct EncryptedString {
    using ValueType = std::string;

    static std::string typeId() { return "EncryptedString"; }
    static Type define();
};

/// How a kind of number names and describes itself.
template <class T> struct NumberTraits;
template <> struct NumberTraits<std::int32_t> {
    static constexpr const char* id = "Int";
    static constexpr const char* doc = "A 32-bit integer numeric value.";
    static constexpr const char* defaultText = "0";
    static constexpr const char* inWords = "int";
};
template <> struct NumberTraits<std::uint32_t> {
    static constexpr const char* id = "UInt";
    static constexpr const char* doc = "An unsigned integer numeric value.";
    static constexpr const char* defaultText = "0";
    static constexpr const char* inWords = "unsigned int";
};
template <> struct NumberTraits<std::int64_t> {
    static constexpr const char* id = "Int64";
    static constexpr const char* doc = "A 64-bit integer numeric value.";
    static constexpr const char* defaultText = "0";
    static constexpr const char* inWords = "int64";
};
template <> struct NumberTraits<std::uint64_t> {
    static constexpr const char* id = "UInt64";
    static constexpr const char* doc = "An unsigned 64-bit integer numeric value.";
    static constexpr const char* defaultText = "0";
    static constexpr const char* inWords = "unsigned int64";
};
template <> struct NumberTraits<float> {
    static constexpr const char* id = "Float";
    static constexpr const char* doc = "A decimal floating-point numeric value.";
    static constexpr const char* defaultText = "0.0";
    static constexpr const char* inWords = "float";
};

/// A number. Its text is read like a stream reads it: blanks before it and anything behind it are ignored.
template <class T> struct Number {
    using ValueType = T;

    static std::string typeId() { return NumberTraits<T>::id; }
    static Type define() { return Type(typeId(), NumberTraits<T>::doc, NumberTraits<T>::defaultText, true); }
    /// @throws FNEGeneric if the text begins with no number of this kind
    static T stringToValue(const std::string& text);
    /// Six significant digits for floats.
    static std::string valueToString(T value);
};
using Int = Number<std::int32_t>;
using UInt = Number<std::uint32_t>;
using Int64 = Number<std::int64_t>;
using UInt64 = Number<std::uint64_t>;
using Float = Number<float>;

} // namespace Fn::Deployment

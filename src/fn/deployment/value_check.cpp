#include "fn/deployment/value_check.h"

#include "fn/deployment/app_config_db.h"
#include "fn/deployment/composite_values.h"

#include <algorithm>
#include <locale>
#include <set>
#include <sstream>

namespace Fn::Deployment {
namespace {

std::string quoted(const std::string& text) {
    return "\"" + text + "\"";
}

/// Whether a number is the whole text.
template <class Kind> bool isNumber(const std::string& text) {
    using T = typename Kind::ValueType;
    std::istringstream stream(text);
    stream.imbue(std::locale::classic());
    T value;
    if (!(stream >> value)) return false;
    if (std::is_unsigned_v<T> && text.find('-') != std::string::npos) return false;
    return (stream >> std::ws).eof();
}

std::string faultOfNumber(bool isNumber, const Type& type, const std::string& text) {
    return isNumber ? "" : quoted(text) + " is not of the type " + type.id();
}

std::string faultOfNames(const std::string& text) {
    std::set<std::string> seen;
    for (const std::string& name : ContainerBase::stringToValue(text)) {
        if (!std::ranges::all_of(name, [](char c) { return c != '.' && AppConfigDB::validKeyChar(c); }))
            return quoted(name) + " cannot be the name of an element";
        if (!seen.insert(name).second) return "names " + quoted(name) + " twice";
    }
    return "";
}

std::string faultOfChoice(const std::list<std::string>& choices, const std::string& text) {
    if (std::ranges::find(choices, text) != choices.end()) return "";
    std::string list;
    for (const std::string& choice : choices) list += (list.empty() ? "" : ", ") + choice;
    return quoted(text) + " is none of " + list;
}

} // namespace

std::string faultOfValue(const Type& type, const std::string& text) {
    const std::string kind = idPrefix(type);
    if (!type.hasValue()) return "is a group of keys and has no value";
    if (kind == Int::typeId()) return faultOfNumber(isNumber<Int>(text), type, text);
    if (kind == UInt::typeId()) return faultOfNumber(isNumber<UInt>(text), type, text);
    if (kind == Int64::typeId()) return faultOfNumber(isNumber<Int64>(text), type, text);
    if (kind == UInt64::typeId()) return faultOfNumber(isNumber<UInt64>(text), type, text);
    if (kind == Float::typeId()) return faultOfNumber(isNumber<Float>(text), type, text);
    if (isContainer(type)) return faultOfNames(text);
    if (kind == "Binary") try {
            (void)BinaryBase::stringToValue(text);
        } catch (const std::exception&) {
            return "is not the Base64 text of a package";
        }
    const std::list<std::string> choices = getAllValues(type);
    return choices.empty() ? "" : faultOfChoice(choices, text);
}

} // namespace Fn::Deployment

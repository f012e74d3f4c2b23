#include "fn/deployment/composite_values.h"

#include "fn/mime64.h"
#include "fn/text_forms.h"

#include <algorithm>
#include <set>

namespace Fn::Deployment {
namespace {

// Part of stored type descriptions, spelling included.
constexpr const char* delegateName = "DelegateType";
constexpr const char* containedName = "ContaintType";

std::string join(const std::list<std::string>& parts, const std::string& separator) {
    std::string text;
    for (const std::string& part : parts) text += (text.empty() ? "" : separator) + part;
    return text;
}

std::list<std::string> namesOf(const std::list<Property>& members) {
    std::list<std::string> names;
    for (const Property& member : members) names.push_back(member.name());
    return names;
}

/// What lies between the outermost "<" and ">", split at the commas that lie within no further pair.
std::list<std::string> splitArguments(const std::string& id) {
    const std::size_t begin = id.find('<'), end = id.rfind('>');
    if (begin == std::string::npos || end == std::string::npos || end < begin) return {};
    std::list<std::string> arguments(1);
    int depth = 0;
    for (const char c : id.substr(begin + 1, end - begin - 1)) {
        depth += (c == '<') - (c == '>');
        if (c == ',' && depth == 0)
            arguments.emplace_back();
        else
            arguments.back() += c;
    }
    return arguments;
}

const std::string& checkedWord(const std::string& word, const std::list<std::string>& list,
                               const std::string& id, const char* operation) {
    if (std::find(list.begin(), list.end(), word) == list.end())
        FN_THROW(FNEBadArg,
                 id + " Value Error:  does not allow value `" + word + "' for " + operation + " operation.");
    return word;
}

const std::string& checkedAlternative(const std::string& name, const Type& type, const char* operation) {
    const Type& delegate = delegateType(type);
    const std::string prefix = "Alternative<" + delegate.id() + ">";
    if (delegate.properties().empty())
        FN_THROW(FNEBadArg, prefix + " Type Error:  does not provide any properties!");
    if (!findProperty(delegate.properties(), name))
        FN_THROW(FNEBadArg, prefix + " Value Error: \n does not allow value '" + name + "' for " + operation +
                                " operation.\n Valid property names are: ['" +
                                join(namesOf(delegate.properties()), "', '") + "'].");
    return name;
}

} // namespace

bool isContainer(const Type& type) {
    return idPrefix(type) == "Container";
}
bool isAlternative(const Type& type) {
    return idPrefix(type) == "Alternative";
}
bool isOldAlternative(const Type& type) {
    return idPrefix(type) == "OldAlternative";
}

const Type& containedType(const Type& container) {
    const Property* const member = findProperty(container.properties(), containedName);
    if (!member) FN_THROW(FNESysError, "container of type '" + container.id() + "' no containt type found.");
    return member->type();
}

const Type& delegateType(const Type& alternative) {
    const Property* const member = findProperty(alternative.properties(), delegateName);
    if (!member)
        FN_THROW(FNESysError, "alternative of type '" + alternative.id() + "' no delegate type found.");
    return member->type();
}

const std::list<Property>& membersOf(const Type& type) {
    return isAlternative(type) ? delegateType(type).properties() : type.properties();
}

bool listsElement(const Component& node, const std::string& name) {
    if (!isContainer(node.type())) return false;
    const std::list<std::string> names = ContainerBase::stringToValue(node.read(false));
    return std::find(names.begin(), names.end(), name) != names.end();
}

std::list<std::string> getAllValues(const Type& type) {
    const std::string kind = idPrefix(type);
    if (kind == "Bool") return {Bool::True, Bool::False};
    if (kind == "Enum") return EnumBase::enumeration(type.id());
    if (kind == "OldAlternative") return OldAlternativeBase::typeIdList(type.id());
    if (kind == "Alternative") return namesOf(delegateType(type).properties());
    return {};
}

std::list<std::string> EnumBase::enumeration(const std::string& id) {
    return splitArguments(id);
}
std::string EnumBase::typeId(const std::list<std::string>& list) {
    return "Enum<" + join(list, ",") + ">";
}

Type EnumBase::define(const std::list<std::string>& list) {
    return Type(typeId(list), "One element out of [" + join(list, ",") + "].", list.front(), true);
}

std::string EnumBase::stringToValue(const std::string& text, const std::list<std::string>& list) {
    return checkedWord(text, list, typeId(list), "stringToValue");
}

std::string EnumBase::valueToString(const std::string& value, const std::list<std::string>& list) {
    return checkedWord(value, list, typeId(list), "valueToString");
}

Type AlternativeBase::define(const std::string& id, const Type& delegate) {
    const std::list<std::string> names = namesOf(delegate.properties());
    return Type(id, "One Element out of [" + join(names, ",") + "].",
                properties(Property(delegate, delegateName, "", "", false)),
                names.empty() ? "" : names.front(), true);
}

std::string AlternativeBase::stringToValue(const std::string& text, const Type& type) {
    return checkedAlternative(text, type, "stringToValue");
}

std::string AlternativeBase::valueToString(const std::string& value, const Type& type) {
    return checkedAlternative(value, type, "valueToString");
}

std::list<std::string> OldAlternativeBase::typeIdList(const std::string& id) {
    return splitArguments(id);
}

std::string OldAlternativeBase::typeId(const std::list<std::string>& list) {
    return "OldAlternative<" + join(list, ",") + ">";
}

Type OldAlternativeBase::define(const std::list<Type>& types) {
    std::list<Property> members;
    for (const Type& type : types) members.emplace_back(type, type.id(), "", "", false);
    const std::list<std::string> ids = namesOf(members);
    return Type(typeId(ids), "One element out of [" + join(ids, ",") + "].", members, ids.front(), true);
}

std::string OldAlternativeBase::stringToValue(const std::string& text, const std::list<std::string>& list) {
    return checkedWord(text, list, typeId(list), "stringToValue");
}

std::string OldAlternativeBase::valueToString(const std::string& value, const std::list<std::string>& list) {
    return checkedWord(value, list, typeId(list), "valueToString");
}

Type ContainerBase::define(const std::string& id, const Type& contained) {
    return Type(id, "This container can hold named elements of type " + contained.id() + ".",
                properties(Property(contained, containedName, "", "", false)), "", true);
}

std::list<std::string> ContainerBase::stringToValue(const std::string& text) {
    return splitText(text, ' ');
}

std::string ContainerBase::valueToString(const std::list<std::string>& names) {
    std::set<std::string> seen;
    std::string text;
    for (const std::string& name : names) {
        if (!seen.insert(name).second) FN_THROW(FNEBadArg, "Duplicate identifier not allowed: " + name);
        text += name + " ";
    }
    return text;
}

Type VectorBase::define(const std::string& id, const std::string& doc, const Type& element,
                        const std::list<std::string>& names) {
    std::list<Property> members;
    for (const std::string& name : names)
        members.emplace_back(element, name, element.defaultValue(), "", false);
    return Type(id, doc, members, "", false);
}

std::list<std::string> VectorBase::vectorNames(int n) {
    std::list<std::string> names;
    for (int i = 0; i < n; ++i) names.push_back(std::to_string(i));
    return names;
}

std::list<std::string> VectorBase::matrixNames(int rows, int columns) {
    std::list<std::string> names;
    for (int r = 0; r < rows; ++r)
        for (int c = 0; c < columns; ++c) names.push_back(std::to_string(r) + "," + std::to_string(c));
    return names;
}

Type BinaryBase::define(const std::string& id, const std::string& packedId) {
    return Type(id, "Serialized binary of type " + packedId, "", true);
}

Package BinaryBase::stringToValue(const std::string& text) {
    const FNRMem<unsigned char> bytes = FNDecodeMime64(text);
    return Package(bytes.data(), bytes.size());
}

std::string BinaryBase::valueToString(const Package& package) {
    FNRMem<unsigned char> bytes(package.size());
    package.write(bytes.getExclusive());
    return FNEncodeMime64(bytes);
}

} // namespace Fn::Deployment

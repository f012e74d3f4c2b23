#pragma once

#include "fn/deployment/component.h"
#include "fn/deployment/leaf_values.h"
#include "fn/deployment/type.h"
#include "fn/serialize.h"

#include <list>
#include <string>

/// The value kinds that are built from others: a base class with the code, and a class template for the
/// declaration. A node of the configuration tree knows its kind only by its type's id.

namespace Fn::Deployment {

bool isContainer(const Type& type);
bool isAlternative(const Type& type);
bool isOldAlternative(const Type& type);

/// The type of a container's elements. @throws FNESysError
const Type& containedType(const Type& container);
/// The type whose properties an alternative chooses from. @throws FNESysError
const Type& delegateType(const Type& alternative);
/// What can stand below a node: the delegate's properties for an alternative, the type's own for everything
/// else.
const std::list<Property>& membersOf(const Type& type);
/// Whether a node is a container that lists an element of that name.
bool listsElement(const Component& node, const std::string& name);
/// The values that a type allows, empty if there is no such list.
std::list<std::string> getAllValues(const Type& type);

/// One of a list of words.
class EnumBase {
public:
    using ValueType = std::string;

    /// The words between the outermost "<" and ">" of a type's id.
    static std::list<std::string> enumeration(const std::string& id);
    /// @throws FNEBadArg if the text is not in the list
    static std::string stringToValue(const std::string& text, const std::list<std::string>& list);
    static std::string valueToString(const std::string& value, const std::list<std::string>& list);

protected:
    static std::string typeId(const std::list<std::string>& list);
    static Type define(const std::list<std::string>& list);
};

/// @tparam D has a static enumeration() that gives the words; the first is the default.
template <class D> class Enum : public EnumBase {
public:
    static std::string typeId() { return EnumBase::typeId(D::enumeration()); }
    static Type define() { return EnumBase::define(D::enumeration()); }
    static std::string stringToValue(const std::string& text) {
        return EnumBase::stringToValue(text, D::enumeration());
    }
    static std::string valueToString(const std::string& value) {
        return EnumBase::valueToString(value, D::enumeration());
    }
};

/// The name of one property of a delegate type; the node's members are that type's properties.
class AlternativeBase {
public:
    using ValueType = std::string;

    /// @throws FNEBadArg if the text is not the name of a property of the delegate of `type`
    static std::string stringToValue(const std::string& text, const Type& type);
    static std::string valueToString(const std::string& value, const Type& type);

protected:
    static Type define(const std::string& id, const Type& delegate);
};

/// @tparam D a type whose first property is the default.
template <class D> class Alternative : public AlternativeBase {
public:
    static std::string typeId() { return "Alternative<" + D::typeId() + ">"; }
    static Type define() { return AlternativeBase::define(typeId(), type<D>()); }
    static std::string stringToValue(const std::string& text) {
        return AlternativeBase::stringToValue(text, type<Alternative>());
    }
    static std::string valueToString(const std::string& value) {
        return AlternativeBase::valueToString(value, type<Alternative>());
    }
};

/// One of a list of types, chosen by its id.
class OldAlternativeBase {
public:
    using ValueType = std::string;

    /// The type ids between the outermost "<" and ">" of a type's id.
    static std::list<std::string> typeIdList(const std::string& id);
    /// @throws FNEBadArg if the text is not in the list
    static std::string stringToValue(const std::string& text, const std::list<std::string>& list);
    static std::string valueToString(const std::string& value, const std::list<std::string>& list);

protected:
    static std::string typeId(const std::list<std::string>& list);
    static Type define(const std::list<Type>& types);
};

template <class... T> class AlternativeN : public OldAlternativeBase {
public:
    static std::string typeId() { return OldAlternativeBase::typeId(ids()); }
    static Type define() { return OldAlternativeBase::define({type<T>()...}); }
    static std::string stringToValue(const std::string& text) {
        return OldAlternativeBase::stringToValue(text, ids());
    }
    static std::string valueToString(const std::string& value) {
        return OldAlternativeBase::valueToString(value, ids());
    }

private:
    static std::list<std::string> ids() { return {T::typeId()...}; }
};

/// The choice between "Disabled" and "Enabled" with the settings of `T`.
template <class T> struct OptionDelegate {
    static std::string typeId() { return "Option<" + T::typeId() + ">"; }
    static Type define() {
        return Type(typeId(), "Option to enable a feature.",
                    properties(property<None>::create("Disabled", "The option is disabled."),
                               property<T>::create("Enabled", "Option enabled: " + type<T>().doc())),
                    "", false);
    }
};
template <class T> using Option = Alternative<OptionDelegate<T>>;

/// Any number of named elements of one type; the value is their names, separated by blanks.
class ContainerBase {
public:
    using ValueType = std::list<std::string>;

    static std::list<std::string> stringToValue(const std::string& text);
    /// Each name followed by one blank. @throws FNEBadArg if a name comes twice
    static std::string valueToString(const std::list<std::string>& names);

protected:
    static Type define(const std::string& id, const Type& contained);
};

template <class T> class Container : public ContainerBase {
public:
    static std::string typeId() { return "Container<" + T::typeId() + ">"; }
    static Type define() { return ContainerBase::define(typeId(), type<T>()); }
};

/// Numbered elements of one type: a vector "0", "1", ..., a matrix "row,column".
class VectorBase {
protected:
    static Type define(const std::string& id, const std::string& doc, const Type& element,
                       const std::list<std::string>& names);
    static std::list<std::string> vectorNames(int n);
    static std::list<std::string> matrixNames(int rows, int columns);
};

template <class T, int N> class Vector : public VectorBase {
public:
    static std::string typeId() { return "Vector<" + T::typeId() + "," + std::to_string(N) + ">"; }
    static Type define() {
        return VectorBase::define(typeId(),
                                  "Vector of " + T::typeId() + " with " + std::to_string(N) + " elements.",
                                  type<T>(), vectorNames(N));
    }
};

template <class T, int R, int C> class Matrix : public VectorBase {
public:
    static std::string typeId() {
        return "Matrix<" + T::typeId() + "," + std::to_string(R) + "," + std::to_string(C) + ">";
    }
    static Type define() {
        return VectorBase::define(typeId(),
                                  "Matrix of " + T::typeId() + " with " + std::to_string(R) + " rows and " +
                                      std::to_string(C) + " columns.",
                                  type<T>(), matrixNames(R, C));
    }
};

/// Any value that can be packed, as the Base64 text of its package.
class BinaryBase {
public:
    static Package stringToValue(const std::string& text);
    static std::string valueToString(const Package& package);

protected:
    static Type define(const std::string& id, const std::string& packedId);
};

/// @tparam T packs itself, and has a static typeId().
template <class T> class Binary : public BinaryBase {
public:
    using ValueType = T;

    static std::string typeId() { return "Binary<" + T::typeId() + ">"; }
    static Type define() { return BinaryBase::define(typeId(), T::typeId()); }
    /// @throws FNEBadArg if the text does not hold a `T`
    static T stringToValue(const std::string& text) {
        return deSerialize<T>(BinaryBase::stringToValue(text));
    }
    static std::string valueToString(const T& value) {
        return BinaryBase::valueToString(serialize<T>(value));
    }
};

} // namespace Fn::Deployment

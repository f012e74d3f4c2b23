#pragma once

#include "fn/cptr.h"

#include <list>
#include <string>

/// The static description of settings. Every configurable class publishes a Type; types nest by their
/// properties, from the root of the library down to plain values.
///
///     Type MyFinder::define() {
///         return Type(typeId(), "Finds things.",
///                     properties(property<Float>::create("Threshold", "Least confidence.", false),
///                                propertyWithDefault<Int>::create("Limit", 10, "Most results.", false)),
///                     "", false);
///     }

namespace Fn::Deployment {

class Default;
class Property;

class TypeBody {
public:
    virtual ~TypeBody() = default;
    virtual const std::string& id() const = 0;
    virtual const std::string& doc() const = 0;
    virtual const std::list<Property>& properties() const = 0;
    virtual const std::string& defaultValue() const = 0;
    virtual const std::list<Default>& defaults() const = 0;
    virtual bool hasValue() const = 0;
};

/// Handle on the description of one kind of setting. Two types with the same id are the same type.
class Type {
public:
    /// The empty type: id "", no members, no value.
    Type();
    /// A leaf. @param defaultValue text of the value while none is stored
    Type(const std::string& id, const std::string& doc, const std::string& defaultValue, bool hasValue);
    /// @param properties the members, in their order
    /// @param hasValue whether a node has a value of its own; a plain record of members has none
    Type(const std::string& id, const std::string& doc, const std::list<Property>& properties,
         const std::string& defaultValue, bool hasValue);
    /// @param defaults values that this type imposes on members below it
    /// @throws FNEBadArg if a default does not lead to a member of its type
    Type(const std::string& id, const std::string& doc, const std::list<Property>& properties,
         const std::list<Default>& defaults, const std::string& defaultValue, bool hasValue);
    explicit Type(TypeBody* body) : body_(body) {}

    const std::string& id() const { return body_->id(); }
    const std::string& doc() const { return body_->doc(); }
    const std::list<Property>& properties() const { return body_->properties(); }
    const std::string& defaultValue() const { return body_->defaultValue(); }
    const std::list<Default>& defaults() const { return body_->defaults(); }
    bool hasValue() const { return body_->hasValue(); }

    bool operator==(const Type& other) const { return id() == other.id(); }

private:
    FNCountedPtr<TypeBody> body_;
};

/// The kind of a type: its id before the first "<", the whole id if it has none.
std::string idPrefix(const Type& type);

/// One member of a type: a named setting with its default and its description.
class Property {
public:
    class Body {
    public:
        virtual ~Body() = default;
        virtual const Type& type() const = 0;
        virtual const std::string& name() const = 0;
        virtual const std::string& doc() const = 0;
        /// Empty to leave the default to the type.
        virtual const std::string& defaultValue() const = 0;
        virtual bool readOnly() const = 0;
    };

    Property(const Type& type, const std::string& name, const std::string& defaultValue,
             const std::string& doc, bool readOnly);
    explicit Property(Body* body) : body_(body) {}

    const Type& type() const { return body_->type(); }
    const std::string& name() const { return body_->name(); }
    const std::string& doc() const { return body_->doc(); }
    const std::string& defaultValue() const { return body_->defaultValue(); }
    bool readOnly() const { return body_->readOnly(); }

private:
    FNCountedPtr<Body> body_;
};

/// A value that a type presets on a member somewhere below it.
class Default {
public:
    Default(const Type& type, const std::string& path, const std::string& value)
        : type_(type), path_(path), value_(value) {}

    const Type& type() const { return type_; }
    /// Dotted, relative to the type that holds the default.
    const std::string& path() const { return path_; }
    const std::string& value() const { return value_; }

private:
    Type type_;
    std::string path_;
    std::string value_;
};

/// The description of `T`, made by T::define() at first use; it lives to the end of the process.
template <class T> const Type& type() {
    static const Type& instance = *new Type(T::define());
    return instance;
}

/// Makes a member of the type of `T` with the type's own default.
template <class T> struct property {
    static Property create(const std::string& name, const std::string& doc, bool readOnly = false) {
        return Property(type<T>(), name, type<T>().defaultValue(), doc, readOnly);
    }
};

/// Makes a member of the type of `T` with a default of its own.
template <class T> struct propertyWithDefault {
    static Property create(const std::string& name, const auto& value, const std::string& doc,
                           bool readOnly = false) {
        return Property(type<T>(), name, T::valueToString(value), doc, readOnly);
    }
};

/// Makes a value that is imposed on the member at `path`.
template <class T> struct defaultValue {
    static Default create(const std::string& path, const auto& value) {
        return Default(type<T>(), path, T::valueToString(value));
    }
};

template <class... P> std::list<Property> properties(const P&... members) {
    return {members...};
}

/// The member of that name, null if there is none.
const Property* findProperty(const std::list<Property>& members, const std::string& name);

} // namespace Fn::Deployment

#pragma once

#include "fn/callback/functor.h"
#include "fn/deployment/type.h"

#include <list>
#include <map>
#include <string>

class AppConfigDB;

namespace Fn::Deployment {

/// A live node of the configuration tree, bound to a database: it knows its dotted path, its type, its value
/// and its default, and hands out the components below it. A class is made from a component and reads its
/// settings:
///
///     explicit MyFinder(const Component& component)
///         : threshold_(Value<Float>::get(component.subComponent("Threshold"))) {}
///
/// A node holds no value: it asks the database (or a hook) at each read.
class Component {
public:
    /// Values by names.
    using Variables = std::map<std::string, std::string>;

    class Body {
    public:
        virtual ~Body() = default;
        virtual Property ownType() const = 0;
        virtual std::string name() const = 0;
        virtual std::string readDefault() const = 0;
        virtual std::string read(bool expand) const = 0;
        virtual void reset() = 0;
        virtual bool isDefault() const = 0;
        virtual bool readOnly() const = 0;
        virtual void writeDefault(const std::string& text) = 0;
        virtual void write(const std::string& text) = 0;
        virtual Component subComponent(const std::string& name) const = 0;
        virtual void setReadHook(const Functor0Ret<std::string>& hook) = 0;
        virtual void removeReadHook() = 0;
        virtual void setWriteHook(const Functor1<std::string>& hook) = 0;
        virtual void removeWriteHook() = 0;
    };

    /// The root of a tree over `primary`; its name is the property's. If the root type has a property
    /// "Substitutions", its elements are the variables of the tree, each read once, here; a value may use
    /// those before it.
    /// @param secondary further source of defaults, may be null
    /// @param given variables that are there before those, which may use them
    /// @throws FNEBadFunCall if `primary` is null
    Component(const FNCountedPtr<AppConfigDB>& primary, const Property& root,
              const FNCountedPtr<AppConfigDB>& secondary = {}, const Variables& given = {});
    explicit Component(Body* body) : body_(body) {}

    /// The property that this node is made from.
    Property ownType() const { return body_->ownType(); }
    Type type() const { return ownType().type(); }
    /// Full dotted path.
    std::string name() const { return body_->name(); }
    std::string readDefault() const { return body_->readDefault(); }
    /// The value text. @param expand replaces "$" and the name of a variable by the variable's value
    std::string read(bool expand) const { return body_->read(expand); }
    /// Forgets the stored value. @throws FNEBadFunCall if it is read-only
    void reset() { body_->reset(); }
    /// Whether no value is stored and no read hook is set.
    bool isDefault() const { return body_->isDefault(); }
    bool readOnly() const { return body_->readOnly(); }
    /// Stores a default for this key in the database.
    void writeDefault(const std::string& text) { body_->writeDefault(text); }
    /// Stores a value. @throws FNEBadFunCall if it is read-only
    void write(const std::string& text) { body_->write(text); }

    /// The child of that name; a container takes any name. @throws FNEBadArg if the type has no such member
    Component subComponent(const std::string& name) const { return body_->subComponent(name); }
    /// The present children, in order: the named elements of a container, the chosen one of an alternative,
    /// one for each property otherwise.
    std::list<Component> subComponents() const;
    /// Takes over the value of `source` and of all below it. @throws FNEBadArg if the types differ
    void copy(const Component& source, bool expand);

    /// Hooks stand in for the stored value of this key at reading, and are told of each new one at writing. A
    /// hook that throws is reported as a warning, and the default stands.
    void setReadHook(const Functor0Ret<std::string>& hook) { body_->setReadHook(hook); }
    void removeReadHook() { body_->removeReadHook(); }
    void setWriteHook(const Functor1<std::string>& hook) { body_->setWriteHook(hook); }
    void removeWriteHook() { body_->removeWriteHook(); }

    const Body& body() const { return *body_; }

private:
    FNCountedPtr<Body> body_;
};

/// @throws FNESysError if the type of the node or property is not `type`; `operation` is for the message.
void typeCheck(const Component& component, const Type& type, const std::string& operation);
void typeCheck(const Property& property, const Type& type, const std::string& operation);

/// Typed access to the value of a node.
template <class T> struct Value {
    /// @throws FNESysError if the node is of another type; the conversion's exception for a wrong text
    static typename T::ValueType get(const Component& component) {
        typeCheck(component, Deployment::type<T>(), "get");
        return T::stringToValue(component.read(true));
    }
    static void set(Component component, const typename T::ValueType& value) {
        typeCheck(component, Deployment::type<T>(), "set");
        component.write(T::valueToString(value));
    }
};

} // namespace Fn::Deployment

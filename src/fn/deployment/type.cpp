#include "fn/deployment/type.h"

#include "fn/deployment/composite_values.h"
#include "fn/text_forms.h"

#include <algorithm>

namespace Fn::Deployment {
namespace {

class ApplicationTypeBody final : public TypeBody {
public:
    ApplicationTypeBody(const std::string& id, const std::string& doc, const std::string& defaultValue,
                        const std::list<Property>& properties, const std::list<Default>& defaults,
                        bool hasValue)
        : id_(id), doc_(doc), defaultValue_(defaultValue), properties_(properties), defaults_(defaults),
          hasValue_(hasValue) {}

    const std::string& id() const override { return id_; }
    const std::string& doc() const override { return doc_; }
    const std::list<Property>& properties() const override { return properties_; }
    const std::string& defaultValue() const override { return defaultValue_; }
    const std::list<Default>& defaults() const override { return defaults_; }
    bool hasValue() const override { return hasValue_; }

private:
    std::string id_;
    std::string doc_;
    std::string defaultValue_;
    std::list<Property> properties_;
    std::list<Default> defaults_;
    bool hasValue_;
};

class ApplicationPropertyBody final : public Property::Body {
public:
    ApplicationPropertyBody(const Type& type, const std::string& name, const std::string& defaultValue,
                            const std::string& doc, bool readOnly)
        : type_(type), name_(name), defaultValue_(defaultValue), doc_(doc), readOnly_(readOnly) {}

    const Type& type() const override { return type_; }
    const std::string& name() const override { return name_; }
    const std::string& doc() const override { return doc_; }
    const std::string& defaultValue() const override { return defaultValue_; }
    bool readOnly() const override { return readOnly_; }

private:
    Type type_;
    std::string name_;
    std::string defaultValue_;
    std::string doc_;
    bool readOnly_;
};

/// Follows the path of a default through the members of a type, and checks where it ends.
void validate(const Type& holder, const Default& imposed) {
    const std::string prefix = "Invalid default value specification. Type " + holder.id();
    Type reached = holder;
    for (const std::string& part : splitText(imposed.path(), '.')) {
        if (isContainer(reached)) {
            reached = containedType(reached);
            continue;
        }
        const Property* const member = findProperty(membersOf(reached), part);
        if (!member)
            FN_THROW(FNEBadArg, prefix + " does not have member " + imposed.path() +
                                    ", Lookup failed for member " + part);
        reached = member->type();
    }
    if (reached != imposed.type())
        FN_THROW(FNEBadArg, prefix + "'s member " + imposed.path() + " is not of type " +
                                imposed.type().id() + " but of type " + reached.id());
}

} // namespace

Type::Type() : Type("", "Empty Type.", "", false) {}

Type::Type(const std::string& id, const std::string& doc, const std::string& defaultValue, bool hasValue)
    : Type(id, doc, std::list<Property>(), defaultValue, hasValue) {}

Type::Type(const std::string& id, const std::string& doc, const std::list<Property>& properties,
           const std::string& defaultValue, bool hasValue)
    : Type(id, doc, properties, std::list<Default>(), defaultValue, hasValue) {}

Type::Type(const std::string& id, const std::string& doc, const std::list<Property>& properties,
           const std::list<Default>& defaults, const std::string& defaultValue, bool hasValue)
    : body_(new ApplicationTypeBody(id, doc, defaultValue, properties, defaults, hasValue)) {
    for (const Default& imposed : defaults) validate(*this, imposed);
}

std::string idPrefix(const Type& type) {
    return type.id().substr(0, type.id().find('<'));
}

Property::Property(const Type& type, const std::string& name, const std::string& defaultValue,
                   const std::string& doc, bool readOnly)
    : body_(new ApplicationPropertyBody(type, name, defaultValue, doc, readOnly)) {}

const Property* findProperty(const std::list<Property>& members, const std::string& name) {
    const auto member = std::find_if(members.begin(), members.end(),
                                     [&](const Property& candidate) { return candidate.name() == name; });
    return member == members.end() ? nullptr : &*member;
}

} // namespace Fn::Deployment

#pragma once

#include "fn/deployment/type.h"

#include <iosfwd>
#include <list>
#include <set>
#include <string>

namespace Fn::Deployment {

/// Documentation of a tree of types.
class TreeTools {
public:
    /// One node: its dotted path and the property that it is made from.
    struct PropertyItem {
        std::string path;
        Property property;
    };
    struct OrderedById {
        bool operator()(const Type& a, const Type& b) const { return a.id() < b.id(); }
    };
    using TypeSet = std::set<Type, OrderedById>;

    /// All properties below and with the given one, depth first, parents before children, members in their
    /// order. The members that only carry the type of a container's or an alternative's children show up as
    /// such.
    static std::list<PropertyItem> getProperties(const Property& property);
    /// All types that can be reached from one, itself included.
    static TypeSet getTypes(const Type& type);

    /// One path a line.
    static void printProperties(const std::list<PropertyItem>& items, std::ostream& stream);
    /// Three lines for each type: id, description, members.
    static void printTypes(const TypeSet& types, std::ostream& stream);
};

} // namespace Fn::Deployment

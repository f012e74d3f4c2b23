#include "fn/deployment/tree_tools.h"

#include <ostream>

namespace Fn::Deployment {

std::list<TreeTools::PropertyItem> TreeTools::getProperties(const Property& property) {
    std::list<PropertyItem> items;
    std::list<PropertyItem> stack{{property.name(), property}};
    while (!stack.empty()) {
        items.splice(items.end(), stack, stack.begin());
        const PropertyItem& parent = items.back();
        std::list<PropertyItem> members;
        for (const Property& member : parent.property.type().properties())
            members.push_back({parent.path + "." + member.name(), member});
        stack.splice(stack.begin(), members);
    }
    return items;
}

TreeTools::TypeSet TreeTools::getTypes(const Type& type) {
    TypeSet types;
    std::list<Type> open{type};
    while (!open.empty()) {
        const Type next = open.front();
        open.pop_front();
        if (!types.insert(next).second) continue;
        for (const Property& member : next.properties()) open.push_back(member.type());
    }
    return types;
}

void TreeTools::printProperties(const std::list<PropertyItem>& items, std::ostream& stream) {
    for (const PropertyItem& item : items) stream << item.path << "\n";
}

void TreeTools::printTypes(const TypeSet& types, std::ostream& stream) {
    for (const Type& type : types) {
        stream << type.id() << ": \n  " << type.doc() << "\n  [ ";
        for (const Property& member : type.properties())
            stream << "(" << member.type().id() << ", " << member.name() << ", " << member.defaultValue()
                   << ") ";
        stream << "]\n";
    }
}

} // namespace Fn::Deployment

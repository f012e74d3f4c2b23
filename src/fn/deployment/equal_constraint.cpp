#include "fn/deployment/equal_constraint.h"

#include "fn/deployment/composite_values.h"

#include <algorithm>

namespace Fn::Deployment {
namespace {

std::list<std::string> elementNames(const Component& container) {
    return ContainerBase::stringToValue(container.read(true));
}

std::string text(const Component& parent, const std::string& key) {
    return Value<String>::get(parent.subComponent(key));
}

} // namespace

Type EqualConstraint::ValuePair::define() {
    return Type(typeId(), "Source/target value pair.",
                properties(property<String>::create("SourceValue", "Source value to replace."),
                           property<String>::create("TargetValue", "Target value to be used.")),
                "", false);
}

Type EqualConstraint::ValueSubstitution::define() {
    return Type(
        typeId(), "Substitutions for values inside constraints.",
        properties(property<String>::create(
                       "SourceNameFilter",
                       "Filter the source name. The empty string matches all. Matching will be applied "
                       "backwards, thus 'foo.x' will match 'bar.foo.x' but not foo.x.bar."),
                   property<String>::create(
                       "TargetNameFilter",
                       "Filter the target name. The empty string matches all. If a dot precedes the name it "
                       "will be appended "
                       "to the target name, otherwise: apply substitution if target tail matches filter "
                       "head. The rest of "
                       "the filter string will be appended to the target name to form the new target. The "
                       "means: the filter "
                       "'foo.x' and the target 'bar.foo' will form the new target 'bar.foo.x'."),
                   property<Container<ValuePair>>::create(
                       "ValueMap", "Value mapping, values which do not exists will not be altered.")),
        "", false);
}

Type EqualConstraint::define() {
    return Type(
        typeId(),
        "This Constraint forces its members to be equal. If deep is true, Then a deep copy will be enforced "
        "otherwise "
        "only the first layer will be regarded. Values which are given with a preceeding '.' will use the "
        "parent name "
        "of this component to form the absolute path to the component to be constraint restricted. More dots "
        "will "
        "traverse the component tree further back to the root.",
        properties(
            property<Bool>::create("Deep", "Deep or shallow equality."),
            property<Enum<TargetDefaultEnum>>::create(
                "TargetOn", "Whether source component value should be enforced on default values of target "
                            "components (instead of values)."),
            property<Container<String>>::create("Substitutions",
                                                "Names which are to substitute with value of component. Each "
                                                "substitution which occurs forms a new constraint."),
            property<Container<ValueSubstitution>>::create(
                "ValueSubstitution",
                "Substitution of values to be applied if source and target filters match.")),
        "", true);
}

EqualConstraint::EqualConstraint(const Component& component) : component_(component) {
    typeCheck(component, type<EqualConstraint>(), "get");
}

bool EqualConstraint::deep() const {
    return Value<Bool>::get(component_.subComponent("Deep"));
}

bool EqualConstraint::targetDefaultValues() const {
    return Value<Enum<TargetDefaultEnum>>::get(component_.subComponent("TargetOn")) == "DefaultValues";
}

std::list<std::pair<std::string, std::string>> EqualConstraint::substitutions() const {
    const Component container = component_.subComponent("Substitutions");
    std::list<std::pair<std::string, std::string>> pairs;
    for (const std::string& name : elementNames(container)) pairs.emplace_back(name, text(container, name));
    return pairs;
}

std::list<EqualConstraint::ValueSubstitution> EqualConstraint::valueSubstitutions() const {
    const Component container = component_.subComponent("ValueSubstitution");
    std::list<ValueSubstitution> list;
    for (const std::string& name : elementNames(container)) {
        const Component element = container.subComponent(name);
        ValueSubstitution substitution{
            text(element, "SourceNameFilter"), text(element, "TargetNameFilter"), {}};
        const Component map = element.subComponent("ValueMap");
        for (const std::string& pairName : elementNames(map)) {
            const Component pair = map.subComponent(pairName);
            substitution.valueMap.emplace(text(pair, "SourceValue"), text(pair, "TargetValue"));
        }
        list.push_back(substitution);
    }
    return list;
}

std::list<std::string> EqualConstraint::names() const {
    std::list<std::string> names;
    for (const std::string& element : elementNames(component_)) names.push_back(absoluteName(element));
    return names;
}

std::string EqualConstraint::absoluteName(const std::string& element) const {
    const std::size_t dots = std::min(element.find_first_not_of('.'), element.size());
    if (dots == 0) return element;
    std::string parent = constraintName();
    for (std::size_t step = 0; step < dots; ++step) {
        const std::size_t dot = parent.rfind('.');
        if (dot == std::string::npos)
            FN_THROW(FNEBadArg,
                     "EqualConstraint::names(): backsteps in constraint value exceeds available parent "
                     "path. constraint: " +
                         constraintName() + ", ill formed value:" + element);
        parent.resize(dot);
    }
    return parent + "." + element.substr(dots);
}

bool isConstraint(const Component& component) {
    return component.type() == type<EqualConstraint>();
}

} // namespace Fn::Deployment

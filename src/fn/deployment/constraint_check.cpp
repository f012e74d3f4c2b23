#include "fn/deployment/constraint_check.h"

#include "fn/deployment/composite_values.h"
#include "fn/text_forms.h"

#include <algorithm>
#include <ostream>

namespace Fn::Deployment {
namespace {

/// Whether `name` is `above` or lies below it.
bool isAtOrBelow(const std::string& name, const std::string& above) {
    return name == above || name.starts_with(above + ".");
}

std::string lastPart(const std::string& name) {
    return name.substr(name.rfind('.') + 1);
}

/// The target that a substitution leads to. @return false if it does not apply
bool applyToTarget(const EqualConstraint::ValueSubstitution& substitution, const std::string& target,
                   const std::string& sourceValue, std::string& newTarget, std::string& newValue) {
    const auto mapped = substitution.valueMap.find(sourceValue);
    newValue = mapped == substitution.valueMap.end() ? sourceValue : mapped->second;

    const std::string& filter = substitution.targetNameFilter;
    newTarget = target;
    if (filter.empty()) return true;
    if (filter.front() == '.') {
        newTarget += filter;
        return true;
    }
    for (std::size_t at = 0; at < target.size(); ++at) {
        const std::size_t tail = target.size() - at;
        if (tail > filter.size() || target.compare(at, tail, filter, 0, tail) != 0) continue;
        newTarget += filter.substr(tail);
        return true;
    }
    return false;
}

} // namespace

void ConstraintCheck::print(std::ostream& stream) const {
    stream << "Constraint " << name() << ":\n";
    for (const Violation& violation : violations_) {
        stream << "- " << violation.target;
        switch (violation.kind) {
        case Violation::doesNotExist:
            stream << " does not exist";
            break;
        case Violation::otherType:
            stream << " has another type as source " << violation.source;
            break;
        case Violation::otherValue:
            stream << " has to have value of " << violation.source;
            break;
        }
        stream << "\n";
    }
}

EqualConstraintCheck::EqualConstraintCheck(const Component& component, Configurator& configurator,
                                           const Functor1<std::string>& beforeWrite)
    : ConstraintCheck(component.name()), EqualConstraint(component), configurator_(configurator),
      beforeWrite_(beforeWrite) {}

bool EqualConstraintCheck::isNamePartOfConstraint(const std::string& name) const {
    if (name == constraintName()) return true;
    for (const Names& list : substitute(names()))
        for (const std::string& member : expandVariables(list))
            if (isAtOrBelow(name, member) || isAtOrBelow(member, name)) return true;
    return false;
}

bool EqualConstraintCheck::solve(const std::string& sourceName, const std::string& changedName) {
    for (const Names& list : substitute(names())) {
        Members members;
        for (const std::string& name : expandVariables(list)) {
            configurator_.property(name); // fails if there can be no such node
            if (!sourceName.empty() && isAtOrBelow(name, sourceName))
                members.push_front({name, false});
            else
                members.push_back({name, false});
        }
        if (deep())
            deepEquality(members, changedName);
        else
            shallowEquality(members, changedName);
    }
    return !violations().empty();
}

/// The words that a node stands for in names.
EqualConstraintCheck::Names EqualConstraintCheck::valueList(const std::string& name) const {
    const Type type = typeOf(name);
    const std::string kind = idPrefix(type);
    const std::string value = configurator_.value(name, false);
    if (kind == "Container" || kind == "String") return ContainerBase::stringToValue(value);
    if (kind == "Enum") return {EnumBase::stringToValue(value, EnumBase::enumeration(type.id()))};
    if (kind == "Alternative") return {AlternativeBase::stringToValue(value, type)};
    return {};
}

/// One list of names for each constraint to solve.
std::list<EqualConstraintCheck::Names> EqualConstraintCheck::substitute(const Names& names) const {
    std::list<Names> working{names};
    for (const auto& [key, node] : substitutions()) {
        if (node.empty()) continue;
        const Names replacements = valueList(node);
        std::list<Names> next;
        for (const std::string& replacement : replacements)
            for (Names list : working) {
                for (std::string& name : list) replaceAll(name, key, replacement);
                next.push_back(list);
            }
        if (replacements.empty())
            for (Names list : working) {
                list.remove_if([&, &word = key](const std::string& name) {
                    return name.find(word) != std::string::npos;
                });
                if (!list.empty()) next.push_back(list);
            }
        working = next;
    }
    return working;
}

/// All names that "...${path}..." stands for.
EqualConstraintCheck::Names EqualConstraintCheck::expandVariable(const std::string& name) const {
    Names results{""};
    const auto append = [&](const Names& choices) {
        Names longer;
        for (const std::string& result : results)
            for (const std::string& choice : choices) longer.push_back(result + choice);
        results = longer;
    };
    std::size_t position = 0;
    for (std::size_t open; (open = name.find("${", position)) != std::string::npos;) {
        const std::size_t close = name.find('}', open);
        if (close == std::string::npos)
            FN_THROW(FNEBadArg,
                     "ConfiguratorMachine::expandVariable: have not found matching '}' in '" + name + "'.");
        Names choices = valueList(name.substr(open + 2, close - open - 2));
        for (std::string& choice : choices) choice = name.substr(position, open - position) + choice;
        append(choices);
        position = close + 1;
    }
    if (position == 0) return {name};
    std::string tail = name.substr(position);
    replaceAll(tail, "}", "");
    append({tail});
    return results;
}

EqualConstraintCheck::Names EqualConstraintCheck::expandVariables(const Names& names) const {
    Names expanded;
    for (const std::string& name : names) expanded.splice(expanded.end(), expandVariable(name));
    return expanded;
}

void EqualConstraintCheck::shallowEquality(const Members& members, const std::string& changedName) {
    if (members.empty()) return;
    const std::string& source = members.front().name;
    std::list<ValueSubstitution> applicable;
    if (typeOf(source).hasValue()) {
        applicable = valueSubstitutions();
        applicable.remove_if(
            [&](const ValueSubstitution& s) { return !source.ends_with(s.sourceNameFilter); });
    }
    for (auto target = std::next(members.begin()); target != members.end(); ++target)
        if (!target->missing) equalize(source, target->name, changedName, applicable);
}

void EqualConstraintCheck::equalize(const std::string& source, const std::string& target,
                                    const std::string& changedName,
                                    const std::list<ValueSubstitution>& applicable) {
    const Type sourceType = typeOf(source);
    const bool targetHasValue = typeOf(target).hasValue();
    if (!sourceType.hasValue()) {
        if (targetHasValue) addViolation(source, target, Violation::otherType);
        return;
    }
    const std::string sourceValue = configurator_.value(source, false);
    for (const ValueSubstitution& substitution : applicable) {
        std::string newTarget, newValue;
        if (!applyToTarget(substitution, target, sourceValue, newTarget, newValue) ||
            !configurator_.componentExists(newTarget))
            continue;
        if (typeOf(newTarget).hasValue())
            setValue(newTarget, newValue, changedName, source);
        else
            addViolation(source, newTarget, Violation::otherType);
    }
    if (!applicable.empty()) return;

    const std::string kind = idPrefix(sourceType);
    const bool sameKind = sourceType == typeOf(target) || (kind == idPrefix(typeOf(target)) && !kind.empty());
    if (targetHasValue && sameKind)
        setValue(target, sourceValue, changedName, source);
    else
        addViolation(source, target, Violation::otherType);
}

void EqualConstraintCheck::setValue(const std::string& target, const std::string& value,
                                    const std::string& changedName, const std::string& source) {
    const bool onDefaults = targetDefaultValues();
    if ((onDefaults ? configurator_.defaultValue(target) : configurator_.value(target, false)) == value)
        return;
    beforeWrite_(target);
    if (onDefaults)
        configurator_.setDefaultValue(target, value);
    else
        configurator_.setValue(target, value);
    if (target == changedName) addViolation(source, target, Violation::otherValue);
}

void EqualConstraintCheck::deepEquality(const Members& members, const std::string& changedName) {
    std::list<Members> levels{members};
    for (; !levels.empty(); levels.pop_front()) {
        const Members& level = levels.front();
        if (level.empty()) continue;
        shallowEquality(level, changedName);
        for (const std::string& child : configurator_.subComponents(level.front().name))
            levels.push_back(childrenNamed(lastPart(child), child, level));
    }
}

/// The children of one name below each member; the source is the one that has it for certain.
EqualConstraintCheck::Members EqualConstraintCheck::childrenNamed(const std::string& childName,
                                                                  const std::string& sourceChild,
                                                                  const Members& members) {
    Members children{{sourceChild, false}};
    for (auto member = std::next(members.begin()); member != members.end(); ++member) {
        const std::string name = member->name + "." + childName;
        const Names present = member->missing ? Names() : configurator_.subComponents(member->name);
        const bool missing = std::find(present.begin(), present.end(), name) == present.end();
        if (missing) addViolation(members.front().name, name, Violation::doesNotExist);
        children.push_back({name, missing});
    }
    return children;
}

} // namespace Fn::Deployment

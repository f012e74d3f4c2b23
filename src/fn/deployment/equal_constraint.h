#pragma once

#include "fn/deployment/component.h"

#include <list>
#include <map>
#include <string>
#include <utility>

namespace Fn::Deployment {

/// The declaration that some nodes have equal values. Its value names its members; a name with n leading dots
/// is relative: in A.B.C, ".x" is A.B.x and "..x" is A.x.
class EqualConstraint {
public:
    /// How values are changed on their way from the source to a target.
    struct ValueSubstitution {
        std::string sourceNameFilter; ///< a suffix of the source's name, empty for every source
        std::string targetNameFilter; ///< see applyToTarget of the check
        std::map<std::string, std::string> valueMap;

        static std::string typeId() { return "EqualConstraint::ValueSubstitution"; }
        static Type define();
    };
    struct ValuePair {
        static std::string typeId() { return "EqualConstraint::ValuePair"; }
        static Type define();
    };
    struct TargetDefaultEnum {
        static std::list<std::string> enumeration() { return {"Values", "DefaultValues"}; }
    };

    static std::string typeId() { return "EqualConstraint"; }
    static Type define();

    /// @throws FNESysError if the node is no equal constraint
    explicit EqualConstraint(const Component& component);

    std::string constraintName() const { return component_.name(); }
    bool deep() const;
    /// Whether the defaults of the targets are forced, and not their values.
    bool targetDefaultValues() const;
    /// Words in the members' names, and the node whose words take their place.
    std::list<std::pair<std::string, std::string>> substitutions() const;
    std::list<ValueSubstitution> valueSubstitutions() const;
    /// Absolute names of the members. @throws FNEBadArg if a relative one leads above the root
    std::list<std::string> names() const;

private:
    std::string absoluteName(const std::string& element) const;

    Component component_;
};

/// Whether the node declares a constraint.
bool isConstraint(const Component& component);

} // namespace Fn::Deployment

#pragma once

#include "fn/callback/functor.h"
#include "fn/deployment/configurator.h"
#include "fn/deployment/equal_constraint.h"

#include <iosfwd>
#include <list>
#include <string>

namespace Fn::Deployment {

/// Enforces one constraint, and remembers where that failed.
class ConstraintCheck {
public:
    struct Violation {
        enum Kind { doesNotExist = 0, otherType = 1, otherValue = 2 };
        std::string source;
        std::string target;
        int kind;
    };

    explicit ConstraintCheck(const std::string& name) : name_(name) {}
    virtual ~ConstraintCheck() = default;
    /// Full name of the node that declares the constraint.
    virtual std::string name() const { return name_; }
    /// Whether a change of that node can concern the constraint.
    virtual bool isNamePartOfConstraint(const std::string&) const { return false; }
    /// Makes the constraint hold. @param sourceName the node whose value decides, empty for the first member
    /// @param changedName the node whose change is the occasion @return whether there are violations
    virtual bool solve(const std::string& sourceName, const std::string& changedName) {
        (void)sourceName, (void)changedName;
        return false;
    }

    const std::list<Violation>& violations() const { return violations_; }
    void clearViolations() { violations_.clear(); }
    /// A line for the constraint, and one for each violation.
    void print(std::ostream& stream) const;

protected:
    void addViolation(const std::string& source, const std::string& target, Violation::Kind kind) {
        violations_.push_back({source, target, kind});
    }

private:
    std::string name_;
    std::list<Violation> violations_;
};

/// Keeps the members of an EqualConstraint equal: the first member is the source of the values.
class EqualConstraintCheck final : public ConstraintCheck, private EqualConstraint {
public:
    /// @param beforeWrite told the name of each node that is about to be changed
    EqualConstraintCheck(const Component& component, Configurator& configurator,
                         const Functor1<std::string>& beforeWrite);

    bool isNamePartOfConstraint(const std::string& name) const override;
    bool solve(const std::string& sourceName, const std::string& changedName) override;

private:
    using Names = std::list<std::string>;
    /// A member, or the place of one that is missing below a member of a deep constraint.
    struct Member {
        std::string name;
        bool missing;
    };
    using Members = std::list<Member>;

    std::list<Names> substitute(const Names& names) const;
    Names valueList(const std::string& name) const;
    Names expandVariable(const std::string& name) const;
    Names expandVariables(const Names& names) const;
    void shallowEquality(const Members& members, const std::string& changedName);
    void deepEquality(const Members& members, const std::string& changedName);
    Members childrenNamed(const std::string& lastPart, const std::string& sourceChild,
                          const Members& members);
    void equalize(const std::string& source, const std::string& target, const std::string& changedName,
                  const std::list<ValueSubstitution>& applicable);
    void setValue(const std::string& target, const std::string& value, const std::string& changedName,
                  const std::string& source);
    Type typeOf(const std::string& name) const { return configurator_.property(name).type(); }

    Configurator& configurator_;
    Functor1<std::string> beforeWrite_;
};

} // namespace Fn::Deployment

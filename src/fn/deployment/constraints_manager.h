#pragma once

#include "fn/callback/observable.h"
#include "fn/deployment/configurator_machine.h"
#include "fn/deployment/constraint_check.h"
#include "fn/thread/mutex.h"

#include <list>
#include <set>
#include <string>

namespace Fn::Deployment {

/// Finds the constraints in the trees of a configurator, and solves them again after every change. Its
/// observers are told of violations, as text.
///
/// Failures of solving reach whoever made the change; values that were written by then stay.
class ConstraintsManager final : public FNObservableBody1<std::string> {
public:
    /// Subscribes to the configurator, which must outlive this.
    explicit ConstraintsManager(ConfiguratorMachine& configurator);
    ~ConstraintsManager() override;

    /// Takes up each constraint in the tree of that root.
    void addConstraints(const std::string& rootName);
    /// Drops each constraint at and below the node.
    void removeConstraints(const Component& component);
    /// Solves all constraints on the occasion of a change.
    /// @throws FNEBadArg if changes lead to changes without end
    void checkComponent(const std::string& name);
    void checkAllConstraints() { checkComponent(""); }
    /// The next change of that node is the manager's own, and starts no pass.
    void solveObserver(const std::string& name);

private:
    using Check = FNCountedPtr<ConstraintCheck>;

    Check makeCheck(const Component& component);
    void drop(const std::string& name);
    void solveAll(const std::list<Check>& checks, const std::string& changedName);
    void report();

    static constexpr int recursionLimit = 5;

    FNMutex mutex_{FNMutex::recursive};
    std::list<Check> checks_;
    std::list<Check> violated_;
    std::set<std::string> skipOnce_;
    int recursionDepth_ = 0;
    ConfiguratorMachine& configurator_;
    std::string addedId_, removedId_, changedId_;
};

} // namespace Fn::Deployment

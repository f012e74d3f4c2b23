#include "fn/deployment/constraints_manager.h"

#include "fn/deployment/configurator_component.h"

#include <algorithm>
#include <sstream>

namespace Fn::Deployment {
namespace {

/// Calls on behalf of a change: a failure goes to whoever made it.
template <class Call> void forwardFailure(const Call& call) {
    try {
        call();
    } catch (const std::exception&) {
        throw ObserverFailure{std::current_exception()};
    }
}

template <class Visit> void walkConstraints(const Component& component, const Visit& visit) {
    if (isConstraint(component)) visit(component);
    for (const Component& child : component.subComponents()) walkConstraints(child, visit);
}

} // namespace

ConstraintsManager::ConstraintsManager(ConfiguratorMachine& configurator) : configurator_(configurator) {
    addedId_ = configurator_.rootComponentAddedEvent()->addObserver(
        [this](const std::string& name) { forwardFailure([&] { addConstraints(name); }); });
    removedId_ = configurator_.rootComponentRemovedEvent()->addObserver(
        [this](const Component& component) { forwardFailure([&] { removeConstraints(component); }); });
    changedId_ = configurator_.componentChangedEvent()->addObserver(
        [this](const std::string& name, const bool&) { forwardFailure([&] { checkComponent(name); }); });
}

ConstraintsManager::~ConstraintsManager() {
    configurator_.rootComponentAddedEvent()->removeObserver(addedId_);
    configurator_.rootComponentRemovedEvent()->removeObserver(removedId_);
    configurator_.componentChangedEvent()->removeObserver(changedId_);
}

ConstraintsManager::Check ConstraintsManager::makeCheck(const Component& component) {
    if (component.type() == type<EqualConstraint>())
        return Check(new EqualConstraintCheck(
            component, configurator_,
            Functor1<std::string>::callee(*this, &ConstraintsManager::solveObserver)));
    FN_THROW(FNEBadArg, "Constraint check for type " + component.type().id() + " is not implemented.");
}

void ConstraintsManager::drop(const std::string& name) {
    const FNMutexLock lock(mutex_);
    for (std::list<Check>* const list : {&checks_, &violated_})
        list->remove_if([&](const Check& check) { return check->name() == name; });
}

void ConstraintsManager::addConstraints(const std::string& rootName) {
    walkConstraints(Component(new ConfiguratorComponent(configurator_, rootName)),
                    [&](const Component& node) {
                        const Check check = makeCheck(node);
                        drop(node.name());
                        const FNMutexLock lock(mutex_);
                        checks_.push_back(check);
                    });
}

void ConstraintsManager::removeConstraints(const Component& component) {
    walkConstraints(component, [&](const Component& node) { drop(node.name()); });
}

void ConstraintsManager::solveObserver(const std::string& name) {
    const FNMutexLock lock(mutex_);
    skipOnce_.insert(name);
}

void ConstraintsManager::checkComponent(const std::string& name) {
    FNMutexLock lock(mutex_);
    if (skipOnce_.erase(name) != 0) return;
    const std::list<Check> checks = checks_;
    if (++recursionDepth_ > recursionLimit) {
        recursionDepth_ = 0;
        FN_THROW(FNEBadArg, "ConstraintsManager: recursion level exceeds the limit of " +
                                std::to_string(recursionLimit) + " !\nConstraint solving aborted.");
    }
    lock.release();
    try {
        solveAll(checks, name);
    } catch (...) {
        mutex_.lock(lock);
        recursionDepth_ = std::max(recursionDepth_ - 1, 0);
        throw;
    }
    report();
}

void ConstraintsManager::solveAll(const std::list<Check>& checks, const std::string& changedName) {
    for (const Check& check : checks) {
        if (!check->solve("", changedName)) continue;
        const FNMutexLock lock(mutex_);
        if (std::find(violated_.begin(), violated_.end(), check) == violated_.end())
            violated_.push_back(check);
    }
}

/// Leaves a pass; the outermost one tells of the violations of all.
void ConstraintsManager::report() {
    std::ostringstream text;
    {
        const FNMutexLock lock(mutex_);
        if (--recursionDepth_ != 0 || violated_.empty()) return;
        for (const Check& check : violated_) {
            check->print(text);
            text << "\n";
            check->clearViolations();
        }
        violated_.clear();
    }
    broadcast(text.str());
}

} // namespace Fn::Deployment

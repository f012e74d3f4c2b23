#pragma once

#include "fn/callback/functor.h"
#include "fn/thread/mutex.h"

#include <list>
#include <map>
#include <string>

/// A set of named members that are called together, in ascending order of their names.
///
/// A call works on a copy of the set and holds no lock: a member may add and remove members, which takes
/// effect from the next call. A member that throws a std::exception loses its place after the call; the
/// others are called all the same. Any other exception leaves the call at once.
template <class F> class FNComposite {
public:
    using ErrorFunctor = Fn::Functor2<std::string, std::exception>;

    /// @param error told the name and the exception of a member that threw.
    explicit FNComposite(const ErrorFunctor& error = {}) : mutex_(FNMutex::recursive), error_(error) {}

    /// @throws FNEBadArg if the name is taken.
    void add(const std::string& name, const F& member) {
        const FNMutexLock lock(mutex_);
        if (!members_.emplace(name, member).second)
            FN_THROW(FNEBadArg, "FNComposite: there already exists an object named " + name);
    }

    /// Does nothing if there is no such name.
    void remove(const std::string& name) {
        const FNMutexLock lock(mutex_);
        members_.erase(name);
    }

    std::size_t size() const {
        const FNMutexLock lock(mutex_);
        return members_.size();
    }

    /// Calls `call(member)` for each member.
    template <class Call> void forEach(Call call) {
        std::list<std::string> failed;
        for (const auto& [name, member] : copyOfMembers()) {
            try {
                call(member);
            } catch (const std::exception& e) {
                error_(name, e);
                failed.push_back(name);
            }
        }
        for (const std::string& name : failed) remove(name);
    }

private:
    std::map<std::string, F> copyOfMembers() const {
        const FNMutexLock lock(mutex_);
        return members_;
    }

    FNMutex mutex_;
    std::map<std::string, F> members_;
    ErrorFunctor error_;
};

#pragma once

#include "cmp/face/face.h"
#include "cmp/life_checker.h"
#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"

namespace Kx::Implementation {

/// The settings "KxRecognitionLifeCheck...": keys of their own beside the tree, which all operations share.
std::list<Fn::Deployment::Property> lifeCheckSettings();

/// With the settings "KxRecognitionLifeCheck..." of a database, and the checker's own for those that it does
/// not have. @throws FNEGeneric for a text that is no number; FNEBadArg as the checker
FNCountedPtr<Cmp::LifeChecker> createLifeChecker(const AppConfigDB& db);

/// Whether an operation checks that its faces are alive.
Fn::Deployment::Property useLifeCheck(const std::string& doc);
/// The checker of an operation with that setting, from the database of its tree; null if it is not to check.
FNCountedPtr<Cmp::LifeChecker> configuredLifeChecker(const Fn::Deployment::Component& operation);

/// The faces of one call, all of one person.
class LifeChecker {
public:
    /// @param checker may be null
    explicit LifeChecker(const FNCountedPtr<Cmp::LifeChecker>& checker) : checker_(checker) {}

    void addFace(const Cmp::Face& face) { faces_.push_back(face); }
    /// Whether one of the faces has moved in depth against the first one.
    /// @throws FNEBadFunCall for a face without both eyes
    bool isAlive();

private:
    bool differsFromFirst(const Cmp::Face& face) const;

    FNCountedPtr<Cmp::LifeChecker> checker_;
    std::list<Cmp::Face> faces_; ///< without those that have been compared with the first one in vain
    bool alive_ = false;
};

} // namespace Kx::Implementation

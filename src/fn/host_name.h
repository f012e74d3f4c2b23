#pragma once

#include "fn/cptr.h"

#include <string>

/// Where the host's canonical name comes from.
class FNCanonicalHostNameResources {
public:
    virtual ~FNCanonicalHostNameResources() = default;
    virtual std::string canonicalHostName() const = 0;
};

/// Asks the resolver for the official name of this host; its plain name if the resolver does not know it.
class FNTcpIpHostNameResources final : public FNCanonicalHostNameResources {
public:
    std::string canonicalHostName() const override;
};

/// The canonical name of this host. The first call of the process decides on the resources (null for
/// FNTcpIpHostNameResources), later calls use what it stored.
std::string FNCannonicalHostName(const FNCountedPtr<FNCanonicalHostNameResources>& resources = {});

#include "fn/host_name.h"

#include <memory>
#include <mutex>

#include <netdb.h>
#include <unistd.h>

std::string FNTcpIpHostNameResources::canonicalHostName() const {
    char name[256] = {};
    if (gethostname(name, sizeof name - 1) != 0) FN_THROW(FNESysError, "gethostname failed");

    addrinfo hints{};
    hints.ai_flags = AI_CANONNAME;
    addrinfo* found = nullptr;
    if (getaddrinfo(name, nullptr, &hints, &found) != 0) return name;
    const std::unique_ptr<addrinfo, decltype(&freeaddrinfo)> owner(found, &freeaddrinfo);
    return found->ai_canonname ? found->ai_canonname : name;
}

std::string FNCannonicalHostName(const FNCountedPtr<FNCanonicalHostNameResources>& resources) {
    static std::mutex mutex;
    static FNCountedPtr<FNCanonicalHostNameResources> stored;
    const std::lock_guard lock(mutex);
    if (!stored) {
        stored = resources;
        if (!stored) stored = FNCountedPtr<FNCanonicalHostNameResources>(new FNTcpIpHostNameResources);
    }
    return stored->canonicalHostName();
}

#include "fn/callback/unique_id.h"

#include "fn/exception.h"
#include "fn/host_name.h"

#include <algorithm>
#include <cstdint>
#include <ctime>
#include <limits>
#include <mutex>

#include <unistd.h>

namespace Fn {
namespace {

std::string base36(std::uint64_t value) {
    constexpr const char* digits = "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZ";
    std::string text;
    do {
        text += digits[value % 36];
        value /= 36;
    } while (value != 0);
    std::reverse(text.begin(), text.end());
    return text;
}

std::mutex counterMutex;
std::uint32_t counter = 0;
std::time_t lastReset = 0;

} // namespace

std::string UniqueId::Generator::generate() const {
    std::string id;
    if (scope_.kind() == Scope::NetworkWide)
        id += (scope_.hostPrefix().empty() ? FNCannonicalHostName() : scope_.hostPrefix()) + "-";
    if (scope_.kind() != Scope::ProcessWide) id += base36(static_cast<std::uint64_t>(getpid())) + "-";

    const std::lock_guard lock(counterMutex);
    if (counter == std::numeric_limits<std::uint32_t>::max())
        FN_THROW(FNEOutOfRange, "Overflow on creating unique id");
    const std::time_t now = std::time(nullptr);
    if (now > lastReset) {
        counter = 0;
        lastReset = now;
    }
    // With a clock that was set back the stored time goes on, so that no pair of time and counter comes
    // twice.
    return id + base36(static_cast<std::uint64_t>(lastReset)) + base36(counter++);
}

} // namespace Fn

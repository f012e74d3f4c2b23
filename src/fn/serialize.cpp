#include "fn/serialize.h"

#include <algorithm>

namespace Fn {

Package Serializer<std::string>::pack(const std::string& text) {
    Package::Core core(text.size() + 1);
    std::copy_n(text.c_str(), text.size() + 1, core.getExclusive());
    return Package(std::list<Package::Core>{core});
}

std::string Serializer<std::string>::unpack(const Package& package) {
    const auto& cores = package.cores();
    if (cores.size() != 1 || std::find(cores.front().begin(), cores.front().end(), 0) == cores.front().end())
        FN_THROW(FNEBadArg, "converting to std::string from invalid package");
    return reinterpret_cast<const char*>(cores.front().data());
}

Package PackageReader::take() {
    if (atEnd()) FN_THROW(FNEBadArg, "package has fewer elements than expected");
    const Package element = elements_.front();
    elements_.pop_front();
    return element;
}

void PackageReader::expectEnd() const {
    if (!atEnd()) FN_THROW(FNEBadArg, "package has more elements than expected");
}

} // namespace Fn

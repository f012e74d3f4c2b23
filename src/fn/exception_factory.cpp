#include "fn/exception_factory.h"

#include "fn/serialize.h"

#include <mutex>
#include <set>

namespace Fn {
namespace {

class PlainException final : public std::exception {
public:
    explicit PlainException(const std::string& message) : message_(message) {}
    const char* what() const noexcept override { return message_.c_str(); }

private:
    std::string message_;
};

/// Exceptions keep their file as a pointer, so the names of files on the other side live here to the end of
/// the process. A peer that invents names without end gets null (printed as "nofile") once the table is full.
const char* lastingFileName(const std::string& file) {
    constexpr std::size_t mostNames = 4096;
    constexpr std::size_t longestName = 255;
    static std::mutex mutex;
    static std::set<std::string>& names = *new std::set<std::string>; // outlives exceptions in flight at exit
    if (file.empty() || file.size() > longestName) return nullptr;
    const std::lock_guard lock(mutex);
    const auto known = names.find(file);
    if (known != names.end()) return known->c_str();
    return names.size() < mostNames ? names.insert(file).first->c_str() : nullptr;
}

template <class E> std::pair<std::string, void (*)(const char*, const char*, int)> thrower() {
    return {E::thisTypeId,
            [](const char* message, const char* file, int line) { raise<E>(message, file, line); }};
}

} // namespace

ExceptionFactory::ExceptionFactory()
    : throwers_{thrower<FNEIOError>(), thrower<FNEBadFormat>(), thrower<FNESysError>(),
                thrower<FNETimeOut>(), thrower<FNEGeneric>(),   thrower<FNEOutOfRange>(),
                thrower<FNEBadArg>(),  thrower<FNEBadFunCall>()} {}

Package ExceptionFactory::serialize(const std::string& message, const std::string& type,
                                    const std::string& file, int line) const {
    std::list<Package> elements{Fn::serialize<std::string>(message)};
    if (!type.empty()) {
        elements.push_back(Fn::serialize<std::string>(type));
        if (!file.empty()) {
            elements.push_back(Fn::serialize<std::string>(file));
            elements.push_back(Package(line));
        }
    }
    return Package(elements);
}

Package ExceptionFactory::serialize(const FNException& exception) const {
    return serialize(exception.what(), exception.typeId() ? exception.typeId() : "", exception.file(),
                     exception.line());
}

Package ExceptionFactory::serialize(const std::exception& exception) const {
    return serialize(exception.what(), "", "", 0);
}

void ExceptionFactory::throwException(const Package& package) const {
    PackageReader reader(package);
    const auto message = reader.next<std::string>();
    std::string type, file;
    int line = 0;
    if (!reader.atEnd()) type = reader.next<std::string>();
    if (!reader.atEnd()) {
        file = reader.next<std::string>();
        line = reader.next<int>();
    }
    throwException(message, type, file, line);
}

void ExceptionFactory::throwException(const std::string& message, const std::string& type,
                                      const std::string& file, int line) const {
    if (type.empty()) throw PlainException(message);
    const char* const lastingFile = lastingFileName(file);
    const auto known = throwers_.find(type);
    if (known != throwers_.end()) known->second(message.c_str(), lastingFile, line);
    raise<FNEGeneric>("[" + type + "] " + message, lastingFile, line);
}

} // namespace Fn

#pragma once

#include "fn/package.h"

#include <map>
#include <string>

namespace Fn {

/// Carries exceptions across a process boundary: one side packs what it caught, the other throws it again.
class ExceptionFactory {
public:
    ExceptionFactory();

    /// A list of the message; then of `type` if it is not empty; then of `file` and `line` if neither text is
    /// empty.
    Package serialize(const std::string& message, const std::string& type, const std::string& file,
                      int line) const;
    Package serialize(const FNException& exception) const;
    Package serialize(const std::exception& exception) const;

    /// Throws what was packed. @throws FNEBadArg if the package holds no exception.
    [[noreturn]] void throwException(const Package& package) const;
    /// Throws the class named by `type`; a std::exception for an empty type; an FNEGeneric with the text
    /// "[<type>] <message>" for an unknown one.
    [[noreturn]] void throwException(const std::string& message, const std::string& type,
                                     const std::string& file, int line) const;

private:
    using Thrower = void (*)(const char* message, const char* file, int line);

    std::map<std::string, Thrower> throwers_;
};

} // namespace Fn

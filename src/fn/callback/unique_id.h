#pragma once

#include <string>

namespace Fn {

/// A text that names one thing within a scope.
class UniqueId {
public:
    /// How far an id is unique.
    class Scope {
    public:
        enum Kind { NetworkWide, HostWide, ProcessWide };
        /// Names of the kinds, in the order of their values.
        static constexpr const char* kindNames[] = {"NetworkWide", "HostWide", "ProcessWide"};

        /// @param hostPrefix stands for the canonical host name in network-wide ids, if it is not empty.
        explicit Scope(Kind kind = NetworkWide, const std::string& hostPrefix = {})
            : kind_(kind), hostPrefix_(hostPrefix) {}

        Kind kind() const noexcept { return kind_; }
        const std::string& hostPrefix() const noexcept { return hostPrefix_; }

    private:
        Kind kind_;
        std::string hostPrefix_;
    };

    /// Makes the ids of a scope. All generators of a process share one counter.
    class Generator {
    public:
        explicit Generator(const Scope& scope) : scope_(scope) {}
        /// [<host>-][<process>-]<seconds><counter>, numbers in base 36.
        /// @throws FNEOutOfRange if the counter is used up.
        std::string generate() const;

    private:
        Scope scope_;
    };

    /// A new id, unique in the process unless told otherwise.
    explicit UniqueId(const Scope& scope = Scope(Scope::ProcessWide)) : text_(Generator(scope).generate()) {}

    const std::string& text() const noexcept { return text_; }
    auto operator<=>(const UniqueId&) const = default;

private:
    std::string text_;
};

} // namespace Fn

#pragma once

#include "fn/cptr.h"

#include <string>

namespace Fn {

/// Handle on a shared library, which stays loaded as long as there is one.
class Dll {
public:
    /// No library.
    Dll() = default;
    /// @throws FNESysError "Cannot load library: <path>"; the reason goes to FNDialog::log
    explicit Dll(const std::string& path);

    /// The address of a function. @throws FNESysError if there is none of that name
    template <class Function> Function* function(const std::string& name) const {
        return reinterpret_cast<Function*>(symbol(name));
    }
    /// @throws FNESysError
    void* symbol(const std::string& name) const;
    /// Whether there is a library that exports the name.
    bool exports(const std::string& name) const;

private:
    class Library {
    public:
        explicit Library(const std::string& path);
        ~Library();
        Library(const Library&) = delete;
        Library& operator=(const Library&) = delete;
        void* symbol(const std::string& name) const;
        bool exports(const std::string& name) const;

    private:
        void* handle_;
    };

    FNCountedPtr<Library> library_;
};

} // namespace Fn

#include "fn/dll.h"

#include "fn/message/dialog.h"

#include <dlfcn.h>

namespace Fn {

Dll::Library::Library(const std::string& path) : handle_(dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL)) {
    if (handle_) return;
    const char* const reason = dlerror();
    FNDialog::log(reason ? reason : "unknown failure of dlopen");
    FN_THROW(FNESysError, "Cannot load library: " + path);
}

Dll::Library::~Library() {
    dlclose(handle_);
}

void* Dll::Library::symbol(const std::string& name) const {
    dlerror();
    void* const address = dlsym(handle_, name.c_str());
    if (dlerror()) FN_THROW(FNESysError, "Symbol unknown: " + name);
    if (!address) FN_THROW(FNESysError, "Symbolic name can not be resolved: " + name);
    return address;
}

bool Dll::Library::exports(const std::string& name) const {
    return dlsym(handle_, name.c_str()) != nullptr;
}

Dll::Dll(const std::string& path) : library_(new Library(path)) {}

void* Dll::symbol(const std::string& name) const {
    if (!library_)
        FN_THROW(FNESysError, "Symbolic name can not be resolved: " + name + " (library not loaded)");
    return library_->symbol(name);
}

bool Dll::exports(const std::string& name) const {
    return library_ && library_->exports(name);
}

} // namespace Fn

#pragma once

#include "fn/cptr.h"

namespace Fn {

/// A value that may be absent. Copies share the value.
template <class T> class Optional {
public:
    Optional() = default;
    Optional(const T& value) : value_(new T(value)) {}

    bool isSet() const noexcept { return static_cast<bool>(value_); }

    /// @throws FNEBadFunCall if no value is set.
    const T& get() const { return throwIfNotSet(), *value_.get(); }
    const T& operator*() const { return get(); }
    const T* operator->() const { return &get(); }

private:
    void throwIfNotSet() const {
        if (!isSet()) FN_THROW(FNEBadFunCall, "Optional data accessed but not set!");
    }

    FNCountedPtr<T> value_;
};

} // namespace Fn

#pragma once

#include "fn/cptr.h"
#include "fn/thread/mutex.h"

namespace Cmp::Portrait {

/// Something that is made when it is first asked for, and then stays. One that cannot be made stays unmade.
template <class T> class MadeOnDemand {
public:
    /// @param mutex guards this, and is held while it is made, but not while the result is used
    /// @param make returns a T
    template <class Make> const T& get(const FNMutex& mutex, Make make) const {
        const FNMutexLock lock(mutex);
        if (!made_) made_ = FNCountedPtr<const T>(new T(make()));
        return *made_;
    }

private:
    mutable FNCountedPtr<const T> made_;
};

} // namespace Cmp::Portrait

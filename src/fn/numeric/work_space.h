#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <vector>

namespace Fn::Numeric {

/// Work space of a LAPACK routine, as large as the routine itself asks for.
///
/// A call is anything that takes the array and its size (0 to ask) and returns `info`.
template <class T> class WorkSpace {
public:
    WorkSpace() : work_(1) {}

    /// Asks the routine. @return its info
    template <class Call> int query(Call call) {
        const int info = call(work_.data(), 0);
        // A size above 2^24 may have been rounded down on its way through a float.
        if (info == 0)
            work_.resize(static_cast<std::size_t>(std::nextafter(std::max(work_[0], T{1}), T(INFINITY))) + 1);
        return info;
    }

    /// Runs the routine. @return its info
    template <class Call> int run(Call call) { return call(work_.data(), work_.size()); }

private:
    std::vector<T> work_;
};

} // namespace Fn::Numeric

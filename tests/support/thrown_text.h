#pragma once

#include "support/thrown.h"

/// The text of the exception of class E that the call throws; "<type id>: <text>" if it is of another class.
template <class E, class Call> std::string thrownText(Call call) {
    const std::string thrown = thrownBy(call), prefix = std::string(E::thisTypeId) + ": ";
    return thrown.rfind(prefix, 0) == 0 ? thrown.substr(prefix.size()) : thrown;
}

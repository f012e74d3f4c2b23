#pragma once

#include "fn/exception.h"

#include <string>

/// "<type id>: <text>" of what the call throws.
template <class Call> std::string thrownBy(Call call) {
    try {
        call();
    } catch (const FNException& e) {
        return std::string(e.typeId()) + ": " + e.what();
    } catch (const std::exception& e) {
        return std::string("std::exception: ") + e.what();
    }
    return "nothing thrown";
}

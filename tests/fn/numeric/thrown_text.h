#pragma once

#include "fn/exception.h"

#include <gtest/gtest.h>

#include <string>

/// The text of the exception of class E that `call` throws.
template <class E, class Call> std::string thrownText(Call call) {
    try {
        call();
    } catch (const FNException& e) {
        EXPECT_STREQ(e.typeId(), E::thisTypeId) << e.what();
        return e.what();
    }
    return "nothing was thrown";
}

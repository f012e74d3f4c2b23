#include "img/affine/rothstein.h"

#include "fn/exception.h"

#include <string>

std::vector<std::uint32_t> imgRothsteinCode(std::uint64_t p, std::uint32_t q) {
    if (p < q)
        FN_THROW(FNEBadArg,
                 "imgRothsteinCode: Fatal Error: p < q: " + std::to_string(p) + " " + std::to_string(q));
    std::vector<std::uint32_t> code(q);
    const std::int64_t twoP = 2 * static_cast<std::int64_t>(p), twoQ = 2 * std::int64_t{q};
    std::int64_t error = twoP - q;
    for (std::uint32_t& n : code) {
        const std::int64_t units = error < 0 ? 0 : error / twoQ + 1;
        error += twoP - twoQ * units;
        n = static_cast<std::uint32_t>(units);
    }
    return code;
}

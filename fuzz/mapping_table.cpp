// Score and rate mapping tables from packages: what is accepted can be read in both directions everywhere,
// and is written back to the same.

#include "fn/invertible_function.h"

#include "fn/serialize.h"

#include <cmath>
#include <cstdlib>
#include <limits>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    using Table = Fn::InvertibleFunction<float, float>;
    try {
        const Table table{Fn::Package(data, size)};
        const auto values = table.values().span();
        const float width = table.xMax() - table.xMin();
        for (const float t : {-1.0f, 0.0f, 0.1f, 0.3337f, 0.5f, 0.99999994f, 1.0f, 2.0f}) {
            table(table.xMin() + t * width);
            table.applyInverse(values.front() + t * (values.back() - values.front()));
        }
        for (const float x : {std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity(),
                              std::numeric_limits<float>::lowest()}) {
            table(x);
            table.applyInverse(x);
        }
        const Table again(Fn::serialize(table));
        if (!(again.values() == table.values()) || again.xMin() != table.xMin() ||
            again.xMax() != table.xMax())
            std::abort();
    } catch (const FNException&) {
    }
    return 0;
}

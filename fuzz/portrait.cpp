// What the portrait analyser reads from outside: the file of the lighting transformation, and packed
// characteristics. What is accepted works without reading beyond its data, and is written as it was read.

#include "cmp/portrait/characteristics.h"
#include "cmp/portrait/sphar_transformator.h"

#include <cstdlib>
#include <sstream>

namespace {

template <class Use> void tolerate(Use use) {
    try {
        use();
    } catch (const FNException&) {
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    using Cmp::Portrait::SpharTransformator;
    tolerate([&] {
        std::istringstream stream(std::string(reinterpret_cast<const char*>(data), size));
        const SpharTransformator transformator(stream);
        FNImage<float> window(SpharTransformator::side, SpharTransformator::side);
        window.fill(0.5f);
        if (transformator(window).size() != SpharTransformator::coefficients) std::abort();
    });
    tolerate([&] {
        const Cmp::Portrait::Characteristics portrait{Fn::Package(data, size)};
        portrait.lengthOfHead();
        const Fn::Package written = portrait.serialize();
        if (!(Cmp::Portrait::Characteristics(written).serialize() == written)) std::abort();
    });
    return 0;
}

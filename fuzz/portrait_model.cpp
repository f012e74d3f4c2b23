// Models of sample portraits: whatever is accepted can be evaluated and written again.

#include "synth/portrait_model.h"
#include "fn/exception.h"

#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    try {
        const Synth::PortraitModel model{Fn::Package(data, size)};
        Synth::Controls controls;
        controls.fill(1);
        model.face(controls, model.feminine());
        if (!(Fn::Package(Synth::PortraitModel(Fn::Package(model))) == Fn::Package(model))) std::abort();
    } catch (const FNException&) {
    }
    return 0;
}

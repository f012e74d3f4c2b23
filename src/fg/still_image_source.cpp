#include "fg/still_image_source.h"

namespace FG {

FNRMem<unsigned char> StillImageSourceEmulator::release() {
    const Fn::Package package = source_->grab().serialize();
    FNRMem<unsigned char> bytes(package.size());
    package.write(bytes.getExclusive());
    return bytes;
}

FNImageReference StillImageSourceEmulator::extractImage(const FNRMem<unsigned char>& bytes,
                                                        const Fn::ReadImagePropertiesFeedback&) {
    return FNImageReference(Fn::Package(bytes.data(), bytes.size()));
}

} // namespace FG

#include "fn/image_blit.h"

namespace Fn {

template <class T>
void blitIntoImage(const FNImageReference& source, FNImage<T>& target, const FNGridPos& offset) {
    const FNImage<T> pixels = source.to<T>();
    const std::int64_t left = offset.x, top = offset.y, right = left + pixels.w(), bottom = top + pixels.h();
    if (left < 0 || top < 0 || right > target.w() || bottom > target.h())
        FN_THROW(FNEBadArg, "Fn::blitIntoImage(): Invalid source size or offset");
    T* const out = target.getExclusive();
    if (pixels.w() == target.w()) {
        std::copy_n(pixels.data(), pixels.size(), out + static_cast<std::uint64_t>(top) * target.w());
        return;
    }
    for (std::uint32_t y = 0; y < pixels.h(); ++y)
        std::copy_n(pixels.row(y), pixels.w(), out + static_cast<std::uint64_t>(top + y) * target.w() + left);
}

template void blitIntoImage(const FNImageReference&, FNImage<unsigned char>&, const FNGridPos&);
template void blitIntoImage(const FNImageReference&, FNImage<unsigned short>&, const FNGridPos&);
template void blitIntoImage(const FNImageReference&, FNImage<Bgra32>&, const FNGridPos&);

} // namespace Fn

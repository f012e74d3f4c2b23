#pragma once

#include "fn/image_reference.h"

#include <mutex>
#include <optional>

namespace Kx::Implementation {

/// Another image, of which each gray form is made once: the finders and the comparison algorithm of one
/// sample ask for the same one in turn.
class IntensityCachingImage final : public FNImageReference::Representation {
public:
    explicit IntensityCachingImage(const FNImageReference& image) : image_(image) {}

    std::uint32_t w() const override { return image_.w(); }
    std::uint32_t h() const override { return image_.h(); }
    void serialize(std::list<Fn::Package>& elements) const override {
        image_.representation().serialize(elements);
    }
    void setSerializationStrategy(FNImageReference::SerializationStrategy strategy) const override {
        image_.setSerializationStrategy(strategy);
    }
    FNImageReference::SerializationStrategy getSerializationStrategy() const override {
        return image_.getSerializationStrategy();
    }
    FNImage<unsigned char> toMono8() const override { return cached(mono8_); }
    FNImage<unsigned short> toMono16() const override { return cached(mono16_); }
    FNImage<float> toMonoFloat() const override { return cached(monoFloat_); }
    FNImage<Fn::Bgra32> toBgra32() const override { return image_.toBgra32(); }
    FNImage<Fn::Rgb48> toRgb48() const override { return image_.toRgb48(); }
    const FNImageAttributes& attributes() const override { return image_.attributes(); }
    FNImageAttributes& attributes() override { return image_.attributes(); }
    bool isColor() const override { return image_.isColor(); }
    FNImageReference::PixelType native() const override { return image_.native(); }

private:
    template <class T> FNImage<T> cached(std::optional<FNImage<T>>& form) const {
        const std::lock_guard lock(mutex_);
        if (!form) form = image_.to<T>();
        return *form;
    }

    FNImageReference image_;
    mutable std::mutex mutex_; ///< guards the change of the next three from unset to set
    mutable std::optional<FNImage<unsigned char>> mono8_;
    mutable std::optional<FNImage<unsigned short>> mono16_;
    mutable std::optional<FNImage<float>> monoFloat_;
};

inline FNImageReference cachingIntensity(const FNImageReference& image) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(new IntensityCachingImage(image)));
}

} // namespace Kx::Implementation

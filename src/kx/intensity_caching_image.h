#pragma once

#include "fn/image_reference.h"

#include <mutex>
#include <optional>

namespace Kx::Implementation {

/// Another image, of which each gray form is made once: the finders and the comparison algorithm of one
/// sample ask for the same one in turn. Once they are dropped, each is made anew whenever it is asked for.
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

    /// Drops the gray forms, for good.
    void drop() {
        const std::lock_guard lock(mutex_);
        dropped_ = true;
        mono8_.reset();
        mono16_.reset();
        monoFloat_.reset();
    }

private:
    template <class T> FNImage<T> cached(std::optional<FNImage<T>>& form) const {
        const std::lock_guard lock(mutex_);
        if (dropped_) return image_.to<T>();
        if (!form) form = image_.to<T>();
        return *form;
    }

    FNImageReference image_;
    mutable std::mutex mutex_; ///< guards what follows
    mutable bool dropped_ = false;
    mutable std::optional<FNImage<unsigned char>> mono8_;
    mutable std::optional<FNImage<unsigned short>> mono16_;
    mutable std::optional<FNImage<float>> monoFloat_;
};

inline FNImageReference cachingIntensity(const FNImageReference& image) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(new IntensityCachingImage(image)));
}

/// Keeps the gray forms of an image while its sample is worked on. Who holds the image for longer, as a
/// record builder does with the best ones, does not hold its forms.
class IntensityCache {
public:
    explicit IntensityCache(const FNImageReference& image)
        : caching_(new IntensityCachingImage(image)),
          image_(FNCountedPtr<FNImageReference::Representation>(caching_)) {}
    ~IntensityCache() { caching_->drop(); }
    IntensityCache(const IntensityCache&) = delete;
    IntensityCache& operator=(const IntensityCache&) = delete;

    const FNImageReference& image() const { return image_; }

private:
    IntensityCachingImage* caching_;
    FNImageReference image_; ///< owns it
};

} // namespace Kx::Implementation

#include "fg/dll_objects.h"

#include "fn/exception_factory.h"

#include <optional>

namespace FG {

void rethrowFromHere() {
    std::optional<Fn::Package> packed; // the exception of the library is gone before the new one is thrown
    try {
        throw;
    } catch (const FNException& e) {
        packed = Fn::ExceptionFactory().serialize(e);
    } catch (const std::exception& e) {
        packed = Fn::ExceptionFactory().serialize(e);
    } catch (...) {
    }
    if (!packed) FN_THROW(FNEGeneric, "A capture device's library threw an unknown exception");
    Fn::ExceptionFactory().throwException(*packed);
}

namespace {

/// Frees memory that a library allocated, while the library is still there.
template <class T> class LibraryMemory final : public FNRMemCoreBody::Dtor {
public:
    LibraryMemory(const Fn::Dll& dll, const T& owner) : dll_(dll), owner_(owner) {}
    void del(void*) const override {}

private:
    Fn::Dll dll_;
    T owner_; ///< goes first
};

/// The elements of a block, without a copy.
template <class T> FNRMem<T> keepLoaded(const Fn::Dll& dll, const FNRMem<T>& block) {
    if (block.empty()) return {};
    return FNRMem<T>(block.data(), block.size(),
                     FNCountedPtr<FNRMemCoreBody::Dtor>(new LibraryMemory<FNRMem<T>>(dll, block)), false);
}

template <class T> FNImage<T> keepLoaded(const Fn::Dll& dll, const FNImage<T>& image) {
    if (image.empty()) return {};
    const FNRMem<T> pixels(image.data(), image.size(),
                           FNCountedPtr<FNRMemCoreBody::Dtor>(new LibraryMemory<FNImage<T>>(dll, image)),
                           false);
    return FNImage<T>(pixels, image.w(), image.h());
}

Fn::Package keepLoaded(const Fn::Dll& dll, const Fn::Package& package) {
    std::list<Fn::Package::Core> cores;
    for (const auto& core : package.cores()) cores.push_back(keepLoaded(dll, core));
    return Fn::Package(cores);
}

/// An image that a library made.
class DllImage final : public FNImageReference::Representation {
public:
    DllImage(const Fn::Dll& dll, const FNImageReference& image) : dll_(dll), image_(image) {}

    std::uint32_t w() const override {
        return forward([](const Representation& image) { return image.w(); });
    }
    std::uint32_t h() const override {
        return forward([](const Representation& image) { return image.h(); });
    }
    void serialize(std::list<Fn::Package>& elements) const override {
        std::list<Fn::Package> made;
        forward([&](const Representation& image) { image.serialize(made); });
        for (const Fn::Package& element : made) elements.push_back(keepLoaded(dll_, element));
    }
    void setSerializationStrategy(FNImageReference::SerializationStrategy strategy) const override {
        forward([&](const Representation& image) { image.setSerializationStrategy(strategy); });
    }
    FNImageReference::SerializationStrategy getSerializationStrategy() const override {
        return forward([](const Representation& image) { return image.getSerializationStrategy(); });
    }
    FNImage<unsigned char> toMono8() const override { return pixels<unsigned char>(); }
    FNImage<unsigned short> toMono16() const override { return pixels<unsigned short>(); }
    FNImage<float> toMonoFloat() const override { return pixels<float>(); }
    FNImage<Fn::Bgra32> toBgra32() const override { return pixels<Fn::Bgra32>(); }
    FNImage<Fn::Rgb48> toRgb48() const override { return pixels<Fn::Rgb48>(); }
    const FNImageAttributes& attributes() const override { return image_.attributes(); }
    FNImageAttributes& attributes() override { return image_.attributes(); }
    bool isColor() const override {
        return forward([](const Representation& image) { return image.isColor(); });
    }
    FNImageReference::PixelType native() const override {
        return forward([](const Representation& image) { return image.native(); });
    }

private:
    template <class Call> std::invoke_result_t<Call, const Representation&> forward(Call call) const {
        return callLibrary([&] { return call(image_.representation()); });
    }
    template <class T> FNImage<T> pixels() const {
        return keepLoaded(dll_, callLibrary([&] { return image_.to<T>(); }));
    }

    Fn::Dll dll_;
    FNImageReference image_; ///< goes first
};

class DllFrameGrabber final : public Fn::LiveVideoSource {
public:
    DllFrameGrabber(const Fn::Dll& dll, const FNCountedPtr<LiveVideoSource>& source) : source_(dll, source) {}

    FNImageReference get() override { return FG::keepLoaded(source_.dll(), source_.call(&Source::get)); }
    std::string name() override { return source_.call(&Source::name); }
    FNImageReference grab() override { return FG::keepLoaded(source_.dll(), source_.call(&Source::grab)); }
    std::string id() override { return source_.call(&Source::id); }
    unsigned int gain() override { return source_.call(&Source::gain); }
    Range gainRange() override { return source_.call(&Source::gainRange); }
    void setGain(unsigned int value) override { source_.call(&Source::setGain, value); }
    unsigned int contrast() override { return source_.call(&Source::contrast); }
    Range contrastRange() override { return source_.call(&Source::contrastRange); }
    void setContrast(unsigned int value) override { source_.call(&Source::setContrast, value); }
    unsigned int exposure() override { return source_.call(&Source::exposure); }
    Range exposureRange() override { return source_.call(&Source::exposureRange); }
    void setExposure(unsigned int value) override { source_.call(&Source::setExposure, value); }
    unsigned int saturation() override { return source_.call(&Source::saturation); }
    Range saturationRange() override { return source_.call(&Source::saturationRange); }
    void setSaturation(unsigned int value) override { source_.call(&Source::setSaturation, value); }
    unsigned int hue() override { return source_.call(&Source::hue); }
    Range hueRange() override { return source_.call(&Source::hueRange); }
    void setHue(unsigned int value) override { source_.call(&Source::setHue, value); }
    unsigned int w() override { return source_.call(&Source::w); }
    unsigned int h() override { return source_.call(&Source::h); }
    int configure() override { return source_.call(&Source::configure); }
    int videoFormat() override { return source_.call(&Source::videoFormat); }
    Fn::Package getVideoFormat() override {
        return keepLoaded(source_.dll(), source_.call(&Source::getVideoFormat));
    }
    void setVideoFormat(const Fn::Package& format) override { source_.call(&Source::setVideoFormat, format); }

private:
    using Source = Fn::LiveVideoSource;
    DllObject<Source> source_;
};

class DllStillImageSource final : public StillImageSource {
public:
    DllStillImageSource(const Fn::Dll& dll, const FNCountedPtr<StillImageSource>& source)
        : source_(dll, source) {}

    std::string id() override { return source_.call(&Source::id); }
    std::string name() override { return source_.call(&Source::name); }
    FNRMem<unsigned char> release() override {
        return keepLoaded(source_.dll(), source_.call(&Source::release));
    }
    FNImageReference extractImage(const FNRMem<unsigned char>& bytes,
                                  const Fn::ReadImagePropertiesFeedback& feedback) override {
        return FG::keepLoaded(source_.dll(), source_.call(&Source::extractImage, bytes, feedback));
    }
    unsigned int gain() override { return source_.call(&Source::gain); }
    Range gainRange() override { return source_.call(&Source::gainRange); }
    void setGain(unsigned int value) override { source_.call(&Source::setGain, value); }
    unsigned int exposure() override { return source_.call(&Source::exposure); }
    Range exposureRange() override { return source_.call(&Source::exposureRange); }
    void setExposure(unsigned int value) override { source_.call(&Source::setExposure, value); }

private:
    using Source = StillImageSource;
    DllObject<Source> source_;
};

} // namespace

FNImageReference keepLoaded(const Fn::Dll& dll, const FNImageReference& image) {
    return FNImageReference(FNCountedPtr<FNImageReference::Representation>(new DllImage(dll, image)));
}

FNCountedPtr<Fn::LiveVideoSource> keepLoaded(const Fn::Dll& dll,
                                             const FNCountedPtr<Fn::LiveVideoSource>& source) {
    if (!source) return {};
    return FNCountedPtr<Fn::LiveVideoSource>(new DllFrameGrabber(dll, source));
}

FNCountedPtr<StillImageSource> keepLoaded(const Fn::Dll& dll, const FNCountedPtr<StillImageSource>& source) {
    if (!source) return {};
    return FNCountedPtr<StillImageSource>(new DllStillImageSource(dll, source));
}

} // namespace FG

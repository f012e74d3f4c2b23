#pragma once

#include "fn/imagefile/properties_feedback.h"
#include "fn/live_video_source.h"

namespace FG {

/// A device that takes single pictures and hands them out as bytes.
class StillImageSource {
public:
    using Range = Fn::LiveVideoSource::Range;

    virtual ~StillImageSource() = default;
    /// The name under which the device is known.
    virtual std::string id() = 0;
    virtual std::string name() { return id(); }
    /// Takes a picture. @return its bytes, in a form that extractImage() reads
    virtual FNRMem<unsigned char> release() = 0;
    virtual FNImageReference extractImage(const FNRMem<unsigned char>& bytes,
                                          const Fn::ReadImagePropertiesFeedback& feedback) = 0;

    // As of Fn::LiveVideoSource.
    virtual unsigned int gain() = 0;
    virtual Range gainRange() = 0;
    virtual void setGain(unsigned int value) = 0;
    virtual unsigned int exposure() = 0;
    virtual Range exposureRange() = 0;
    virtual void setExposure(unsigned int value) = 0;
};

/// Lets a video source take single pictures; their bytes are those of the image's package.
class StillImageSourceEmulator final : public StillImageSource {
public:
    explicit StillImageSourceEmulator(const FNCountedPtr<Fn::LiveVideoSource>& source) : source_(source) {}

    std::string id() override { return source_->id(); }
    std::string name() override { return source_->name(); }
    FNRMem<unsigned char> release() override;
    FNImageReference extractImage(const FNRMem<unsigned char>& bytes,
                                  const Fn::ReadImagePropertiesFeedback& feedback) override;
    unsigned int gain() override { return source_->gain(); }
    Range gainRange() override { return source_->gainRange(); }
    void setGain(unsigned int value) override { source_->setGain(value); }
    unsigned int exposure() override { return source_->exposure(); }
    Range exposureRange() override { return source_->exposureRange(); }
    void setExposure(unsigned int value) override { source_->setExposure(value); }

private:
    FNCountedPtr<Fn::LiveVideoSource> source_;
};

} // namespace FG

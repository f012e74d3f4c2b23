#include "fg/multi_file.h"

#include "fg/capture_types.h"
#include "fn/imagefile/image_file.h"
#include "fn/thread/mutex.h"
#include "fn/thread/thread.h"

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <limits>
#include <vector>

namespace FG {

using namespace Fn::Deployment;
using Clock = std::chrono::steady_clock;
using std::chrono::microseconds;
using std::chrono::milliseconds;

namespace {

constexpr float leastRate = std::numeric_limits<float>::epsilon(); // frames per second

/// A directory's files, in the order in which the system lists them; pipes and devices are none.
std::vector<std::string> filesIn(const std::string& directory) {
    std::error_code error;
    std::filesystem::directory_iterator entry(directory, error);
    if (error)
        FN_THROW(FNEIOError, "MultiFile: directory `" + directory + "' cannot be read: " + error.message());
    std::vector<std::string> files;
    for (const std::filesystem::directory_iterator end; entry != end; entry.increment(error)) {
        const std::string path = directory + "/" + entry->path().filename().string();
        if (std::filesystem::is_regular_file(path, error)) files.push_back(path);
    }
    return files;
}

std::vector<std::string> listFiles(const Component& component) {
    const Component location = component.subComponent("FileLocation");
    const std::string choice = Value<Alternative<MultiFileLocations>>::get(location);
    const Component chosen = location.subComponent(choice);
    std::vector<std::string> files;
    if (choice == "Directory")
        files = filesIn(Value<String>::get(chosen));
    else
        for (const Component& file : chosen.subComponents()) files.push_back(Value<String>::get(file));
    if (files.empty()) FN_THROW(FNEBadArg, "MultiFile::MultiFile: empty list not valid");

    const std::string sorting = Value<MultiFileDef::Sorting>::get(component.subComponent("Sorting"));
    if (sorting != "No") std::ranges::sort(files);
    if (sorting == "DescendingByName") std::ranges::reverse(files);
    return files;
}

milliseconds framePeriod(const Component& component) {
    const float rate = Value<Float>::get(component.subComponent("CaptureFrameRate"));
    if (rate < 0) FN_THROW(FNEBadArg, "CaptureFrameRate cannot be negative");
    if (!(rate >= leastRate)) FN_THROW(FNEBadArg, "CaptureFrameRate must be bigger than zero");
    return milliseconds(static_cast<std::int64_t>(1000.0f / rate));
}

/// Seconds from one image to the next, 0 for as fast as possible.
float deliveryPeriod(const Component& component) {
    const Component setting = component.subComponent("DeliveryFrameRate");
    if (Value<MultiFileDef::OptionalFloat>::get(setting) != Float::typeId()) return 0;
    const float rate = Value<Float>::get(setting.subComponent(Float::typeId()));
    if (rate < 0) FN_THROW(FNEBadArg, "DeliveryFrameRate cannot be negative");
    if (!(rate > leastRate)) FN_THROW(FNEBadArg, "DeliveryFrameRate must be bigger than zero");
    return 1 / rate;
}

Fn::Optional<unsigned int> exposureTime(const Component& component) {
    const Component setting = component.subComponent("ExposureTime");
    if (Value<MultiFileDef::OptionalUInt>::get(setting) != UInt::typeId()) return {};
    return Value<UInt>::get(setting.subComponent(UInt::typeId()));
}

[[noreturn]] void refuse(const char* setting) {
    FN_THROW(FNEBadFunCall, std::string("MultiFile: files have no ") + setting + " to set");
}

} // namespace

unsigned long deliveryStep(float period) {
    constexpr float longest = 1e6f;
    return static_cast<unsigned long>(std::min(100 * period, longest));
}

class MultiFile::Implementation {
public:
    Implementation(const Component& component, const std::string& name)
        : id_(name), caching_(Value<Bool>::get(component.subComponent("ImageCaching"))),
          continuous_(Value<Bool>::get(component.subComponent("ContinuousPlayback"))),
          framePeriod_(framePeriod(component)), deliveryPeriod_(deliveryPeriod(component)),
          exposureTime_(exposureTime(component)), files_(listFiles(component)) {
        if (caching_)
            for (const std::string& file : files_) cache_.push_back(readAtStart(file));
        const FNImageReference first = caching_ ? cache_.front() : readAtStart(files_.front());
        w_ = first.w();
        h_ = first.h();
        nextCapture_ = Fn::TimeStamp::now();
        lastDelivery_ = Clock::now();
    }

    FNImageReference grab() {
        const FNMutexLock lock(mutex_);
        FNImageReference image =
            caching_ ? FNImageReferenceFactory::duplicate(cache_[nextImage_]) : read(files_[nextFile_]);
        Fn::addImageCaptureTime(image.attributes(), nextCapture_);
        nextCapture_ = nextCapture_ + framePeriod_;
        advance(caching_ ? nextImage_ : nextFile_);
        waitUntilNextDeliveryTimeframe();
        return image;
    }

    FNRMem<unsigned char> release() {
        const FNMutexLock lock(mutex_);
        const std::string& file = files_[nextFile_];
        std::ifstream stream(file, std::ios::binary);
        std::vector<char> bytes;
        while (stream) {
            constexpr std::size_t block = 10240;
            const std::size_t size = bytes.size();
            bytes.resize(size + block);
            stream.read(bytes.data() + size, block);
            bytes.resize(size + static_cast<std::size_t>(stream.gcount()));
        }
        if (!stream.eof()) FN_THROW(FNEIOError, "MultiFile: file `" + file + "' cannot be read");
        advance(nextFile_);
        FNRMem<unsigned char> result(bytes.size());
        std::ranges::copy(bytes, result.getExclusive());
        return result;
    }

    const std::string& id() const { return id_; }
    unsigned int w() const { return w_; }
    unsigned int h() const { return h_; }

private:
    FNImageReference read(const std::string& file) const {
        FNImageReference image = Fn::readImage(file, {}, Fn::ImageLimits::withRareVariants());
        if (exposureTime_.isSet()) Fn::addImageExposureTime(image.attributes(), *exposureTime_);
        return image;
    }

    /// Nobody knows yet which file is meant.
    FNImageReference readAtStart(const std::string& file) const {
        try {
            return read(file);
        } catch (const std::exception& e) {
            FN_THROW(FNEBadArg, "MultiFile: file `" + file + "' cannot be read: " + e.what());
        }
    }

    void advance(std::size_t& position) const {
        if (position + 1 < files_.size())
            ++position;
        else if (continuous_)
            position = 0;
    }

    void waitUntilNextDeliveryTimeframe() {
        if (deliveryPeriod_ == 0) return;
        const auto due = lastDelivery_ + std::chrono::duration<double>(deliveryPeriod_);
        while (Clock::now() < due) FNThreadSelf::sleep(deliveryStep(deliveryPeriod_));
        lastDelivery_ = Clock::now();
    }

    const std::string id_;
    const bool caching_;
    const bool continuous_;
    const milliseconds framePeriod_;
    const float deliveryPeriod_;
    const Fn::Optional<unsigned int> exposureTime_; ///< microseconds
    const std::vector<std::string> files_;
    std::vector<FNImageReference> cache_;
    unsigned int w_ = 0, h_ = 0;

    FNMutex mutex_{FNMutex::recursive}; ///< guards what follows
    std::size_t nextFile_ = 0;
    std::size_t nextImage_ = 0;
    Fn::TimeStamp nextCapture_;
    Clock::time_point lastDelivery_;
};

MultiFile::MultiFile(const Component& component, const std::string& name)
    : implementation_(new Implementation(component, name)) {}
MultiFile::MultiFile(const MultiFile&) = default;
MultiFile::~MultiFile() = default;

FNImageReference MultiFile::grab() {
    return implementation_->grab();
}

std::string MultiFile::id() {
    return implementation_->id();
}

unsigned int MultiFile::w() {
    return implementation_->w();
}

unsigned int MultiFile::h() {
    return implementation_->h();
}

FNCountedPtr<StillImageSource> MultiFile::stillImageSource() const {
    return FNCountedPtr<StillImageSource>(new MFileStillImageSource(implementation_));
}

void MultiFile::setGain(unsigned int) {
    refuse("gain");
}

void MultiFile::setContrast(unsigned int) {
    refuse("contrast");
}

MFileStillImageSource::MFileStillImageSource(const FNCountedPtr<MultiFile::Implementation>& implementation)
    : implementation_(implementation) {}
MFileStillImageSource::~MFileStillImageSource() = default;

std::string MFileStillImageSource::id() {
    return implementation_->id();
}

FNRMem<unsigned char> MFileStillImageSource::release() {
    return implementation_->release();
}

FNImageReference MFileStillImageSource::extractImage(const FNRMem<unsigned char>& bytes,
                                                     const Fn::ReadImagePropertiesFeedback& feedback) {
    return Fn::readImage(reinterpret_cast<const char*>(bytes.data()), bytes.size(), feedback);
}

void MFileStillImageSource::setGain(unsigned int) {
    refuse("gain");
}

void MFileStillImageSource::setExposure(unsigned int) {
    refuse("exposure");
}

} // namespace FG

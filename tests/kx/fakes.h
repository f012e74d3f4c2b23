#pragma once

#include "eye/eyes_finder.h"
#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/image_set.h"
#include "fn/real_time.h"
#include "fn/video_source.h"
#include "kx/events.h"
#include "support/number_records.h"

#include <atomic>
#include <cmath>
#include <sstream>
#include <vector>

/// Stand-ins for all that an operation works with. A picture is one gray value, which says what is to be seen
/// in it; each event becomes a line of a log.
namespace Kx::Fakes {

/// Gray values.
enum Picture : unsigned char {
    Nobody = 0,   ///< no face
    Blind = 1,    ///< a face without eyes
    OneEyed = 2,  ///< a face with its left eye only
    Blurred = 3,  ///< both eyes, and the record builder does not take it
    Person = 100, ///< this value and those above: both eyes, and the value becomes the record, in hundredths
    Stranger = 200,
};

inline FNImageReference picture(unsigned char value) {
    FNImage<unsigned char> image(12, 8);
    image.fill(value);
    return FNImageReferenceFactory::create(image);
}
inline int valueOf(const FNImageReference& image) {
    return image.toMono8().row(0)[0];
}

constexpr FacialFeatureLocation leftEye{{1, 2}, 0, 0.5f}, rightEye{{3, 2}, 0, 0.25f};

/// Time that passes only when somebody lets it.
class TestClock final : public FNRealTime::Clock {
public:
    double seconds() const override { return static_cast<double>(now_.load()) / 1000; }
    void sleep(unsigned int milliseconds) const override {
        slept.push_back(milliseconds);
        pass(milliseconds);
    }
    void pass(unsigned int milliseconds) const { now_ += milliseconds; }

    mutable std::vector<unsigned int> slept;

private:
    mutable std::atomic<long> now_ = 5000; // milliseconds
};

class Faces final : public FaceFinder::Body {
public:
    explicit Faces(const TestClock& clock, unsigned int takes) : clock_(clock), takes_(takes) {}
    bool find(const FNImageReference& image, std::list<FaceFinder::Location>& locations, double least,
              double greatest, const FNBox& box) const override {
        clock_.pass(takes_);
        locations.clear();
        if (std::abs(least - 0.1) > 1e-6 || std::abs(greatest - 0.4) > 1e-6 || box != FaceFinder::everywhere)
            return false;
        if (valueOf(image) != Nobody) locations = {{{2, 2}, 2, 1, 0}, {{0, 0}, 1, 0.5f, 0}};
        return !locations.empty();
    }
    std::string processingId() const override { return "faces"; }

private:
    const TestClock& clock_;
    unsigned int takes_;
};

class Eyes final : public EyesFinder::Body {
public:
    void find(const FaceFinder::Location& face, const FNImageReference& image, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const override {
        foundFirst = face.width == 2 && valueOf(image) != Blind;
        foundSecond = foundFirst && valueOf(image) != OneEyed;
        if (foundFirst) first = leftEye;
        if (foundSecond) second = rightEye;
    }
    void find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&, bool&,
              FacialFeatureLocation&, bool&, FacialFeatureLocation&) const override {}
    std::string processingId() const override { return "eyes"; }
};

/// Its record is the sum of its samples.
class Builder final : public Cmp::RecordBuilder::Body {
public:
    Builder(const TestClock& clock, unsigned int takes) : clock_(clock), takes_(takes) {}
    int pushSample(const Cmp::Sample& sample) override {
        clock_.pass(takes_);
        const int value = valueOf(*sample.intensityImage);
        if (value == Blurred) return -1;
        samples_.emplace(next_, static_cast<float>(value) / 100);
        return next_++;
    }
    void removeSample(int handle) override { samples_.erase(handle); }
    Cmp::Quality quality() const override { return {}; }
    Cmp::Face bestFace() const override { return {}; }
    Cmp::FIR generate() override {
        float sum = 0;
        for (const auto& [handle, value] : samples_) sum += value;
        return NumberRecords::record(sum);
    }
    void clear() override { samples_.clear(); }
    std::size_t dumpSize() const override { return 0; }
    std::size_t numberOfSamples() const override { return samples_.size(); }
    Cmp::FIR create(const Fn::Package&) const override { return createVoid(); }
    Cmp::FIR createFromMemento(unsigned char*&) const override { return createVoid(); }
    Cmp::FIR createVoid() const override { return NumberRecords::record(0); }

private:
    const TestClock& clock_;
    unsigned int takes_;
    std::map<int, float> samples_;
    int next_ = 0;
};

inline float number(const Cmp::FIR& fir) {
    return fir.serialize().toFloat();
}

class Algorithm final : public NumberRecords::Algorithm {
public:
    Algorithm(const TestClock& clock, unsigned int takes) : clock_(clock), takes_(takes) {}
    Cmp::RecordBuilder createRecordBuilder() const override {
        return Cmp::RecordBuilder(FNCountedPtr<Cmp::RecordBuilder::Body>(new Builder(clock_, takes_)));
    }
    Cmp::FIR merge(const std::list<Cmp::FIR>& earlier, const Cmp::FIR& added) const override {
        float sum = number(added);
        for (const Cmp::FIR& fir : earlier) sum += number(fir);
        return NumberRecords::record(sum);
    }

private:
    const TestClock& clock_;
    unsigned int takes_;
};

/// What the operations of a test share.
struct World {
    unsigned int findingTakes = 0, extractionTakes = 0; ///< milliseconds

    FNCountedPtr<TestClock> clock{new TestClock};
    FaceFinder faceFinder() const {
        return FaceFinder(FNCountedPtr<FaceFinder::Body>(new Faces(*clock, findingTakes)));
    }
    EyesFinder eyesFinder() const { return EyesFinder(FNCountedPtr<EyesFinder::Body>(new Eyes)); }
    Cmp::Strategy strategy() const {
        return NumberRecords::strategy(
            1, FNCountedPtr<NumberRecords::Algorithm>(new Algorithm(*clock, extractionTakes)));
    }
};

/// The settings of an operation. @param values lines "Key = value" of a configuration; keys of the operation
/// begin with "It."
template <class Operation> Fn::Deployment::Component settings(const std::string& values = {}) {
    std::istringstream text(values);
    return {FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(text)),
            Fn::Deployment::Property(Fn::Deployment::type<Operation>(), "It", "", "", false)};
}

/// A camera: gives its pictures in turn, then the last one for ever.
class Camera final : public Fn::VideoSource::Body {
public:
    Camera(const std::vector<unsigned char>& pictures, const FNCountedPtr<TestClock>& clock,
           unsigned int takes = 0)
        : pictures_(pictures), clock_(clock), takes_(takes) {}
    FNImageReference get() override {
        clock_->pass(takes_);
        return picture(pictures_[std::min(next_++, pictures_.size() - 1)]);
    }
    std::string name() override { return "camera" + std::to_string(pictures_.size()); }

private:
    std::vector<unsigned char> pictures_;
    std::size_t next_ = 0;
    FNCountedPtr<TestClock> clock_;
    unsigned int takes_;
};

class Pictures final : public FNImageSet::Body {
public:
    Pictures(const std::vector<unsigned char>& values, int count) : values_(values), count_(count) {}
    int count() const override { return count_; }
    FNImageReference get(int index) const override {
        return picture(values_.at(static_cast<std::size_t>(index)));
    }

private:
    std::vector<unsigned char> values_;
    int count_;
};

inline FNImageSet imageSet(const std::vector<unsigned char>& values) {
    return FNImageSet(FNCountedPtr<FNImageSet::Body>(new Pictures(values, static_cast<int>(values.size()))));
}

/// Writes the events of an operation: what it is, its index, and what it brings.
class Log {
public:
    template <class... Events> void listenTo(const Subject<Events...>& subject) {
        (subject.addObserver(Fn::Functor1<Events>([this](const Events& event) { write(event); })), ...);
    }
    /// What came since the last call.
    std::string take() {
        std::string text = text_.str();
        text_.str("");
        return text;
    }

    Fn::Functor0 atEachSample; ///< called for ProcessingSample

private:
    void write(const OperationInterest::ProcessingSample& e) {
        text_ << e.index << ":" << valueOf(e.image) << " ";
        atEachSample();
    }
    void write(const OperationInterest::FaceFound& e) {
        text_ << "face" << e.index << "(" << e.location.width << ") ";
    }
    void write(const OperationInterest::EyesFound& e) {
        text_ << "eyes" << e.index << "(" << e.left.pos.x << "," << e.right.pos.x << ") ";
    }
    void write(const OperationInterest::EyesNotFound& e) { text_ << "blind" << e.index << " "; }
    void write(const OperationInterest::ProcessingTimeExceeded&) { text_ << "late "; }
    void write(const EnrolmentInterest::NotEnoughGoodImages&) { text_ << "failed "; }
    void write(const EnrolmentInterest::DoneProcessing& e) { text_ << "record " << number(e.fir) << " "; }
    void write(const RecognitionInterest::ExtractedFIR& e) {
        text_ << "probe" << e.index << "(" << number(e.fir) << ") ";
    }
    void write(const RecognitionInterest::AchievedScore& e) {
        text_ << "score" << e.index << "(" << e.score << ") ";
    }
    void write(const RecognitionInterest::AttemptResult& e) {
        text_ << (e.accepted ? "yes" : "no") << e.index << " ";
    }
    void write(const RecognitionInterest::Result& e) { text_ << (e.accepted ? "accepted " : "rejected "); }
    void write(const Cmp::Matches& matches) {
        text_ << "matches";
        for (const Cmp::Match& match : matches) text_ << " " << match.id << "=" << match.score.value();
        text_ << " ";
    }

    std::ostringstream text_;
};

} // namespace Kx::Fakes

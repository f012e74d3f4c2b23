#include "orbek/corbek.h"

#include "fn/imagefile/jpeg.h"
#include "orbek/enrollment.h"
#include "orbek/facial_matching_engine.h"
#include "orbek/feature_test.h"
#include "orbek/fir_builder.h"
#include "orbek/full_frontal_test.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/population.h"
#include "orbek/token_face_creator.h"

#include <cstddef>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <map>

using namespace Orbek;

namespace {

// What callers in other languages rely on.
static_assert(sizeof(orbekMatch) == 132 && offsetof(orbekMatch, score) == 128);
static_assert(sizeof(orbekPortraitResult) == 8 && offsetof(orbekPortraitResult, value) == 4);

/// Codes of orbekGenerateFIR(), orbekFindEyes() and the functions of token faces beside 0; all others return
/// 1 for a failure.
enum Code : int {
    done = 0,
    failed = 1,
    noFace = 1,
    notEnrolled = 2,
    notBothEyes = 2,
    bufferTooSmall = 3,
    failedBesideOtherCodes = 4,
};

// What the functions share. It is never destroyed: at the end of a process, other threads may still be here.

/// Null before orbekInit().
FNCountedPtr<Configuration>& configurationHandle() {
    static auto& instance = *new FNCountedPtr<Configuration>;
    return instance;
}
const Configuration& configuration() {
    if (!configurationHandle()) FN_THROW(FNEBadFunCall, "orbekInit has not been called");
    return *configurationHandle();
}

const Resources& resourcesOf(const Configuration& configuration) {
    return Configuration::Implementation::implementation(configuration)->resources();
}

/// The live populations by their handles, which are their addresses.
std::map<void*, FNCountedPtr<Population>>& populations() {
    static auto& instance = *new std::map<void*, FNCountedPtr<Population>>;
    return instance;
}
/// Guards the map, and is held while a population is used.
const FNMutex& populationsMutex() {
    static const auto& instance = *new FNMutex(FNMutex::recursive);
    return instance;
}
Population& population(void* handle) {
    const auto found = populations().find(handle);
    if (found == populations().end()) FN_THROW(FNEBadArg, "Invalid population pointer");
    return *found->second;
}

/// One line on the standard error stream; not mixed with those of other threads.
/// @param function with its prefix
void report(const char* function, const std::exception& e) {
    char line[4096]; // no memory may be left
    const int length = std::snprintf(line, sizeof line, "%s::error -> %s\n", function, e.what());
    if (length >= static_cast<int>(sizeof line)) line[sizeof line - 2] = '\n';
    std::cerr << line;
}

/// The border that no exception passes. @return what `call` does, or `failure`
template <class Call, class Result> Result guarded(const char* function, Result failure, Call call) {
    try {
        return call();
    } catch (const std::exception& e) {
        report(function, e);
        return failure;
    }
}

/// @param name of the argument
template <class T> T* notNull(T* pointer, const char* name) {
    if (!pointer) FN_THROW(FNEBadArg, std::string(name) + " is a null pointer");
    return pointer;
}

using ImageWithEyes = std::pair<Image, Eyes::Location>;

Image imageFrom(const char* jpeg, unsigned int size) {
    return Jpeg::load(notNull(jpeg, "jpeg"), size);
}

Eyes::Location eyesAt(float x0, float y0, float x1, float y1) {
    return {{x0, y0}, {x1, y1}, 0, 0};
}

FIR recordOf(const unsigned char* fir, unsigned int size) {
    return FIRBuilder(configuration()).build(notNull(fir, "fir"), size);
}

/// A buffer of the caller.
template <class Byte> struct Room {
    Byte* buffer;
    int size;

    /// Calls `write(buffer)` if there is room for so many bytes. @return done or bufferTooSmall
    template <class Write> Code fill(std::size_t bytes, Write write) const {
        if (size < 0 || bytes > static_cast<std::size_t>(size)) return bufferTooSmall;
        write(notNull(buffer, "buffer"));
        return done;
    }
};

/// Keeps the record of an enrollment.
class EnrollmentFB final : public Enrollment::FeedbackBody {
public:
    EnrollmentFB(const Room<unsigned char>& room, unsigned int& firSize) : room_(room), firSize_(firSize) {}

    int result() const { return result_; }

    void success(const FIR& fir) override {
        result_ = guarded("orbek.dll:orbekGenerateFIR:success", failedBesideOtherCodes, [&] {
            firSize_ = static_cast<unsigned int>(fir.size());
            return room_.fill(fir.size(), [&](unsigned char* buffer) { fir.serialize(buffer); });
        });
    }
    void failure() override { result_ = notEnrolled; }

    void start() override {}
    void processingImage(const Image&) override {}
    void eyesFound(const Eyes::Location&) override {}
    void eyesNotFound() override {}
    void end() override {}

private:
    const Room<unsigned char> room_;
    unsigned int& firSize_;
    int result_ = done;
};

using Extract = ImageWithEyes (ISO_19794_5::TokenFace::Creator::*)(const ImageWithEyes&) const;

/// What the functions of token faces do. @param imageSize may be null
int extractToken(const char* function, Extract extract, const char* jpeg, unsigned int jpegSize,
                 const Eyes::Location& eyes, const Room<char>& room, unsigned int* imageSize) {
    return guarded(function, failed, [&] {
        constexpr int bestQuality = 100;
        const ISO_19794_5::TokenFace::Creator creator(configuration());
        const Image token = (creator.*extract)({imageFrom(jpeg, jpegSize), eyes}).first;
        const FNRMem<unsigned char> file = Fn::writeJpeg(adapt(token), bestQuality);
        if (imageSize) *imageSize = static_cast<unsigned int>(file.size());
        return room.fill(file.size(), [&](char* buffer) { std::memcpy(buffer, file.data(), file.size()); });
    });
}

constexpr Extract wholeToken = &ISO_19794_5::TokenFace::Creator::extract,
                  minimalToken = &ISO_19794_5::TokenFace::Creator::extractMinimal;

} // namespace

int orbekInit(const char* configurationFile) {
    return guarded("orbek.dll:orbekInit", failed, [&] {
        configurationHandle() = FNCountedPtr<Configuration>(
            new Configuration(std::string(notNull(configurationFile, "configurationFile"))));
        // The models that these read stay with the configuration.
        const Face::Finder faces(configuration());
        const Eyes::Finder eyes(configuration());
        const Enrollment::Processor enrollment(configuration());
        resourcesOf(configuration()).portraitAnalyzer().readAll();
        return done;
    });
}

int orbekGenerateFIR(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1, float y1,
                     unsigned char* buffer, int bufferSize, unsigned int* firSize) {
    return guarded("orbek.dll:orbekGenerateFIR", int{failedBesideOtherCodes}, [&] {
        const std::list<Sample> samples{
            Sample(ImageWithEyes(imageFrom(jpeg, jpegSize), eyesAt(x0, y0, x1, y1)))};
        auto* const outcome = new EnrollmentFB({buffer, bufferSize}, *notNull(firSize, "firSize"));
        const Enrollment::Feedback feedback(outcome);
        Enrollment::Processor(configuration()).process(samples.begin(), samples.end(), feedback);
        return outcome->result();
    });
}

int orbekFindEyes(const char* jpeg, unsigned int jpegSize, float* x0, float* y0, float* x1, float* y1) {
    return guarded("orbek.dll:orbekFindEyes", failedBesideOtherCodes, [&] {
        constexpr double minRelEyeDist = 0.1, maxRelEyeDist = 0.4;
        const FNImageReference image =
            FNImageReferenceFactory::create(Fn::readJpeg(notNull(jpeg, "jpeg"), jpegSize).toMono16());
        for (const float* position : {x0, y0, x1, y1}) notNull(position, "an eye position");
        const Resources& resources = resourcesOf(configuration());
        std::list<::FaceFinder::Location> faces;
        resources.faceFinder().find(image, faces, minRelEyeDist, maxRelEyeDist, ::FaceFinder::everywhere);
        if (faces.empty()) return noFace;

        bool foundFirst = false, foundSecond = false;
        FacialFeatureLocation first, second;
        resources.eyesFinder().find(faces.front(), image, foundFirst, first, foundSecond, second);
        if (!foundFirst || !foundSecond) return notBothEyes;
        *x0 = first.pos.x;
        *y0 = first.pos.y;
        *x1 = second.pos.x;
        *y1 = second.pos.y;
        return done;
    });
}

int orbekCompare(const unsigned char* fir1, unsigned int size1, const unsigned char* fir2, unsigned int size2,
                 float* score) {
    return guarded("corbek.dll:orbekCompare", failed, [&] {
        const FIR first = recordOf(fir1, size1), second = recordOf(fir2, size2);
        *notNull(score, "score") = FacialMatchingEngine(configuration()).compare(first, second);
        return done;
    });
}

void* orbekCreatePopulation() {
    return guarded("corbek.dll:orbekCreatePopulation", static_cast<void*>(nullptr), [&]() -> void* {
        const FNCountedPtr<Population> created(new Population(configuration()));
        const FNMutexLock lock(populationsMutex());
        populations()[&*created] = created;
        return &*created;
    });
}

int orbekDeletePopulation(void* population) {
    return guarded("corbek.dll:orbekDeletePopulation", failed, [&] {
        const FNMutexLock lock(populationsMutex());
        populations().erase(population);
        return done;
    });
}

int orbekAppendToPopulation(void* population, const unsigned char* fir, unsigned int firSize,
                            const char* id) {
    return guarded("corbek.dll:orbekAppendToPopulation", failed, [&] {
        const FIR record = recordOf(fir, firSize);
        const FNMutexLock lock(populationsMutex());
        ::population(population).append(record, notNull(id, "id"));
        return done;
    });
}

int orbekRemoveFromPopulation(void* population, const char* id) {
    return guarded("corbek.dll:orbekRemoveFromPopulation", failed, [&] {
        const FNMutexLock lock(populationsMutex());
        ::population(population).remove(notNull(id, "id"));
        return done;
    });
}

int orbekBestMatches(const unsigned char* fir, unsigned int firSize, void* population, float threshold,
                     unsigned int maxMatches, orbekMatch* matches, unsigned int* count) {
    return guarded("corbek.dll:orbekBestMatches", failed, [&] {
        *notNull(count, "count") = 0;
        const FNMutexLock lock(populationsMutex());
        const Population& people = ::population(population);
        const auto found = FacialMatchingEngine(configuration())
                               .bestMatches(recordOf(fir, firSize), people, Score(threshold), maxMatches);
        for (const Match& match : *found) {
            orbekMatch& record = notNull(matches, "matches")[*count];
            const std::size_t length = match.name.copy(record.id, sizeof record.id - 1);
            record.id[length] = '\0';
            record.score = match.score;
            ++*count;
        }
        return done;
    });
}

int orbekAnalyzePortraitExposure(const char* jpeg, unsigned int jpegSize, orbekPortraitResult* result,
                                 float x0, float y0, float x1, float y1) {
    return guarded("corbek.dll:orbekAnalyzePortraitExposure", failed, [&] {
        const auto portrait =
            Portrait::Analyzer(configuration())
                .analyzeColor(ImageWithEyes(imageFrom(jpeg, jpegSize), eyesAt(x0, y0, x1, y1)));
        const ISO_19794_5::FullFrontal::Test test(configuration());
        const bool good = test.assess(portrait).goodExposure();
        *notNull(result, "result") = {good, portrait.exposure()};
        return done;
    });
}

int orbekAnalyzePortraitGlasses(const char* jpeg, unsigned int jpegSize, orbekPortraitResult* result,
                                float x0, float y0, float x1, float y1) {
    return guarded("corbek.dll:orbekAnalyzePortraitGlasses", failed, [&] {
        const auto portrait =
            Portrait::Analyzer(configuration()).analyze({imageFrom(jpeg, jpegSize), eyesAt(x0, y0, x1, y1)});
        const bool glasses = Portrait::Feature::Test(configuration()).assess(portrait).wearsGlasses();
        *notNull(result, "result") = {glasses, portrait.glasses()};
        return done;
    });
}

int orbekExtractTokenFaceImage(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                               float y1, char* buffer, int bufferSize) {
    return extractToken("corbek.dll:orbekExtractTokenFaceImage", wholeToken, jpeg, jpegSize,
                        eyesAt(x0, y0, x1, y1), {buffer, bufferSize}, nullptr);
}

int orbekExtractTokenFaceImageSized(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                                    float y1, char* buffer, int bufferSize, unsigned int* imageSize) {
    return extractToken("corbek.dll:orbekExtractTokenFaceImageSized", wholeToken, jpeg, jpegSize,
                        eyesAt(x0, y0, x1, y1), {buffer, bufferSize}, imageSize);
}

int orbekExtractMinimalTokenFaceImage(const char* jpeg, unsigned int jpegSize, float x0, float y0, float x1,
                                      float y1, char* buffer, int bufferSize) {
    return extractToken("corbek.dll:orbekExtractMinimalTokenFaceImage", minimalToken, jpeg, jpegSize,
                        eyesAt(x0, y0, x1, y1), {buffer, bufferSize}, nullptr);
}

int orbekExtractMinimalTokenFaceImageSized(const char* jpeg, unsigned int jpegSize, float x0, float y0,
                                           float x1, float y1, char* buffer, int bufferSize,
                                           unsigned int* imageSize) {
    return extractToken("corbek.dll:orbekExtractMinimalTokenFaceImageSized", minimalToken, jpeg, jpegSize,
                        eyesAt(x0, y0, x1, y1), {buffer, bufferSize}, imageSize);
}

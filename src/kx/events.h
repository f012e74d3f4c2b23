#pragma once

#include "cmp/fir.h"
#include "cmp/matches.h"
#include "eye/face_finder.h"
#include "eye/facial_feature_location.h"
#include "fn/callback/observable.h"
#include "fn/image_reference.h"

/// The events by which an operation tells what it does, on the thread that it runs on. The index of a sample
/// is the same in all of its events.
namespace Kx {

/// Of all operations.
namespace OperationInterest {

struct ProcessingSample {
    int index;
    FNImageReference image;
};
struct FaceFound {
    int index;
    FaceFinder::Location location;
};
struct EyesFound {
    int index;
    FacialFeatureLocation left;
    FacialFeatureLocation right;
};
struct EyesNotFound {
    int index;
};
/// Of operations on streams: the time that they have been given is over.
struct ProcessingTimeExceeded {};

} // namespace OperationInterest

/// The outcome of an enrolment.
namespace EnrolmentInterest {

struct NotEnoughGoodImages {};
struct DoneProcessing {
    Cmp::FIR fir;
};

} // namespace EnrolmentInterest

/// Of verifications.
namespace RecognitionInterest {

struct ExtractedFIR {
    int index;
    Cmp::FIR fir;
};
struct AchievedScore {
    int index;
    float score;
};
struct AttemptResult {
    int index;
    bool accepted;
};
/// The outcome.
struct Result {
    bool accepted;
};

} // namespace RecognitionInterest

/// What sends events of several types. Observers are added by the type of their functor:
///
///     enroller.addObserver(Fn::Functor1<DoneProcessing>([&](const DoneProcessing& done) { ... }));
template <class... Events> class Subject : public FNObservableBody1<Events>... {
public:
    using FNObservableBody1<Events>::addObserver...;
    using FNObservableBody1<Events>::broadcast...;
    /// Of any type. Does nothing if the id is not there.
    void removeObserver(const std::string& id) const override {
        (FNObservableBody1<Events>::removeObserver(id), ...);
    }
};

/// Makes `to` send the events of some types that `from` sends, for as long as both live.
template <class... Events, class From, class To> void forward(const From& from, const To& to) {
    (from.addObserver(Fn::Functor1<Events>([&to](const Events& event) { to.broadcast(event); })), ...);
}

} // namespace Kx

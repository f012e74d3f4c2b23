#pragma once

#include "eye/tracker/distance_range.h"
#include "fn/image_set.h"
#include "fn/video_source.h"
#include "kx/events.h"
#include "kx/eye_finder.h"
#include "kx/intensity_caching_image.h"
#include "kx/sensor_sample.h"

/// What operations do with each sample before they use it, and how they go through their samples.
namespace Kx::Implementation {

/// The search for eyes with the settings of an operation.
class EyeSearch {
public:
    /// @param operation has range() among its settings
    EyeSearch(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
              const Fn::Deployment::Component& operation, bool useAttributes);

    static Fn::Deployment::Property range();

    /// Sets both eyes if both are found.
    void find(SensorSample& sample) const;

private:
    EyeFinder finder_;
    double minEyeDistance_, maxEyeDistance_;
};

/// The next image of a source, with the source's name.
SensorSample nextSample(const Fn::VideoSource& source);

/// Tells whether a sample has both eyes, and where. @return whether it has
template <class Operation> bool tellEyes(const Operation& operation, const SensorSample& sample, int index) {
    if (!sample.hasEyes()) {
        operation.broadcast(OperationInterest::EyesNotFound{index});
        return false;
    }
    operation.broadcast(OperationInterest::EyesFound{index, *sample.leftEye, *sample.rightEye});
    return true;
}

/// Tells of a sample, and looks for its eyes unless they are known. @return whether it has both eyes
template <class Operation>
bool lookAt(const Operation& operation, const EyeSearch& eyes, SensorSample& sample, int index) {
    operation.broadcast(OperationInterest::ProcessingSample{index, sample.image});
    if (!sample.hasEyes()) eyes.find(sample);
    return tellEyes(operation, sample, index);
}

/// Calls `use(sample, index)` for those samples that have eyes, until it returns true.
/// @return whether it has
template <class Operation, class Use>
bool walk(const Operation& operation, const EyeSearch& eyes, const std::list<SensorSample>& samples,
          Use use) {
    int index = 0;
    for (SensorSample sample : samples) {
        const IntensityCache cache(sample.image);
        sample.image = cache.image();
        if (lookAt(operation, eyes, sample, index) && use(sample, index)) return true;
        ++index;
    }
    return false;
}

template <class Operation, class Use>
bool walk(const Operation& operation, const EyeSearch& eyes, const FNImageSet& images, Use use) {
    for (int index = 0; index < images.count(); ++index) {
        const IntensityCache cache(images[index]);
        SensorSample sample(cache.image());
        if (lookAt(operation, eyes, sample, index) && use(sample, index)) return true;
    }
    return false;
}

/// Of faces whose eyes are known. @throws FNEBadFunCall for a face without one of them
template <class Operation, class Use>
bool walk(const Operation& operation, const std::list<Cmp::Face>& faces, Use use) {
    int index = 0;
    for (const Cmp::Face& face : faces) {
        const IntensityCache cache(face.image());
        operation.broadcast(OperationInterest::ProcessingSample{index, cache.image()});
        const SensorSample sample{cache.image(), face.leftEyeLocation(), face.rightEyeLocation()};
        operation.broadcast(OperationInterest::EyesFound{index, *sample.leftEye, *sample.rightEye});
        if (use(sample, index)) return true;
        ++index;
    }
    return false;
}

} // namespace Kx::Implementation

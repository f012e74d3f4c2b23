#pragma once

#include "fn/deployment/component.h"

namespace Kx::ISO_19794_5::FullFrontal {

/// What the tests of a full frontal portrait allow. "Ratio" is between an extent of the image and that of the
/// head, positions are in widths and heights of the image, and the rest has the units of the measures (see
/// Cmp::Portrait::Characteristics).
struct Limits {
    float lowerBoundVerticalPosition = 0;
    float upperBoundVerticalPosition = 0;
    float leftBoundCenteredFace = 0;
    float rightBoundCenteredFace = 0;
    float minWidthOfHeadRatio = 0;
    float maxWidthOfHeadRatio = 0;
    float minWidthOfHeadRatioBestPractice = 0;
    float maxWidthOfHeadRatioBestPractice = 0;
    float minLengthOfHeadRatio = 0;
    float maxLengthOfHeadRatio = 0;
    float minLengthOfHeadRatioBestPractice = 0;
    float maxLengthOfHeadRatioBestPractice = 0;
    float minWidthToHeightRatioBestPractice = 0;
    float maxWidthToHeightRatioBestPractice = 0;
    float lowExposerThreshold = 0;
    float highExposerThreshold = 0;
    float minimalGrayScaleBounding = 0;
    float minimalSkinColourRatio = 0;
    float maxFrontalPoseDeviation = 0;
    float maxFrontalPoseDeviationBestPractice = 0;
    float maxDeviationFromLighting = 0;
    float eyesOpenThreshold = 0;
    float eyesNotRedThreshold = 0;
    float wearsGlassesThreshold = 0;
    float tintedGlassesThreshold = 0;
    float poseMaxRotation = 0;
    float poseMaxRotationBestPractice = 0;
    float minHeadWidth = 0;
    float minHeadWidthBestPractice = 0;
    float minimalSharpness = 0;
    float closedMouthThreshold = 0;
    float hotSpotsThreshold = 0;
    float eyesGazeFrontalThreshold = 0;
};

/// Handle on the limits of one test.
class Boundaries {
public:
    explicit Boundaries(const Limits& limits) : limits_(new Limits(limits)) {}
    /// @param component with the settings
    explicit Boundaries(const Fn::Deployment::Component& component);
    /// The settings that they are made of.
    static std::list<Fn::Deployment::Property> settingsOfThem();

    float lowerBoundVerticalPosition() const { return limits_->lowerBoundVerticalPosition; }
    float upperBoundVerticalPosition() const { return limits_->upperBoundVerticalPosition; }
    float leftBoundCenteredFace() const { return limits_->leftBoundCenteredFace; }
    float rightBoundCenteredFace() const { return limits_->rightBoundCenteredFace; }
    float minWidthOfHeadRatio() const { return limits_->minWidthOfHeadRatio; }
    float maxWidthOfHeadRatio() const { return limits_->maxWidthOfHeadRatio; }
    float minWidthOfHeadRatioBestPractice() const { return limits_->minWidthOfHeadRatioBestPractice; }
    float maxWidthOfHeadRatioBestPractice() const { return limits_->maxWidthOfHeadRatioBestPractice; }
    float minLengthOfHeadRatio() const { return limits_->minLengthOfHeadRatio; }
    float maxLengthOfHeadRatio() const { return limits_->maxLengthOfHeadRatio; }
    float minLengthOfHeadRatioBestPractice() const { return limits_->minLengthOfHeadRatioBestPractice; }
    float maxLengthOfHeadRatioBestPractice() const { return limits_->maxLengthOfHeadRatioBestPractice; }
    float minWidthToHeightRatioBestPractice() const { return limits_->minWidthToHeightRatioBestPractice; }
    float maxWidthToHeightRatioBestPractice() const { return limits_->maxWidthToHeightRatioBestPractice; }
    float lowExposerThreshold() const { return limits_->lowExposerThreshold; }
    float highExposerThreshold() const { return limits_->highExposerThreshold; }
    float minimalGrayScaleBounding() const { return limits_->minimalGrayScaleBounding; }
    float minimalSkinColourRatio() const { return limits_->minimalSkinColourRatio; }
    float maxFrontalPoseDeviation() const { return limits_->maxFrontalPoseDeviation; }
    float maxFrontalPoseDeviationBestPractice() const { return limits_->maxFrontalPoseDeviationBestPractice; }
    float maxDeviationFromLighting() const { return limits_->maxDeviationFromLighting; }
    float eyesOpenThreshold() const { return limits_->eyesOpenThreshold; }
    float eyesNotRedThreshold() const { return limits_->eyesNotRedThreshold; }
    float wearsGlassesThreshold() const { return limits_->wearsGlassesThreshold; }
    float tintedGlassesThreshold() const { return limits_->tintedGlassesThreshold; }
    float poseMaxRotation() const { return limits_->poseMaxRotation; }
    float poseMaxRotationBestPractice() const { return limits_->poseMaxRotationBestPractice; }
    float minHeadWidth() const { return limits_->minHeadWidth; }
    float minHeadWidthBestPractice() const { return limits_->minHeadWidthBestPractice; }
    float minimalSharpness() const { return limits_->minimalSharpness; }
    float closedMouthThreshold() const { return limits_->closedMouthThreshold; }
    float hotSpotsThreshold() const { return limits_->hotSpotsThreshold; }
    float eyesGazeFrontalThreshold() const { return limits_->eyesGazeFrontalThreshold; }

private:
    FNCountedPtr<const Limits> limits_;
};

} // namespace Kx::ISO_19794_5::FullFrontal

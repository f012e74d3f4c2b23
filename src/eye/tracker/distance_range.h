#pragma once

#include "fn/deployment/component.h"

namespace Eye {

/// The eye distances that a face finder is asked for, in widths of the image. Reads and writes the settings
/// in place.
class DistanceRange {
public:
    explicit DistanceRange(const Fn::Deployment::Component& component) : component_(component) {}

    float getMinDistance() const { return get("MinEyeDistance"); }
    float getMaxDistance() const { return get("MaxEyeDistance"); }
    void setMinDistance(float distance) { set("MinEyeDistance", distance); }
    void setMaxDistance(float distance) { set("MaxEyeDistance", distance); }

    static std::string typeId() { return "Eye::DistanceRange"; }
    static Fn::Deployment::Type define();

private:
    float get(const char* key) const;
    void set(const char* key, float distance);

    Fn::Deployment::Component component_;
};

} // namespace Eye

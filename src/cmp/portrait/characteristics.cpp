#include "cmp/portrait/characteristics.h"

#include "cmp/portrait/background_uniformity.h"
#include "cmp/portrait/characteristics_implementation.h"
#include "cmp/portrait/pixel_measures.h"

#include <cmath>

namespace Cmp::Portrait {

namespace {

using Position = FNPair<float, float>;
using Implementation = Characteristics::Implementation;

Fn::Package packed(FNPos pos) {
    return Fn::Package(Position(pos.x, pos.y));
}

FNPos nextPosition(Fn::PackageReader& reader) {
    const auto position = reader.next<Position>();
    return {position.first, position.second};
}

bool needsColor(std::size_t measure) {
    return measure == Implementation::eye0Red || measure == Implementation::eye1Red ||
           measure == Implementation::naturalSkinColour;
}

} // namespace

Characteristics Implementation::make(const Engine& engine, const Face& face, bool isColor,
                                     const std::optional<Analyzer::AdditionalAnnotations>& annotations) {
    FNCountedPtr<Implementation> implementation(new Implementation(engine, face, isColor));
    if (annotations) {
        implementation->values_[chin] = annotations->chin;
        implementation->values_[crown] = annotations->crown;
        implementation->values_[ear0] = annotations->ear0;
        implementation->values_[ear1] = annotations->ear1;
    }
    return Characteristics(FNCountedPtr<const Implementation>(implementation));
}

Implementation::Implementation(Fn::PackageReader reader) : isColor_(reader.next<bool>()) {
    const auto width = reader.next<unsigned int>(), height = reader.next<unsigned int>();
    const FNPos eye0 = nextPosition(reader), eye1 = nextPosition(reader);
    stored_ = Stored{width, height, eye0, eye1};
    for (std::size_t i = 0; i < measures; ++i) {
        if (needsColor(i) && !isColor_) continue;
        values_[i] =
            i == grayScaleDensity ? static_cast<float>(reader.next<unsigned int>()) : reader.next<float>();
    }
    ethnicity_ = reader.next<Ethnicity>();
    reader.expectEnd();
}

Fn::Package Implementation::serialize() const {
    std::list<Fn::Package> elements{Fn::Package(isColor_), Fn::Package(width()), Fn::Package(height()),
                                    packed(eye0()), packed(eye1())};
    for (std::size_t i = 0; i < measures; ++i) {
        if (needsColor(i) && !isColor_) continue;
        const float v = value(static_cast<Measure>(i));
        elements.push_back(i == grayScaleDensity ? Fn::Package(static_cast<unsigned int>(v))
                                                 : Fn::Package(v));
    }
    elements.push_back(Fn::serialize(ethnicity()));
    return Fn::Package(elements);
}

float Implementation::value(Measure measure) const {
    const FNMutexLock lock(valuesMutex_);
    std::optional<float>& value = values_[measure];
    if (!value) value = compute(measure);
    return *value;
}

Implementation::Ethnicity Implementation::ethnicity() const {
    const FNMutexLock lock(valuesMutex_);
    if (!ethnicity_) {
        const FNVector<float> features = engine_->features().ethnicity(portraitOf(face_, ethnicityPortrait));
        ethnicity_ = Ethnicity(engine_->score("EthnicityWDiscFile", features),
                               engine_->score("EthnicityBDiscFile", features),
                               engine_->score("EthnicityADiscFile", features));
    }
    return *ethnicity_;
}

float Implementation::compute(Measure measure) const {
    using Eye = PortraitFeatures::Eye;
    const PortraitFeatures& features = engine_->features();
    const auto score = [&](const char* key, const FNVector<float>& vector) {
        return engine_->score(key, vector);
    };
    const auto extent = [&](const char* key, float offset) {
        return eyeDistance() * score(key, headFeatures()) + offset * eyeDistance();
    };
    const auto color = [&] { return face_.image().toBgra32(); };
    switch (measure) {
    case glasses:
        return score("GlassesDiscFile", features.glasses(reshapedImage()));
    case eye0Open:
        return -score("ClosedEyeDiscFile", features.closedEye(reshapedImage(), Eye::eye0));
    case eye1Open:
        return -score("ClosedEyeDiscFile", features.closedEye(reshapedImage(), Eye::eye1));
    case eye0GazeFrontal:
        return -score("GazeAwayDiscFile", features.gazeAway(reshapedImage(), Eye::eye0));
    case eye1GazeFrontal:
        return -score("GazeAwayDiscFile", features.gazeAway(reshapedImage(), Eye::eye1));
    case eye0Red:
        return redEye(color(), eye0(), eye0(), eye1());
    case eye1Red:
        return redEye(color(), eye1(), eye0(), eye1());
    case eye0Tinted:
        return glassTint(color(), eye0(), eye0(), eye1());
    case eye1Tinted:
        return glassTint(color(), eye1(), eye0(), eye1());
    case mouthClosed:
        return -score("OpenMouthDiscFile", features.mouth(reshapedImage()));
    case exposure:
        return Portrait::exposure(exposureCrop());
    case grayScaleDensity:
        return static_cast<float>(Portrait::grayScaleDensity(face_.image().toMono8(), eye0(), eye1()));
    case naturalSkinColour:
        return Portrait::naturalSkinColour(color(), eye0(), eye1());
    case hotSpots:
        return Portrait::hotSpots(reshapedImage());
    case backgroundUniformity:
        return Portrait::backgroundUniformity(color(), eye0(), eye1());
    case chin:
        return extent("ChinEstFile", 0);
    case crown:
        return extent("CrownEstFile", 0);
    case ear0:
        return extent("LeftEarEstFile", 0.5f);
    case ear1:
        return extent("RightEarEstFile", -0.5f);
    case deviationFromFrontalPose:
        return -score("FrontalPoseDiscFile", features.pose(reshapedImage()));
    case isMale:
        return score("GenderDiscFile", features.genderOrAge(portraitOf(face_, genderPortrait)));
    case deviationFromUniformLighting:
        return -score("LightingUniformityDiscFile", engine_->lightingCoefficients(exposureCrop()));
    case sharpness:
        return features.sharpnessMeter()(windowOf(reshapedImage(), Window::sharpness));
    case age:
        return engine_->age(features.genderOrAge(portraitOf(face_, agePortrait)));
    case measures:
        break;
    }
    FN_THROW(FNEBadArg, "Characteristics: unknown measure");
}

const FNImage<float>& Implementation::reshapedImage() const {
    return reshaped_.get(reshapedMutex_, [&] { return portraitOf(face_, standardPortrait); });
}

const FNImage<float>& Implementation::exposureCrop() const {
    return crop_.get(cropMutex_, [&] { return windowOf(reshapedImage(), Window::exposure); });
}

const FNVector<float>& Implementation::headFeatures() const {
    return headFeatures_.get(valuesMutex_, [&] { return engine_->features().head(reshapedImage()); });
}

Characteristics::Characteristics(const Fn::Package& package)
    : implementation_(new Implementation(Fn::PackageReader(package))) {}

Characteristics::Characteristics(const FNCountedPtr<const Implementation>& implementation)
    : implementation_(implementation) {}
Characteristics::Characteristics(const Characteristics&) = default;
Characteristics& Characteristics::operator=(const Characteristics&) = default;
Characteristics::~Characteristics() = default;

Fn::Package Characteristics::serialize() const {
    return implementation_->serialize();
}

bool Characteristics::isColor() const {
    return implementation_->isColor();
}
unsigned int Characteristics::width() const {
    return implementation_->width();
}
unsigned int Characteristics::height() const {
    return implementation_->height();
}
FNPos Characteristics::eye0() const {
    return implementation_->eye0();
}
FNPos Characteristics::eye1() const {
    return implementation_->eye1();
}
float Characteristics::eyeDistance() const {
    return implementation_->eyeDistance();
}
FNPos Characteristics::faceCenter() const {
    return (eye0() + eye1()) / 2.0f;
}
float Characteristics::poseAngleRoll() const {
    const FNPos v = eye1() - eye0();
    return -v.y / v.x;
}

float Characteristics::glasses() const {
    return implementation_->value(Implementation::glasses);
}
float Characteristics::eye0Open() const {
    return implementation_->value(Implementation::eye0Open);
}
float Characteristics::eye1Open() const {
    return implementation_->value(Implementation::eye1Open);
}
float Characteristics::eye0GazeFrontal() const {
    return implementation_->value(Implementation::eye0GazeFrontal);
}
float Characteristics::eye1GazeFrontal() const {
    return implementation_->value(Implementation::eye1GazeFrontal);
}
float Characteristics::eye0Red() const {
    if (!isColor()) FN_THROW(FNEBadArg, "Characteristics::eye0Red() not applicable on gray scale image");
    return implementation_->value(Implementation::eye0Red);
}
float Characteristics::eye1Red() const {
    if (!isColor()) FN_THROW(FNEBadArg, "Characteristics::eye1Red() not applicable on gray scale image");
    return implementation_->value(Implementation::eye1Red);
}
float Characteristics::eye0Tinted() const {
    return implementation_->value(Implementation::eye0Tinted);
}
float Characteristics::eye1Tinted() const {
    return implementation_->value(Implementation::eye1Tinted);
}
float Characteristics::mouthClosed() const {
    return implementation_->value(Implementation::mouthClosed);
}
float Characteristics::exposure() const {
    return implementation_->value(Implementation::exposure);
}
float Characteristics::sharpness() const {
    return implementation_->value(Implementation::sharpness);
}
float Characteristics::hotSpots() const {
    return implementation_->value(Implementation::hotSpots);
}
unsigned int Characteristics::grayScaleDensity() const {
    return static_cast<unsigned int>(implementation_->value(Implementation::grayScaleDensity));
}
float Characteristics::naturalSkinColour() const {
    if (!isColor())
        FN_THROW(FNEBadArg, "Characteristics::naturalSkinColor() not applicable on gray scale image");
    return implementation_->value(Implementation::naturalSkinColour);
}
float Characteristics::backgroundUniformity() const {
    return implementation_->value(Implementation::backgroundUniformity);
}
float Characteristics::chin() const {
    return implementation_->value(Implementation::chin);
}
float Characteristics::crown() const {
    return implementation_->value(Implementation::crown);
}
float Characteristics::ear0() const {
    return implementation_->value(Implementation::ear0);
}
float Characteristics::ear1() const {
    return implementation_->value(Implementation::ear1);
}
float Characteristics::deviationFromFrontalPose() const {
    return implementation_->value(Implementation::deviationFromFrontalPose);
}
float Characteristics::deviationFromUniformLighting() const {
    return implementation_->value(Implementation::deviationFromUniformLighting);
}
float Characteristics::isMale() const {
    return implementation_->value(Implementation::isMale);
}
float Characteristics::age() const {
    return implementation_->value(Implementation::age);
}
FNTriple<float, float, float> Characteristics::ethnicity() const {
    return implementation_->ethnicity();
}

FNBox earToEarChinCrownSurroundingBox(const Characteristics& portrait) {
    const FNPos centre = portrait.faceCenter();
    const FNPos low = centre - FNPos(portrait.ear0(), portrait.crown());
    const FNPos high = centre + FNPos(portrait.ear1() + 1, portrait.chin() + 1);
    const FNGridPos first(FNPos(std::floor(low.x), std::floor(low.y)));
    const FNGridPos end(FNPos(std::ceil(high.x), std::ceil(high.y)));
    return {first.x, first.y, end.x, end.y};
}

} // namespace Cmp::Portrait

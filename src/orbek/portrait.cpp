#include "orbek/portrait.h"

#include "orbek/implementation/adapt.h"
#include "orbek/implementation/assessment.h"

namespace Orbek::Portrait {

Characteristics::Characteristics(const CountedPtr<Implementation>& implementation)
    : implementation_(implementation) {}
Characteristics::Characteristics(const Characteristics&) = default;
Characteristics& Characteristics::operator=(const Characteristics&) = default;
Characteristics::~Characteristics() = default;

bool Characteristics::isColor() const {
    return implementation_->portrait.isColor();
}
unsigned int Characteristics::width() const {
    return implementation_->portrait.width();
}
unsigned int Characteristics::height() const {
    return implementation_->portrait.height();
}
unsigned int Characteristics::numberOfFaces() const {
    return implementation_->numberOfFaces;
}
Position Characteristics::eye0() const {
    return adapt(implementation_->portrait.eye0());
}
Position Characteristics::eye1() const {
    return adapt(implementation_->portrait.eye1());
}
Position Characteristics::faceCenter() const {
    return adapt(implementation_->portrait.faceCenter());
}
float Characteristics::eyeDistance() const {
    return implementation_->portrait.eyeDistance();
}
float Characteristics::poseAngleRoll() const {
    return implementation_->portrait.poseAngleRoll();
}
float Characteristics::deviationFromFrontalPose() const {
    return implementation_->portrait.deviationFromFrontalPose();
}
float Characteristics::chin() const {
    return implementation_->portrait.chin();
}
float Characteristics::crown() const {
    return implementation_->portrait.crown();
}
float Characteristics::ear0() const {
    return implementation_->portrait.ear0();
}
float Characteristics::ear1() const {
    return implementation_->portrait.ear1();
}
float Characteristics::widthOfHead() const {
    return implementation_->portrait.widthOfHead();
}
float Characteristics::lengthOfHead() const {
    return implementation_->portrait.lengthOfHead();
}
float Characteristics::eye0Open() const {
    return implementation_->portrait.eye0Open();
}
float Characteristics::eye1Open() const {
    return implementation_->portrait.eye1Open();
}
float Characteristics::eye0GazeFrontal() const {
    return implementation_->portrait.eye0GazeFrontal();
}
float Characteristics::eye1GazeFrontal() const {
    return implementation_->portrait.eye1GazeFrontal();
}
float Characteristics::eye0Red() const {
    return implementation_->portrait.eye0Red();
}
float Characteristics::eye1Red() const {
    return implementation_->portrait.eye1Red();
}
float Characteristics::eye0Tinted() const {
    return implementation_->portrait.eye0Tinted();
}
float Characteristics::eye1Tinted() const {
    return implementation_->portrait.eye1Tinted();
}
float Characteristics::glasses() const {
    return implementation_->portrait.glasses();
}
float Characteristics::mouthClosed() const {
    return implementation_->portrait.mouthClosed();
}
float Characteristics::exposure() const {
    return implementation_->portrait.exposure();
}
unsigned int Characteristics::grayScaleDensity() const {
    return implementation_->portrait.grayScaleDensity();
}
float Characteristics::naturalSkinColour() const {
    return implementation_->portrait.naturalSkinColour();
}
float Characteristics::hotSpots() const {
    return implementation_->portrait.hotSpots();
}
float Characteristics::backgroundUniformity() const {
    return implementation_->portrait.backgroundUniformity();
}
float Characteristics::deviationFromUniformLighting() const {
    return implementation_->portrait.deviationFromUniformLighting();
}
float Characteristics::sharpness() const {
    return implementation_->portrait.sharpness();
}
float Characteristics::isMale() const {
    return implementation_->portrait.isMale();
}
float Characteristics::age() const {
    return implementation_->portrait.age();
}
std::array<float, 3> Characteristics::ethnicity() const {
    const auto [white, black, asian] = implementation_->portrait.ethnicity();
    return {white, black, asian};
}

Box earToEarChinCrownSurroundingBox(const Characteristics& portrait) {
    const Position center = portrait.faceCenter();
    const FNGridPos corner(FNPos(center.x - portrait.ear0(), center.y - portrait.crown()));
    const FNGridPos opposite(FNPos(center.x + portrait.ear1() + 1, center.y + portrait.chin() + 1));
    return Box(corner.x, corner.y, opposite.x, opposite.y);
}

class Analyzer::Implementation : public EngineOf<Cmp::Portrait::Analyzer> {
public:
    explicit Implementation(const Configuration& settings)
        : EngineOf(settings, &Resources::portraitAnalyzer) {}

    unsigned int countFaces(const Image& image) const {
        constexpr double minRelEyeDist = 0.05, maxRelEyeDist = 0.45;
        std::list<::FaceFinder::Location> faces;
        Configuration::Implementation::implementation(configuration())
            ->resources()
            .faceFinder()
            .find(adapt(image), faces, minRelEyeDist, maxRelEyeDist, ::FaceFinder::everywhere);
        return static_cast<unsigned int>(faces.size());
    }
};

Analyzer::Analyzer(const Configuration& configuration) : implementation_(new Implementation(configuration)) {}
Analyzer::Analyzer(const Analyzer&) = default;
Analyzer& Analyzer::operator=(const Analyzer&) = default;
Analyzer::~Analyzer() = default;

Characteristics Analyzer::analyze(const std::pair<Image, Eyes::Location>& imageWithEyes) const {
    const unsigned int faces = implementation_->countFaces(imageWithEyes.first);
    // The engine goes by the kind of image, too.
    return Characteristics::Implementation::make(implementation_->engine().analyze(adapt(imageWithEyes)),
                                                 faces);
}

Characteristics Analyzer::analyzeColor(const std::pair<Image, Eyes::Location>& imageWithEyes) const {
    const unsigned int faces = implementation_->countFaces(imageWithEyes.first);
    return Characteristics::Implementation::make(implementation_->engine().analyzeColor(adapt(imageWithEyes)),
                                                 faces);
}

} // namespace Orbek::Portrait

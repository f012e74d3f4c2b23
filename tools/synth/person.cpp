#include "synth/person.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace Synth {
namespace {

float uniform(Random& random, float least, float most) {
    return std::uniform_real_distribution<float>(least, most)(random);
}

/// Normal, but never far out.
float bounded(Random& random, float deviation, float most) {
    return std::clamp(std::normal_distribution<float>(0, deviation)(random), -most, most);
}

template <class T, std::size_t n> T pick(const T (&choices)[n], Random& random) {
    return choices[random() % n];
}

constexpr Colour hairColours[] = {{38, 30, 27},  {54, 40, 32},   {78, 54, 38},
                                  {104, 72, 46}, {146, 108, 66}, {128, 66, 40}};
constexpr Colour clothColours[] = {{52, 70, 104}, {116, 52, 58},  {74, 98, 84},    {196, 190, 178},
                                   {62, 62, 70},  {146, 112, 76}, {108, 128, 156}, {150, 90, 100}};
constexpr Colour backgrounds[] = {{206, 210, 214}, {178, 194, 210}, {214, 204, 190},
                                  {186, 200, 186}, {168, 172, 182}, {226, 224, 220}};

} // namespace

Person makePerson(const PortraitModel& model, const std::string& name, bool woman, std::uint64_t seed,
                  float spread) {
    constexpr float most = 2, gender = 1.7f; // deviations
    Random random(seed);
    Person person{name, woman, {}, {}, {}, {}, {}, {}, {}};
    const std::vector<float>& feminine = model.feminine();
    float along = 0, square = 1e-6f;
    for (const float direction : feminine) {
        person.identity.push_back(spread * bounded(random, 1, most));
        along += person.identity.back() * direction;
        square += direction * direction;
    }
    // Of the way in which women and men differ everybody has the same amount.
    const float missing = (woman ? gender : -gender) / std::sqrt(square) - along / square;
    for (std::size_t i = 0; i < feminine.size(); ++i) person.identity[i] += missing * feminine[i];
    constexpr HairCut women[] = {HairCut::longHair, HairCut::bob, HairCut::longHair};
    constexpr HairCut men[] = {HairCut::shortCut, HairCut::sidePart};
    person.cut = woman ? pick(women, random) : pick(men, random);
    person.hair = pick(hairColours, random) * uniform(random, 0.9f, 1.15f);
    person.hairline = uniform(random, 0.8f, 0.9f);
    person.hairVolume = woman ? uniform(random, 0.16f, 0.26f) : uniform(random, 0.06f, 0.16f);
    person.part = uniform(random, 0.25f, 0.5f) * (random() % 2 ? 1.0f : -1.0f);
    person.strands = static_cast<std::uint32_t>(random());
    return person;
}

View drawView(const ViewWishes& wishes, Random& random) {
    View view;
    view.controls[yaw] = wishes.yaw.value_or(bounded(random, 0.9f, 1.6f));
    view.controls[pitch] = wishes.pitch.value_or(bounded(random, 0.5f, 1));
    view.controls[smile] = wishes.smile.value_or(uniform(random, -1.2f, 1.4f));
    view.controls[mouthOpen] = wishes.mouthOpen.value_or(
        std::clamp(0.7f * view.controls[smile] + bounded(random, 0.4f, 0.8f), -0.8f, 1.2f));
    view.controls[eyesOpen] = wishes.eyesOpen.value_or(bounded(random, 0.3f, 0.5f) + 0.2f);
    view.controls[lightSide] = wishes.lightSide.value_or(bounded(random, 0.8f, 1.5f));
    view.controls[lightAbove] = wishes.lightAbove.value_or(bounded(random, 0.5f, 1));
    view.roll = wishes.roll ? *wishes.roll * std::numbers::pi_v<float> / 180 : bounded(random, 0.06f, 0.12f);
    view.background = wishes.background.value_or(pick(backgrounds, random));
    view.cloth = pick(clothColours, random);
    constexpr Neckline necklines[] = {Neckline::round, Neckline::vNeck, Neckline::collar};
    view.neckline = pick(necklines, random);
    view.grain = static_cast<std::uint32_t>(random());
    return view;
}

} // namespace Synth

// Where the finders and the tracker see the faces of drawn people, and how sure they are.

#include "golden_pictures.h"
#include "orbek/eyes_finder.h"
#include "orbek/face_tracker.h"

#include <sstream>

namespace {

using namespace Orbek;

void tell(GoldenFacts& facts, const std::string& name, const Face::Location& face) {
    facts.number(name + ".x", face.pos.x);
    facts.number(name + ".y", face.pos.y);
    facts.number(name + ".width", face.width);
    facts.number(name + ".confidence", face.confidence, 1e-3);
    facts.number(name + ".rotation", face.rotationAngle);
}

void tell(GoldenFacts& facts, const std::string& name, const Eyes::Location& eyes) {
    facts.number(name + ".x0", eyes.first.x);
    facts.number(name + ".y0", eyes.first.y);
    facts.number(name + ".x1", eyes.second.x);
    facts.number(name + ".y1", eyes.second.y);
    facts.number(name + ".confidence0", eyes.firstConfidence, 1e-3);
    facts.number(name + ".confidence1", eyes.secondConfidence, 1e-3);
}

TEST(FinderGoldenWithModels, SeesFacesAndEyesWhereItDid) {
    GoldenFacts facts("finders");
    const Configuration configuration = configured();
    const Face::Finder finder(configuration);
    const Eyes::Finder eyesFinder(configuration);
    const auto tellAll = [&](const std::string& name, const Image& image, float least, float most) {
        const auto w = static_cast<int>(image->width()), h = static_cast<int>(image->height());
        const auto faces = finder.find(image, least, most, 0, 0, w, h);
        facts.number(name + ".faces", static_cast<double>(faces.size()));
        int i = 0;
        for (const Face::Location& face : faces) {
            const std::string which = name + "." + std::to_string(i++);
            tell(facts, which, face);
            for (const Eyes::Location& eyes : eyesFinder.find(image, face)) tell(facts, which, eyes);
        }
    };
    for (const std::string person : drawnPeople) tellAll(person, drawnPerson(person), 0.05f, 0.4f);
    const Image group = groupPicture();
    tellAll("group", group, 0.01f, 0.4f);
    tellAll("group of large faces", group, 0.1f, 0.4f);
    tellAll("group of small faces", group, 0.01f, 0.06f);
}

TEST(FinderGoldenWithModels, TracksFacesAsItDid) {
    const Image group = groupPicture();
    // The picture moves to the left and back; the tracker looks at part of the places in each frame.
    for (const std::string width : {"7", "5", "3", "1", "4"}) {
        GoldenFacts facts("tracker" + width);
        Face::Tracker tracker(configured("ORBEK.FaceTracker.ExhaustiveTracking = false\n"
                                         "ORBEK.FaceTracker.FaceFinder.StreamingSubsamplingWidth = " +
                                         width + "\n"));
        std::map<std::string, int> known;
        for (int frame = 0; frame < 14; ++frame) {
            auto* const moved = new Painting(640, 480, {});
            const Image image(moved);
            moved->place(group, frame < 6 ? -4 * frame : -40 + 4 * frame, 2 * (frame % 3), 1);
            const std::string name = "frame" + std::to_string(frame);
            const auto faces = frame % 2 ? tracker.processImage(image, static_cast<unsigned int>(40 * frame))
                                         : tracker.processImage(image, static_cast<unsigned int>(41 * frame));
            facts.number(name + ".faces", static_cast<double>(faces.size()));
            int i = 0;
            for (const auto& [id, face] : faces) {
                const std::string which = name + "." + std::to_string(i++);
                facts.number(which + ".person", known.emplace(id, known.size()).first->second);
                tell(facts, which, face);
            }
        }
    }
}

} // namespace

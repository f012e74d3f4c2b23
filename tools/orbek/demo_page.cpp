#include "demo_page.h"

#include "html.h"
#include "img/affine/transform.h"
#include "orbek/implementation/adapt.h"
#include "pictures.h"

#include <algorithm>
#include <cmath>

namespace Orbek::Tool {
namespace {

constexpr unsigned int thumbnailHeight = 200; ///< pixels
constexpr const char* style = R"css(
.facts{display:flex;flex-wrap:wrap;gap:.5rem 2rem;margin:0;padding:0;list-style:none}
.facts b{display:block;font-size:1.5rem}
.people{display:grid;grid-template-columns:repeat(auto-fill,minmax(15rem,1fr));gap:1rem}
.person{border:1px solid var(--line);border-radius:.5rem;padding:.75rem}
.person h3,.probe h3{font-size:1rem;margin:0 0 .5rem;overflow-wrap:anywhere}
.strip{display:flex;flex-wrap:wrap;gap:.4rem}
.strip figure{flex:0 0 4.5rem}
.probe{display:grid;grid-template-columns:8rem minmax(0,1fr);gap:1rem;padding:1rem 0;border-top:1px solid var(--line)}
.probe p{margin:0 0 .4rem}
.rank{display:grid;grid-template-columns:3rem 8rem minmax(4rem,1fr) 4rem 7rem;gap:.6rem;align-items:center;padding:.2rem 0}
.rank span{overflow-wrap:anywhere}
.rank b{font-variant-numeric:tabular-nums}
.bar{position:relative;height:.7rem;border-radius:.35rem;background:var(--track)}
.bar i{position:absolute;left:0;top:0;bottom:0;border-radius:.35rem;background:#8a95a5}
.bar i.over{background:var(--good)}
.bar u{position:absolute;top:-.25rem;bottom:-.25rem;width:2px;background:var(--ink)}
@media (max-width:40rem){.probe{grid-template-columns:minmax(0,1fr)}.probe figure{max-width:8rem}
.rank{grid-template-columns:2.5rem minmax(0,1fr) 4rem auto}.rank .bar{grid-column:1/5;grid-row:2}}
)css";

/// A picture with what was found, and how large it is, for others to refer to it by its id.
struct Drawn {
    std::string viewBox, content;

    std::string figure(const std::string& id = "") const {
        return "<figure><svg viewBox=\"" + viewBox + "\" role=\"img\"><g" +
               (id.empty() ? "" : " id=\"" + id + "\"") + ">" + content + "</g></svg></figure>";
    }
};

Drawn drawingOf(const Demonstration::Picture& picture) {
    if (!picture.readable) return {"0 0 3 4", "<title>cannot be read</title>"};
    const FNImage<Fn::Bgra32> image = readUpright(picture.file).toBgra32();
    const double scale = std::min(1.0, thumbnailHeight / static_cast<double>(image.h()));
    const auto side = [&](std::size_t pixels) {
        return static_cast<unsigned int>(std::max(std::lround(static_cast<double>(pixels) * scale), 1L));
    };
    FNImage<Fn::Bgra32> small(side(image.w()), side(image.h()));
    Img::Affine::transform(image, small);
    const double w = static_cast<double>(image.w()), h = static_cast<double>(image.h());
    const std::string width = Html::number(w), height = Html::number(h);
    Drawn drawn{"0 0 " + width + " " + height,
                "<title>" + Html::escaped(picture.file.filename().string()) + "</title><image width=\"" +
                    width + "\" height=\"" + height + "\" href=\"" +
                    Html::dataUrl(adapt(FNImageReferenceFactory::create(small), picture.file.string())) +
                    "\"/>"};
    if (picture.eyes) {
        const Position left = picture.eyes->first, right = picture.eyes->second;
        const double distance = std::hypot(right.x - left.x, right.y - left.y);
        const double x = (left.x + right.x) / 2.0, y = (left.y + right.y) / 2.0;
        drawn.content += Html::outlined(
            Html::rectangle(x - distance, y - 0.8 * distance, x + distance, y + 1.6 * distance), "head");
        for (const Position& eye : {left, right})
            drawn.content += Html::outlined(Html::circle(eye.x, eye.y, distance / 8), "eye");
    }
    return drawn;
}

std::string barOf(Score score, Score threshold) {
    const double share = std::clamp<double>(score, 0, 1) * 100;
    return "<div class=\"bar\" aria-hidden=\"true\"><i" +
           std::string(score >= threshold ? " class=\"over\"" : "") +
           " style=\"width:" + Html::number(share) +
           "%\"></i><u style=\"left:" + Html::number(std::clamp<double>(threshold, 0, 1) * 100) +
           "%\"></u></div>";
}

std::string rankOf(const std::string& thumbnail, const std::string& name, Score score, Score threshold) {
    return "<div class=\"rank\">" + thumbnail + "<span>" + Html::escaped(name) + "</span>" +
           barOf(score, threshold) + "<b>" + Html::number(score) + "</b>" +
           (score >= threshold ? Html::verdict("pass", "&#10003; match")
                               : Html::verdict("none", "no match")) +
           "</div>";
}

class Page {
public:
    explicit Page(const Demonstration& demo) : demo_(demo) {}

    std::string body() {
        // People first, since the pictures refer to theirs.
        const std::string people = section("Enrolled", "One record was made of the pictures of each person.",
                                           "<div class=\"people\">" + all(demo_.people) + "</div>");
        return about() + facts() + people +
               section(
                   "Verified and identified",
                   "These pictures were kept back. Each is compared with the record of the person that it "
                   "is said to show, and searched among all records. The mark on each bar is the threshold.",
                   all(demo_.probes));
    }

private:
    template <class List> std::string all(const List& list) {
        std::string text;
        for (const auto& item : list) text += show(item);
        return text;
    }
    static std::string section(const std::string& title, const std::string& sentence,
                               const std::string& body) {
        return "<section><h2>" + title + "</h2><p>" + sentence + "</p>" + body + "</section>\n";
    }

    std::string about() const {
        return demo_.about.empty() ? ""
                                   : "<section><p><b>" + Html::escaped(demo_.about) + "</b></p></section>\n";
    }

    std::string facts() const {
        std::size_t pictures = demo_.probes.size(), enrolled = 0, known = 0, right = 0, strangers = 0,
                    refused = 0;
        for (const auto& person : demo_.people) {
            pictures += person.pictures.size();
            enrolled += person.enrolled;
        }
        for (const auto& probe : demo_.probes) {
            const bool found = !probe.candidates.empty() && probe.candidates.front().score >= demo_.threshold;
            if (probe.person) {
                ++known;
                right += found && probe.candidates.front().person == *probe.person;
            } else {
                ++strangers;
                refused += !found;
            }
        }
        const auto fact = [](const std::string& number, const std::string& text) {
            return "<li><b>" + number + "</b>" + text + "</li>";
        };
        std::string list = fact(std::to_string(enrolled), "people enrolled") +
                           fact(std::to_string(pictures), "pictures") +
                           fact(std::to_string(right) + " of " + std::to_string(known), "found again");
        if (strangers)
            list +=
                fact(std::to_string(refused) + " of " + std::to_string(strangers), "strangers turned away");
        list += fact(Html::number(demo_.threshold), "threshold, at which " + Html::number(demo_.far * 100) +
                                                        " % of other people are accepted");
        list += fact(Html::number(demo_.seconds) + " s", "for all of it");
        return "<section><ul class=\"facts\">" + list + "</ul></section>\n";
    }

    std::string show(const Demonstration::Person& person) {
        std::string pictures;
        for (const auto& picture : person.pictures) {
            const Drawn drawn = drawingOf(picture);
            const bool first = pictures.empty();
            pictures += drawn.figure(first ? idOf(portraits_.size()) : "");
            if (first) portraits_.push_back(drawn.viewBox);
        }
        return "<article class=\"person\"><h3>" + Html::escaped(person.name) + " " +
               (person.enrolled ? Html::verdict("pass", "&#10003; enrolled")
                                : Html::verdict("fail", "&#10007; no eyes found")) +
               "</h3><div class=\"strip\">" + pictures + "</div></article>\n";
    }

    std::string show(const Demonstration::Probe& probe) {
        std::string text = "<article class=\"probe\">" + drawingOf(probe.picture).figure() + "<div><h3>" +
                           Html::escaped(probe.picture.file.filename().string()) +
                           (probe.person ? "" : ", a stranger") + "</h3>";
        if (!probe.picture.eyes)
            return text + Html::verdict("fail", "&#10007; no eyes found") + "</div></article>\n";
        if (probe.score)
            text += "<p>Is it " + Html::escaped(probe.name) + "?</p>" +
                    rankOf(thumbnailOf(*probe.person), probe.name, *probe.score, demo_.threshold);
        text += "<p>Who is it?</p>";
        for (const auto& [person, score] : probe.candidates)
            text += rankOf(thumbnailOf(person), demo_.people[person].name, score, demo_.threshold);
        return text + "</div></article>\n";
    }

    static std::string idOf(std::size_t person) { return "person" + std::to_string(person); }
    /// The first picture of a person who was shown.
    std::string thumbnailOf(std::size_t person) const {
        return "<svg viewBox=\"" + portraits_[person] + "\" aria-hidden=\"true\"><use href=\"#" +
               idOf(person) + "\"/></svg>";
    }

    const Demonstration& demo_;
    std::vector<std::string> portraits_; ///< view boxes of the people's first pictures
};

} // namespace

std::string demonstrationPage(const Demonstration& demonstration) {
    return Html::page("Faces enrolled, verified and identified", style, Page(demonstration).body());
}

} // namespace Orbek::Tool

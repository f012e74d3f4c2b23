#include "portrait_page.h"

#include "html.h"
#include "whole_file.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <sstream>

namespace Orbek::Tool {
namespace {

constexpr const char* style = R"css(
nav ul,.legend{list-style:none;margin:0;padding:0}
nav li{display:flex;flex-wrap:wrap;gap:.35rem .75rem;align-items:center;padding:.3rem 0}
nav a{color:#0b4fa8;overflow-wrap:anywhere}
.portrait{display:grid;grid-template-columns:minmax(16rem,24rem) minmax(0,1fr);gap:1.5rem;align-items:start}
.pictures{display:grid;gap:1rem;position:sticky;top:1rem}
figure.token img{max-width:15rem}
.legend{display:flex;flex-wrap:wrap;gap:.2rem 1rem;margin-top:.35rem}
.legend i{display:inline-block;width:1.4rem;border-top:3px solid;margin-right:.4rem;vertical-align:middle}
.place{stroke:#5cc8ff;stroke-width:2;fill:#5cc8ff;fill-opacity:.12;stroke-dasharray:6 4;vector-effect:non-scaling-stroke}
.axis{stroke:#fff;stroke-width:1;stroke-dasharray:2 4;vector-effect:non-scaling-stroke}
table{width:100%;border-collapse:collapse;margin-bottom:1rem}
caption{text-align:left;font-weight:600;padding:.25rem 0}
th,td{text-align:left;vertical-align:top;padding:.45rem .5rem;border-top:1px solid var(--line)}
th:first-child,td:first-child{padding-left:0}
thead th{font-size:.8125rem;color:var(--soft);font-weight:600;border-top:0;padding-bottom:.15rem}
tbody th,thead th:first-child{width:16rem;font-weight:500}
tbody th small{display:block;color:var(--soft);font-weight:400}
td.outcome,th.outcome{width:6.5rem;text-align:right;padding-right:0}
.value{display:grid;grid-template-columns:minmax(10.5rem,1fr) 7rem minmax(5rem,1.1fr);gap:.25rem .75rem;align-items:center}
.value+.value{margin-top:.25rem}
.value b{font-weight:600;font-variant-numeric:tabular-nums}
.value span.limits{color:var(--soft);font-size:.875rem;font-variant-numeric:tabular-nums}
.scale{position:relative;height:.6rem;border-radius:.3rem;background:var(--track);overflow:visible}
.scale i{position:absolute;top:0;bottom:0;background:var(--allowed);border-radius:.3rem}
.scale u{position:absolute;top:-.2rem;bottom:-.2rem;width:.25rem;margin-left:-.125rem;border-radius:.125rem;background:var(--good)}
.scale u.off{background:#b3261e}
@media (max-width:60rem){.portrait{grid-template-columns:minmax(0,1fr)}.pictures{position:static;grid-template-columns:minmax(0,2fr) minmax(0,1fr)}}
@media (max-width:40rem){.pictures{grid-template-columns:minmax(0,1fr)}thead{position:absolute;width:1px;height:1px;overflow:hidden;clip-path:inset(50%)}
table,caption,tbody,tr{display:block}tr{display:grid;grid-template-columns:minmax(0,1fr) auto;gap:.15rem .5rem;padding:.6rem 0;
border-top:1px solid var(--line)}tbody th,td,td.outcome{display:block;width:auto;padding:0;border:0}
td.values{grid-row:2;grid-column:1/3}.value{grid-template-columns:minmax(0,1fr) auto}.value .scale{grid-column:1/3}}
)css";

std::string verdictOf(const PortraitCheck& check) {
    if (!check.passed) return Html::verdict("none", "no colour");
    if (*check.passed) return Html::verdict("pass", "&#10003; pass");
    return check.required ? Html::verdict("fail", "&#10007; fail")
                          : Html::verdict("unmet", "&#9651; not met");
}

/// Whether a value alone is allowed; a test may pass nevertheless, by another one.
bool isAllowed(const CheckedValue& v) {
    const bool enough = !v.least || (v.strict ? v.value > *v.least : v.value >= *v.least);
    return enough && (!v.greatest || (v.strict ? v.value < *v.greatest : v.value <= *v.greatest));
}

std::string scaleOf(const CheckedValue& v) {
    const auto place = [&](double value) {
        return std::isnan(value) ? 0 : std::clamp((value - v.from) / (v.to - v.from), 0.0, 1.0) * 100;
    };
    const double first = v.least ? place(*v.least) : 0, last = v.greatest ? place(*v.greatest) : 100;
    constexpr double thinnest = 4; // so that a single allowed value is seen
    return "<div class=\"scale\" aria-hidden=\"true\"><i style=\"left:" +
           Html::number(std::min(first, 100 - thinnest)) +
           "%;width:" + Html::number(std::max(last - first, thinnest)) + "%\"></i><u" +
           (isAllowed(v) ? "" : " class=\"off\"") + " style=\"left:" + Html::number(place(v.value)) +
           "%\"></u></div>";
}

std::string rowOf(const PortraitCheck& check) {
    std::string row = "<tr data-test=\"" + check.name + "\"><th scope=\"row\">" + Html::escaped(check.title) +
                      "<small>" + (check.required ? "required" : "recommended") +
                      "</small></th><td class=\"values\">";
    for (const CheckedValue& value : check.values)
        row += "<div class=\"value\"><span>" + Html::escaped(value.label) + (value.label.empty() ? "" : " ") +
               "<b>" + value.valueText() + "</b></span><span class=\"limits\">" + value.limitsText() +
               "</span>" + scaleOf(value) + "</div>";
    if (check.values.empty()) row += "<span class=\"limits\">for colour pictures only</span>";
    return row + "</td><td class=\"outcome\">" + verdictOf(check) + "</td></tr>\n";
}

std::string tableOf(const std::vector<PortraitCheck>& checks) {
    std::string tables, group;
    for (const PortraitCheck& check : checks) {
        if (check.group != group) {
            tables += group.empty() ? "" : "</tbody></table>\n";
            group = check.group;
            tables +=
                "<table><caption>" + Html::escaped(group) +
                "</caption><thead><tr><th scope=\"col\">Test</th><th scope=\"col\"><div class=\"value\">"
                "<span>Value</span><span>Allowed</span><span></span></div></th>"
                "<th scope=\"col\" class=\"outcome\">Verdict</th></tr></thead><tbody>\n";
        }
        tables += rowOf(check);
    }
    return tables + "</tbody></table>\n";
}

std::string line(double x0, double y0, double x1, double y1) {
    return "line x1=\"" + Html::number(x0) + "\" y1=\"" + Html::number(y0) + "\" x2=\"" + Html::number(x1) +
           "\" y2=\"" + Html::number(y1) + "\"";
}

std::string drawingOf(const AssessedPortrait& a) {
    const double w = a.portrait.width(), h = a.portrait.height();
    const Box head = earToEarChinCrownSurroundingBox(a.portrait);
    const double radius = std::max(a.portrait.eyeDistance() / 8.0, 1.0);
    std::string svg =
        "<svg viewBox=\"0 0 " + Html::number(w) + " " + Html::number(h) +
        "\" role=\"img\" aria-label=\"The picture with the box of the head, the eyes and the place "
        "where the middle of the eyes may be\"><image width=\"" +
        Html::number(w) + "\" height=\"" + Html::number(h) + "\" href=\"" + Html::dataUrl(a.image) + "\"/>";
    svg += Html::outlined(
        Html::rectangle(w * a.limits.leftBoundCenteredFace(), h * a.limits.lowerBoundVerticalPosition(),
                        w * a.limits.rightBoundCenteredFace(), h * a.limits.upperBoundVerticalPosition()),
        "place");
    svg += "<" + line(w / 2, 0, w / 2, h) + " class=\"axis\"/>";
    svg += Html::outlined(Html::rectangle(head.x0, head.y0, head.x1, head.y1), "head");
    const Position center = a.portrait.faceCenter();
    for (const Position& eye : {a.eyes.first, a.eyes.second})
        svg += Html::outlined(Html::circle(eye.x, eye.y, radius), "eye");
    svg += Html::outlined(line(a.eyes.first.x, a.eyes.first.y, a.eyes.second.x, a.eyes.second.y), "eye");
    svg += Html::outlined(line(center.x, center.y - radius, center.x, center.y + radius), "eye");
    return svg + "</svg>";
}

std::string verdictsOf(const ISO_19794_5::FullFrontal::Compliance& compliance) {
    return (compliance.isCompliant() ? Html::verdict("pass", "&#10003; compliant")
                                     : Html::verdict("fail", "&#10007; not compliant")) +
           (compliance.isBestPractice() ? Html::verdict("pass", "&#10003; best practice")
                                        : Html::verdict("unmet", "&#9651; not best practice"));
}

std::string bodyOf(const AssessedPortrait& a) {
    std::string body =
        "<div class=\"portrait\"><div class=\"pictures\"><figure>" + drawingOf(a) + "<figcaption>" +
        std::to_string(a.portrait.width()) + " &times; " + std::to_string(a.portrait.height()) +
        " pixels<ul class=\"legend\"><li><i style=\"color:#c99700\"></i>head</li><li><i "
        "style=\"color:#118a4e\"></i>eyes</li><li><i style=\"color:#1783b8;border-top-style:dashed\"></i>"
        "where their middle may be</li></ul></figcaption></figure>";
    if (a.token)
        body += "<figure class=\"token\"><img src=\"" + Html::dataUrl(a.token) + "\" width=\"" +
                std::to_string(a.token->width()) + "\" height=\"" + std::to_string(a.token->height()) +
                "\" alt=\"Token image: the face cut out, with level eyes\"><figcaption>Token image, " +
                std::to_string(a.token->width()) + " &times; " + std::to_string(a.token->height()) +
                " pixels</figcaption></figure>";
    return body + "</div><div><p class=\"verdicts\">" + verdictsOf(a.compliance) +
           "</p><p>Estimated: " + Html::escaped(featuresText(a.features)) + ".</p>\n" + tableOf(a.checks) +
           "</div></div>";
}

} // namespace

std::string featuresText(const Portrait::Feature::Set& features) {
    using namespace Portrait::Feature;
    constexpr std::array ethnicities{"white", "black", "asian"};
    return std::string(features.gender() == Gender::Male ? "male" : "female") + ", " +
           ethnicities.at(static_cast<std::size_t>(features.ethnicity())) + ", about " +
           std::to_string(std::lround(features.age())) + " years, " +
           (features.wearsGlasses() ? "glasses" : "no glasses");
}

void PortraitPage::add(const std::string& file, const AssessedPortrait& portrait) {
    entries_.push_back({file, verdictsOf(portrait.compliance), bodyOf(portrait)});
}

void PortraitPage::add(const std::string& file, const std::string& reason) {
    entries_.push_back(
        {file, Html::verdict("fail", "&#10007; not compliant"), "<p>" + Html::escaped(reason) + "</p>"});
}

void PortraitPage::write(const std::string& fileName) const {
    std::ostringstream body;
    if (entries_.size() > 1) {
        body << "<nav aria-label=\"Pictures\"><ul>\n";
        for (std::size_t i = 0; i < entries_.size(); ++i)
            body << "<li><a href=\"#p" << i << "\">" << Html::escaped(entries_[i].file) << "</a>"
                 << entries_[i].verdicts << "</li>\n";
        body << "</ul></nav>\n";
    }
    for (std::size_t i = 0; i < entries_.size(); ++i)
        body << "<section id=\"p" << i << "\" aria-labelledby=\"h" << i << "\"><h2 id=\"h" << i << "\">"
             << Html::escaped(entries_[i].file) << "</h2>\n"
             << entries_[i].body << "</section>\n";
    writeWhole(fileName, Html::page("Portraits for identity documents", style, body.str()));
}

} // namespace Orbek::Tool

#include "portrait_page.h"

#include "fn/mime64.h"
#include "orbek/image_io.h"
#include "whole_file.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <sstream>

namespace Orbek::Tool {
namespace {

constexpr int pictureQuality = 90;

constexpr const char* style = R"css(
:root{color-scheme:light;--ink:#1b2027;--soft:#56606d;--line:#dfe3e8;--good:#0b5d34;--goodback:#dff3e7;--bad:#8f1d18;
--badback:#fde6e3;--note:#6a4400;--noteback:#fff0cf;--track:#e6e9ee;--allowed:#9ed4b3}
*{box-sizing:border-box}
body{margin:0;background:#f5f6f8;color:var(--ink);font:16px/1.45 system-ui,-apple-system,"Segoe UI",Roboto,
"Noto Sans","DejaVu Sans",sans-serif}
main{max-width:80rem;margin:0 auto;padding:1.25rem}
h1{font-size:1.5rem;margin:.25rem 0 1rem}
h2{font-size:1.2rem;margin:0 0 .75rem;overflow-wrap:anywhere}
nav ul,.legend{list-style:none;margin:0;padding:0}
nav,section{background:#fff;border:1px solid var(--line);border-radius:.75rem;padding:1.25rem;margin-bottom:1.25rem}
nav li{display:flex;flex-wrap:wrap;gap:.35rem .75rem;align-items:center;padding:.3rem 0}
nav a{color:#0b4fa8;overflow-wrap:anywhere}
.portrait{display:grid;grid-template-columns:minmax(16rem,24rem) minmax(0,1fr);gap:1.5rem;align-items:start}
.verdicts{display:flex;flex-wrap:wrap;gap:.5rem;margin:0 0 1rem}
.verdict{display:inline-block;border-radius:1rem;padding:.1rem .7rem;font-weight:600;font-size:.875rem;white-space:nowrap}
.pass{background:var(--goodback);color:var(--good)}
.fail{background:var(--badback);color:var(--bad)}
.unmet{background:var(--noteback);color:var(--note)}
.none{background:#eceff3;color:var(--soft)}
.pictures{display:grid;gap:1rem;position:sticky;top:1rem}
figure{margin:0}
figure svg,figure img{display:block;width:100%;height:auto;border-radius:.5rem;background:#ddd}
figure.token img{max-width:15rem}
figcaption{color:var(--soft);font-size:.875rem;margin-top:.35rem}
.legend{display:flex;flex-wrap:wrap;gap:.2rem 1rem;margin-top:.35rem}
.legend i{display:inline-block;width:1.4rem;border-top:3px solid;margin-right:.4rem;vertical-align:middle}
.halo{stroke:#000;stroke-opacity:.45;stroke-width:4;fill:none;vector-effect:non-scaling-stroke}
.head{stroke:#ffd23f;stroke-width:2;fill:none;vector-effect:non-scaling-stroke}
.eye{stroke:#35e08a;stroke-width:2;fill:none;vector-effect:non-scaling-stroke}
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
@media (max-width:40rem){main{padding:.6rem}nav,section{padding:.8rem;border-radius:.5rem}
.pictures{grid-template-columns:minmax(0,1fr)}thead{position:absolute;width:1px;height:1px;overflow:hidden;clip-path:inset(50%)}
table,caption,tbody,tr{display:block}tr{display:grid;grid-template-columns:minmax(0,1fr) auto;gap:.15rem .5rem;padding:.6rem 0;
border-top:1px solid var(--line)}tbody th,td,td.outcome{display:block;width:auto;padding:0;border:0}
td.values{grid-row:2;grid-column:1/3}.value{grid-template-columns:minmax(0,1fr) auto}.value .scale{grid-column:1/3}}
@media print{body{background:#fff}section{break-inside:avoid}}
)css";

std::string escaped(const std::string& text) {
    std::string result;
    for (const char c : text) {
        switch (c) {
        case '&':
            result += "&amp;";
            break;
        case '<':
            result += "&lt;";
            break;
        case '>':
            result += "&gt;";
            break;
        case '"':
            result += "&quot;";
            break;
        default:
            result += c;
        }
    }
    return result;
}

/// A coordinate or a percentage.
std::string number(double value) {
    std::array<char, 64> text;
    std::snprintf(text.data(), text.size(), "%.2f", value);
    return text.data();
}

std::string dataUrl(const Image& image) {
    std::ostringstream file;
    Jpeg::save(image, file, pictureQuality);
    const std::string bytes = file.str();
    FNRMem<unsigned char> block(bytes.size());
    std::copy(bytes.begin(), bytes.end(), block.getExclusive());
    return "data:image/jpeg;base64," + FNEncodeMime64(block);
}

std::string verdict(const char* kind, const std::string& text) {
    return std::string("<span class=\"verdict ") + kind + "\">" + text + "</span>";
}

std::string verdictOf(const PortraitCheck& check) {
    if (!check.passed) return verdict("none", "no colour");
    if (*check.passed) return verdict("pass", "&#10003; pass");
    return check.required ? verdict("fail", "&#10007; fail") : verdict("unmet", "&#9651; not met");
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
           number(std::min(first, 100 - thinnest)) + "%;width:" + number(std::max(last - first, thinnest)) +
           "%\"></i><u" + (isAllowed(v) ? "" : " class=\"off\"") + " style=\"left:" + number(place(v.value)) +
           "%\"></u></div>";
}

std::string rowOf(const PortraitCheck& check) {
    std::string row = "<tr data-test=\"" + check.name + "\"><th scope=\"row\">" + escaped(check.title) +
                      "<small>" + (check.required ? "required" : "recommended") +
                      "</small></th><td class=\"values\">";
    for (const CheckedValue& value : check.values)
        row += "<div class=\"value\"><span>" + escaped(value.label) + (value.label.empty() ? "" : " ") +
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
                "<table><caption>" + escaped(group) +
                "</caption><thead><tr><th scope=\"col\">Test</th><th scope=\"col\"><div class=\"value\">"
                "<span>Value</span><span>Allowed</span><span></span></div></th>"
                "<th scope=\"col\" class=\"outcome\">Verdict</th></tr></thead><tbody>\n";
        }
        tables += rowOf(check);
    }
    return tables + "</tbody></table>\n";
}

/// A shape with a dark edge, so that it is seen on any picture.
std::string outlined(const std::string& element, const char* kind) {
    return "<" + element + " class=\"halo\"/><" + element + " class=\"" + kind + "\"/>";
}

std::string rectangle(double x0, double y0, double x1, double y1) {
    return "rect x=\"" + number(x0) + "\" y=\"" + number(y0) + "\" width=\"" +
           number(std::max(x1 - x0, 0.0)) + "\" height=\"" + number(std::max(y1 - y0, 0.0)) + "\"";
}

std::string line(double x0, double y0, double x1, double y1) {
    return "line x1=\"" + number(x0) + "\" y1=\"" + number(y0) + "\" x2=\"" + number(x1) + "\" y2=\"" +
           number(y1) + "\"";
}

std::string drawingOf(const AssessedPortrait& a) {
    const double w = a.portrait.width(), h = a.portrait.height();
    const Box head = earToEarChinCrownSurroundingBox(a.portrait);
    const double radius = std::max(a.portrait.eyeDistance() / 8.0, 1.0);
    std::string svg =
        "<svg viewBox=\"0 0 " + number(w) + " " + number(h) +
        "\" role=\"img\" aria-label=\"The picture with the box of the head, the eyes and the place "
        "where the middle of the eyes may be\"><image width=\"" +
        number(w) + "\" height=\"" + number(h) + "\" href=\"" + dataUrl(a.image) + "\"/>";
    svg +=
        outlined(rectangle(w * a.limits.leftBoundCenteredFace(), h * a.limits.lowerBoundVerticalPosition(),
                           w * a.limits.rightBoundCenteredFace(), h * a.limits.upperBoundVerticalPosition()),
                 "place");
    svg += "<" + line(w / 2, 0, w / 2, h) + " class=\"axis\"/>";
    svg += outlined(rectangle(head.x0, head.y0, head.x1, head.y1), "head");
    const Position center = a.portrait.faceCenter();
    for (const Position& eye : {a.eyes.first, a.eyes.second})
        svg += outlined("circle cx=\"" + number(eye.x) + "\" cy=\"" + number(eye.y) + "\" r=\"" +
                            number(radius) + "\"",
                        "eye");
    svg += outlined(line(a.eyes.first.x, a.eyes.first.y, a.eyes.second.x, a.eyes.second.y), "eye");
    svg += outlined(line(center.x, center.y - radius, center.x, center.y + radius), "eye");
    return svg + "</svg>";
}

std::string verdictsOf(const ISO_19794_5::FullFrontal::Compliance& compliance) {
    return (compliance.isCompliant() ? verdict("pass", "&#10003; compliant")
                                     : verdict("fail", "&#10007; not compliant")) +
           (compliance.isBestPractice() ? verdict("pass", "&#10003; best practice")
                                        : verdict("unmet", "&#9651; not best practice"));
}

std::string bodyOf(const AssessedPortrait& a) {
    std::string body =
        "<div class=\"portrait\"><div class=\"pictures\"><figure>" + drawingOf(a) + "<figcaption>" +
        std::to_string(a.portrait.width()) + " &times; " + std::to_string(a.portrait.height()) +
        " pixels<ul class=\"legend\"><li><i style=\"color:#c99700\"></i>head</li><li><i "
        "style=\"color:#118a4e\"></i>eyes</li><li><i style=\"color:#1783b8;border-top-style:dashed\"></i>"
        "where their middle may be</li></ul></figcaption></figure>";
    if (a.token)
        body += "<figure class=\"token\"><img src=\"" + dataUrl(a.token) + "\" width=\"" +
                std::to_string(a.token->width()) + "\" height=\"" + std::to_string(a.token->height()) +
                "\" alt=\"Token image: the face cut out, with level eyes\"><figcaption>Token image, " +
                std::to_string(a.token->width()) + " &times; " + std::to_string(a.token->height()) +
                " pixels</figcaption></figure>";
    return body + "</div><div><p class=\"verdicts\">" + verdictsOf(a.compliance) +
           "</p><p>Estimated: " + escaped(featuresText(a.features)) + ".</p>\n" + tableOf(a.checks) +
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
    entries_.push_back({file, verdict("fail", "&#10007; not compliant"), "<p>" + escaped(reason) + "</p>"});
}

void PortraitPage::write(const std::string& fileName) const {
    std::ostringstream page;
    page << "<!DOCTYPE html>\n<html lang=\"en\"><head><meta charset=\"utf-8\">\n"
            "<meta name=\"viewport\" "
            "content=\"width=device-width,initial-scale=1\">\n<title>Portraits</title>\n<style>"
         << style << "</style></head>\n<body><main><h1>Portraits for identity documents</h1>\n";
    if (entries_.size() > 1) {
        page << "<nav aria-label=\"Pictures\"><ul>\n";
        for (std::size_t i = 0; i < entries_.size(); ++i)
            page << "<li><a href=\"#p" << i << "\">" << escaped(entries_[i].file) << "</a>"
                 << entries_[i].verdicts << "</li>\n";
        page << "</ul></nav>\n";
    }
    for (std::size_t i = 0; i < entries_.size(); ++i)
        page << "<section id=\"p" << i << "\" aria-labelledby=\"h" << i << "\"><h2 id=\"h" << i << "\">"
             << escaped(entries_[i].file) << "</h2>\n"
             << entries_[i].body << "</section>\n";
    page << "</main></body></html>\n";
    writeWhole(fileName, page.str());
}

} // namespace Orbek::Tool

#include "html.h"

#include "fn/mime64.h"
#include "orbek/image_io.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <sstream>

namespace Orbek::Tool::Html {
namespace {

constexpr int pictureQuality = 90;

constexpr const char* commonStyle = R"css(
:root{color-scheme:light;--ink:#1b2027;--soft:#56606d;--line:#dfe3e8;--good:#0b5d34;--goodback:#dff3e7;--bad:#8f1d18;
--badback:#fde6e3;--note:#6a4400;--noteback:#fff0cf;--track:#e6e9ee;--allowed:#9ed4b3}
*{box-sizing:border-box}
body{margin:0;background:#f5f6f8;color:var(--ink);font:16px/1.45 system-ui,-apple-system,"Segoe UI",Roboto,
"Noto Sans","DejaVu Sans",sans-serif}
main{max-width:80rem;margin:0 auto;padding:1.25rem}
h1{font-size:1.5rem;margin:.25rem 0 1rem}
h2{font-size:1.2rem;margin:0 0 .75rem;overflow-wrap:anywhere}
nav,section{background:#fff;border:1px solid var(--line);border-radius:.75rem;padding:1.25rem;margin-bottom:1.25rem}
.verdicts{display:flex;flex-wrap:wrap;gap:.5rem;margin:0 0 1rem}
.verdict{display:inline-block;border-radius:1rem;padding:.1rem .7rem;font-weight:600;font-size:.875rem;white-space:nowrap}
.pass{background:var(--goodback);color:var(--good)}
.fail{background:var(--badback);color:var(--bad)}
.unmet{background:var(--noteback);color:var(--note)}
.none{background:#eceff3;color:var(--soft)}
figure{margin:0}
figure svg,figure img{display:block;width:100%;height:auto;border-radius:.5rem;background:#ddd}
figcaption{color:var(--soft);font-size:.875rem;margin-top:.35rem}
.halo{stroke:#000;stroke-opacity:.45;stroke-width:4;fill:none;vector-effect:non-scaling-stroke}
.head{stroke:#ffd23f;stroke-width:2;fill:none;vector-effect:non-scaling-stroke}
.eye{stroke:#35e08a;stroke-width:2;fill:none;vector-effect:non-scaling-stroke}
@media (max-width:40rem){main{padding:.6rem}nav,section{padding:.8rem;border-radius:.5rem}}
@media print{body{background:#fff}section{break-inside:avoid}}
)css";

} // namespace

std::string page(const std::string& title, const std::string& style, const std::string& body) {
    return "<!DOCTYPE html>\n<html lang=\"en\"><head><meta charset=\"utf-8\">\n<meta name=\"viewport\" "
           "content=\"width=device-width,initial-scale=1\">\n<title>" +
           title + "</title>\n<style>" + commonStyle + style + "</style></head>\n<body><main><h1>" + title +
           "</h1>\n" + body + "</main></body></html>\n";
}

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

std::string outlined(const std::string& shape, const char* kind) {
    return "<" + shape + " class=\"halo\"/><" + shape + " class=\"" + kind + "\"/>";
}

std::string rectangle(double x0, double y0, double x1, double y1) {
    return "rect x=\"" + number(x0) + "\" y=\"" + number(y0) + "\" width=\"" +
           number(std::max(x1 - x0, 0.0)) + "\" height=\"" + number(std::max(y1 - y0, 0.0)) + "\"";
}

std::string circle(double x, double y, double radius) {
    return "circle cx=\"" + number(x) + "\" cy=\"" + number(y) + "\" r=\"" + number(radius) + "\"";
}

} // namespace Orbek::Tool::Html

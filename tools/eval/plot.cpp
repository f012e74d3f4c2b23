#include "eval/plot.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace Eval {
namespace {

constexpr double width = 640, height = 440, left = 70, right = 20, top = 40, bottom = 60;
constexpr const char* colours[] = {"#1b6ca8", "#c8553d", "#3a7d44", "#7b5ea7", "#8d6e2f"};

std::string escaped(const std::string& text) {
    std::string result;
    for (const char c : text) {
        if (c == '<')
            result += "&lt;";
        else if (c == '&')
            result += "&amp;";
        else
            result += c;
    }
    return result;
}

template <class... Args> std::string printed(const char* format, Args... args) {
    char buffer[512];
    std::snprintf(buffer, sizeof buffer, format, args...);
    return buffer;
}

/// From 0 at the lower to 1 at the upper end.
double along(const Axis& axis, double value) {
    if (axis.logarithmic)
        return std::log(std::max(value, axis.least) / axis.least) / std::log(axis.most / axis.least);
    return (value - axis.least) / (axis.most - axis.least);
}

double placeX(const Axis& axis, double value) {
    return left + (width - left - right) * along(axis, value);
}
double placeY(const Axis& axis, double value) {
    return height - bottom - (height - top - bottom) * along(axis, value);
}

std::vector<double> ticks(const Axis& axis) {
    constexpr int steps = 5;
    std::vector<double> values;
    if (axis.logarithmic)
        for (double value = axis.least; value <= axis.most * 1.0001; value *= 10) values.push_back(value);
    else
        for (int i = 0; i <= steps; ++i) values.push_back(axis.least + (axis.most - axis.least) * i / steps);
    return values;
}

std::string grid(const Axis& x, const Axis& y) {
    std::string svg;
    constexpr const char* line = "<line x1=\"%.1f\" y1=\"%.1f\" x2=\"%.1f\" y2=\"%.1f\" stroke=\"#ccc\"/>\n";
    constexpr const char* label = "<text x=\"%.1f\" y=\"%.1f\" text-anchor=\"%s\">%g</text>\n";
    for (const double value : ticks(x)) {
        svg += printed(line, placeX(x, value), top, placeX(x, value), height - bottom);
        svg += printed(label, placeX(x, value), height - bottom + 18, "middle", value);
    }
    for (const double value : ticks(y)) {
        svg += printed(line, left, placeY(y, value), width - right, placeY(y, value));
        svg += printed(label, left - 6, placeY(y, value) + 4, "end", value);
    }
    return svg;
}

} // namespace

std::string plotSvg(const std::string& title, const Axis& x, const Axis& y,
                    const std::vector<Curve>& curves) {
    std::string svg = printed("<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"%g\" height=\"%g\" "
                              "font-family=\"sans-serif\" font-size=\"12\">\n"
                              "<rect width=\"100%%\" height=\"100%%\" fill=\"white\"/>\n",
                              width, height);
    svg += grid(x, y);
    const std::string centred = "\" text-anchor=\"middle\">";
    svg +=
        printed("<text x=\"%g\" y=\"24\" font-size=\"15", width / 2) + centred + escaped(title) + "</text>\n";
    svg +=
        printed("<text x=\"%g\" y=\"%g", width / 2, height - 16) + centred + escaped(x.title) + "</text>\n";
    svg += printed("<text transform=\"translate(18 %g) rotate(-90)", height / 2) + centred +
           escaped(y.title) + "</text>\n";
    for (std::size_t i = 0; i < curves.size(); ++i) {
        const char* const colour = colours[i % std::size(colours)];
        svg += printed("<polyline fill=\"none\" stroke-width=\"2\" stroke=\"%s\" points=\"", colour);
        for (const auto& [px, py] : curves[i].points)
            svg += printed("%.1f,%.1f ", placeX(x, px), placeY(y, py));
        svg += "\"/>\n";
        if (curves.size() > 1)
            svg += printed("<text x=\"%g\" y=\"%g\" fill=\"%s\" text-anchor=\"end\">", width - right - 8,
                           height - bottom - 12 - 16 * static_cast<double>(i), colour) +
                   escaped(curves[i].name) + "</text>\n";
    }
    return svg + "</svg>\n";
}

} // namespace Eval

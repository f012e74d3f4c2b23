#pragma once

#include <string>
#include <utility>
#include <vector>

namespace Eval {

/// A curve for a picture in a report.
struct Curve {
    std::string name;
    std::vector<std::pair<double, double>> points;
};

struct Axis {
    std::string title;
    double least, most;
    bool logarithmic = false; ///< then `least` is above 0, and points below it are drawn at it
};

/// A plot of curves as an SVG document with grid, axis titles and, for several curves, a legend.
std::string plotSvg(const std::string& title, const Axis& x, const Axis& y, const std::vector<Curve>& curves);

} // namespace Eval

#pragma once

#include <cmath>

/// From the indexes of a spectrum of w by h points to frequencies.
class ImgFSConv {
public:
    ImgFSConv(int w, int h) : w_(w), h_(h), perWidth_(1.0 / w), perHeight_(1.0 / h) {}

    /// Signed frequency in cycles per image; index w / 2 of an even size counts as positive.
    void spatial(int x, int y, int& sx, int& sy) const {
        sx = x <= w_ / 2 ? x : x - w_;
        sy = y <= h_ / 2 ? y : y - h_;
    }

    /// Frequency `r` in cycles per pixel and its direction `phi` in radians.
    void frequency(int x, int y, double& r, double& phi) const {
        int sx, sy;
        spatial(x, y, sx, sy);
        const double fx = sx * perWidth_, fy = sy * perHeight_;
        r = std::sqrt(fx * fx + fy * fy);
        phi = std::atan2(fy, fx);
    }

    /// Period `p` in pixels (infinite at the zero frequency) and its direction `phi` in radians.
    void period(int x, int y, double& p, double& phi) const {
        frequency(x, y, p, phi);
        p = 1 / p;
    }

private:
    int w_, h_;
    double perWidth_, perHeight_;
};

#include "eval/yardsticks.h"

#ifndef ORBEK_YARDSTICKS

namespace Eval {

std::vector<std::string> yardstickNames() {
    return {};
}
std::optional<FaceFinder> makeYardstick(const std::string&) {
    return {};
}

} // namespace Eval

#else

#include "fn/image_reference.h"
#include "fn/image_representation.h"

#include <algorithm>
#include <mutex>

#include <dlib/image_processing/frontal_face_detector.h>
#include <opencv2/imgproc.hpp>
#include <opencv2/objdetect.hpp>

namespace Eval {
namespace {

/// Where the eyes lie in a square box, and how far apart, in box widths.
struct BoxGeometry {
    float eyeDistance, eyeLine;

    FaceFinder::Location location(double x, double y, double width, double confidence) const {
        FaceFinder::Location face;
        face.pos = {static_cast<float>(x + width / 2), static_cast<float>(y + eyeLine * width)};
        face.width = static_cast<float>(eyeDistance * width);
        face.confidence = static_cast<float>(confidence);
        return face;
    }
};

cv::Mat grayOf(const FNImageReference& image) {
    const FNImage<unsigned char> mono = image.toMono8();
    cv::Mat result(static_cast<int>(mono.h()), static_cast<int>(mono.w()), CV_8UC1);
    for (std::uint32_t y = 0; y < mono.h(); ++y)
        std::copy_n(mono.row(y), mono.w(), result.ptr(static_cast<int>(y)));
    return result;
}

class Haar : public FaceFinder::Body {
public:
    Haar() : cascade_(ORBEK_HAAR_CASCADE) {
        cv::setNumThreads(1); // the others have one, too
    }

    bool find(const FNImageReference& image, std::list<FaceFinder::Location>& locations, double minRelEyeDist,
              double maxRelEyeDist, const FNBox&) const override {
        constexpr BoxGeometry geometry{0.40f, 0.39f};
        constexpr double scaleStep = 1.1;
        constexpr int neighbours = 1;
        const auto side = [&](double relative) {
            return static_cast<int>(std::lround(relative * image.w() / geometry.eyeDistance));
        };
        std::vector<cv::Rect> boxes;
        std::vector<int> levels;
        std::vector<double> weights;
        {
            const std::lock_guard lock(mutex_);
            cascade_.detectMultiScale(grayOf(image), boxes, levels, weights, scaleStep, neighbours, 0,
                                      cv::Size(side(minRelEyeDist), side(minRelEyeDist)),
                                      cv::Size(side(maxRelEyeDist), side(maxRelEyeDist)), true);
        }
        locations.clear();
        for (std::size_t i = 0; i < boxes.size(); ++i)
            locations.push_back(geometry.location(boxes[i].x, boxes[i].y, boxes[i].width, weights[i]));
        locations.sort([](const auto& a, const auto& b) { return a.confidence > b.confidence; });
        return !locations.empty();
    }
    std::string processingId() const override { return "haar"; }

private:
    mutable std::mutex mutex_; // the cascade works in members
    mutable cv::CascadeClassifier cascade_;
};

class Hog : public FaceFinder::Body {
public:
    bool find(const FNImageReference& image, std::list<FaceFinder::Location>& locations, double minRelEyeDist,
              double maxRelEyeDist, const FNBox&) const override {
        constexpr BoxGeometry geometry{0.42f, 0.27f};
        constexpr double smallestBox = 80, lowestThreshold = -0.5;
        const double scale = smallestBox * geometry.eyeDistance / (minRelEyeDist * image.w());
        cv::Mat scaled;
        cv::resize(grayOf(image), scaled, {}, scale, scale, scale < 1 ? cv::INTER_AREA : cv::INTER_LINEAR);
        dlib::array2d<unsigned char> pixels(scaled.rows, scaled.cols);
        for (int y = 0; y < scaled.rows; ++y) std::copy_n(scaled.ptr(y), scaled.cols, &pixels[y][0]);
        std::vector<std::pair<double, dlib::rectangle>> found;
        dlib::frontal_face_detector detector = detector_; // it works in members
        detector(pixels, found, lowestThreshold);
        locations.clear();
        for (const auto& [confidence, box] : found) {
            const auto face = geometry.location(static_cast<double>(box.left()) / scale,
                                                static_cast<double>(box.top()) / scale,
                                                static_cast<double>(box.width()) / scale, confidence);
            if (face.width <= maxRelEyeDist * image.w() * 1.1) locations.push_back(face);
        }
        return !locations.empty();
    }
    std::string processingId() const override { return "dlib"; }

private:
    dlib::frontal_face_detector detector_ = dlib::get_frontal_face_detector();
};

} // namespace

std::vector<std::string> yardstickNames() {
    return {"haar", "dlib"};
}

std::optional<FaceFinder> makeYardstick(const std::string& name) {
    if (name == "haar") return FaceFinder(FNCountedPtr<FaceFinder::Body>(new Haar));
    if (name == "dlib") return FaceFinder(FNCountedPtr<FaceFinder::Body>(new Hog));
    return {};
}

} // namespace Eval

#endif

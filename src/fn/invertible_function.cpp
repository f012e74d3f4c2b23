#include "fn/invertible_function.h"

#include "fn/serialize.h"

#include <cmath>
#include <limits>

namespace Fn {

namespace {

constexpr const char* wrongFormat = "InvertibleFunction: Wrong data format!";
constexpr const char* notEnough = "InvertibleFunction: Not enough values!";

} // namespace

using Function = InvertibleFunction<float, float>;

Function::InvertibleFunction(const FNVector<float>& values, float xMin, float xMax)
    : values_(values), xMin_(xMin), xMax_(xMax) {
    init();
}

Function::InvertibleFunction(const Package& package) {
    PackageReader reader(package);
    const auto form = reader.next<std::string>();
    if (form != "INVFUNC40" && form != "INVFUNC30" && form != "INVFUNC20") FN_THROW(FNEIOError, wrongFormat);
    values_ = reader.next<FNVector<float>>();
    if (form == "INVFUNC40") {
        xMin_ = reader.next<float>();
        xMax_ = reader.next<float>();
    } else {
        if (form == "INVFUNC20") {
            reader.next<Package>();
            reader.next<Package>();
        }
        readOlderPlaces(reader.next<FNVector<float>>());
    }
    init();
}

Function::operator Package() const {
    return Package(std::list<Package>{serialize<std::string>("INVFUNC40"), serialize(values_),
                                      serialize(xMin_), serialize(xMax_)});
}

void Function::readOlderPlaces(const FNVector<float>& places) {
    if (places.empty()) FN_THROW(FNEBadArg, notEnough);
    xMin_ = places.get()[0];
    xMax_ = places.get()[places.size() - 1];
    if (!(xMax_ > xMin_)) std::swap(xMin_, xMax_);
}

void Function::init() {
    if (values_.size() < 2) FN_THROW(FNEBadArg, notEnough);
    const bool finite = std::isfinite(xMin_) && std::isfinite(xMax_) && std::isfinite(xMax_ - xMin_) &&
                        std::ranges::all_of(values_.span(), [](float v) { return std::isfinite(v); });
    if (!finite || values_.size() > std::numeric_limits<int>::max()) FN_THROW(FNEIOError, wrongFormat);
    lastIndex_ = static_cast<int>(values_.size() - 1);
    scale_ = static_cast<float>(lastIndex_) / (xMax_ - xMin_);
    increasing_ = values_.get()[lastIndex_] > values_.get()[0];
}

float Function::operator()(float x) const {
    const float* const values = values_.get();
    if (!(x > xMin_)) return values[0];
    if (!(x < xMax_)) return values[lastIndex_];
    const float t = (x - xMin_) * scale_;
    if (!(t < static_cast<float>(lastIndex_))) return values[lastIndex_]; // rounded up to the end
    const int i = static_cast<int>(t);
    const float whole = static_cast<float>(i);
    if (whole == t) return values[i];
    return values[i] + (values[i + 1] - values[i]) * (t - whole);
}

float Function::applyInverse(const float& y) const {
    const float* const values = values_.get();
    const auto before = [&](int i) { return increasing_ ? values[i] < y : values[i] > y; };
    const auto behind = [&](int i) { return increasing_ ? values[i] > y : values[i] < y; };
    if (!before(0)) return xMin_;
    if (!behind(lastIndex_)) return xMax_;
    // values[low] lies before y and values[high] does not, also in a table that is not monotonic.
    int low = 0, high = lastIndex_;
    while (high - low > 1) {
        const int middle = low + (high - low) / 2;
        (before(middle) ? low : high) = middle;
    }
    if (values[high] == y) return place(high);
    return place(low) + (place(high) - place(low)) * (y - values[low]) / (values[high] - values[low]);
}

} // namespace Fn

#pragma once

#include "orbek/full_frontal_test.h"

#include <optional>
#include <string>
#include <vector>

#include <nlohmann/json_fwd.hpp>

/// The tests of a full frontal portrait in a form that can be shown: each with the numbers that it looks at.

namespace Orbek::Tool {

/// A number and what is allowed for it.
struct CheckedValue {
    std::string name;  ///< as Portrait::Characteristics calls it, or what is computed of it
    std::string label; ///< for people; empty for the only number of a test
    double value;
    std::optional<double> least, greatest; ///< allowed
    bool strict;                           ///< whether the limits themselves are not allowed
    double from, to;                       ///< what a scale for it shows
    int decimals;

    /// The value, and what is allowed: "0.3 to 0.5", "at least 128".
    std::string valueText() const { return numberText(value); }
    std::string limitsText() const;

private:
    std::string numberText(double number) const;
};

struct PortraitCheck {
    std::string name;           ///< as ISO_19794_5::FullFrontal::Compliance calls it
    std::string title;          ///< for people
    std::string group;          ///< those of one follow one another
    bool required;              ///< for compliance
    bool recommended;           ///< for best practice
    std::optional<bool> passed; ///< none for a test that a gray picture cannot be put to
    std::vector<CheckedValue> values;
};

/// All tests of a portrait, with all measures taken.
std::vector<PortraitCheck> portraitChecks(const Portrait::Characteristics& portrait,
                                          const ISO_19794_5::FullFrontal::Compliance& compliance,
                                          const ISO_19794_5::FullFrontal::Boundaries& limits);

/// An object for each check, with its values by their names.
nlohmann::ordered_json checksJson(const std::vector<PortraitCheck>& checks);
/// A line for each check, each with a line end before it.
std::string checksText(const std::vector<PortraitCheck>& checks);

} // namespace Orbek::Tool

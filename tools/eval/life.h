#pragma once

#include "cmp/life_checker.h"
#include "eval/landmarks.h"
#include "kx/eye_finder.h"

#include <ostream>
#include <string>
#include <vector>

/// How often the life check passes living people, and how often photos of them, over takes of a camera: rows
/// of labels with the columns `sequence`, `frame`, `person` and `live` (1, or 0 for a photo before the
/// camera).

namespace Eval {

struct LifeTake {
    std::string sequence, person;
    bool live = false;
    std::size_t frames = 0, withEyes = 0;
    /// The greatest threshold at which the check finds the take alive: its first frame with eyes against each
    /// later one. 0 if there is none.
    int reach = 0;
};

struct LifeReport {
    std::vector<LifeTake> takes;
    std::vector<std::string> failures; ///< pictures that could not be read, and why
};

/// @param settings but for their threshold
LifeReport measureLife(const std::string& etc, const Labelled::Selection& selection,
                       const EyeDistances& eyeDistances, const Cmp::LifeChecker::Settings& settings);

/// A row for each of these thresholds.
void printLife(const LifeReport& report, const std::vector<int>& thresholds, std::ostream& stream);
std::string lifeJson(const LifeReport& report);

} // namespace Eval

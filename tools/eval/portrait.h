#pragma once

#include "labelled/pictures.h"

#include <map>
#include <ostream>
#include <string>
#include <vector>

/// How often the portrait analyser is right, attribute by attribute, on the eyes that our finders find (those
/// of the label where they do not find the face).

namespace Eval {

/// A yes or no question about a portrait.
struct Question {
    /// A score, and the answer of the label.
    struct Answer {
        float score;
        bool truth;
    };
    std::string name;
    float threshold; ///< scores above it mean yes
    std::vector<Answer> answers = {};

    std::size_t count(bool truth) const;
    /// Share of these that are told right at the threshold.
    double right(bool truth) const;
    /// Mean of both shares, at the threshold and at the best one.
    double balanced() const;
    double bestBalanced() const;
};

/// A measured quantity.
struct Quantity {
    std::string name;
    std::vector<float> errors = {}; ///< measured less labelled

    double meanError() const; ///< of magnitudes
    double bias() const;      ///< with their signs
};

struct PortraitReport {
    std::vector<Question> questions;
    std::vector<Quantity> quantities;
};

struct PortraitReports {
    std::size_t portraits = 0, found = 0; ///< `found` by our finders
    PortraitReport all;
    std::map<std::string, PortraitReport> groups; ///< by value of the selection's column
    std::vector<std::string> failures;            ///< pictures that could not be read, and why
};

/// @param etc folder with the trained content of finders and analyser
PortraitReports measurePortraits(const std::string& etc, const Labelled::Selection& selection);

void printPortraits(const PortraitReports& reports, std::ostream& stream);
std::string portraitsJson(const PortraitReports& reports);

} // namespace Eval
